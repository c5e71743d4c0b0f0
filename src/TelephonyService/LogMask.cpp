// LogMask: classification of channel messages by type and log code, and the start command's log mask.
#include "TelephonyService/LogMask.h"

#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"
#include "PropertyList/Array.h"

namespace vantorel {

namespace {

const char* const kOrdinaryKey = "SetMorvekLogCodes";
const char* const kExtraKey = "SetTsExtraCodes";

// Adds every number of the list under key to codes; returns the entries skipped.
size_t addCodes(const Dictionary& command, const char* key, std::set<uint16_t>& codes) {
    const Value* list = command.find(key);
    if (!list) return 0;
    ArrayRef array = list->asArray();
    if (!array) return 1;
    size_t skipped = 0;
    for (const Value& entry : *array) {
        const std::optional<int64_t> code = entry.asInteger();
        if (!code || *code < 0 || *code > 0xFFFF) {
            ++skipped;
            continue;
        }
        codes.insert(static_cast<uint16_t>(*code));
    }
    return skipped;
}

}  // namespace

std::optional<LogMask::Classification> LogMask::classify(ByteView message) {
    const ByteReader whole(message);
    // The prefix is two bytes: 0x81 and one byte that nobody reads.
    const bool prefixed = whole.has(0, 1) && whole.u8(0).value_or(0) == kPrefixByte;
    const ByteReader r(prefixed ? whole.from(kPrefixLength) : message);
    if (!r.has(0, 5)) return std::nullopt;  // type at 0, code at 3..4
    const uint8_t type = r.u8(0).value_or(0);
    if (type != LogCode::kOrdinaryType && type != LogCode::kExtraType) return std::nullopt;
    return Classification{type, r.u16(3).value_or(0)};
}

LogMask LogMask::all() {
    LogMask mask;
    mask.all_ = true;
    return mask;
}

LogMask LogMask::fromStartCommand(const Dictionary& command, std::string* problem) {
    if (problem) problem->clear();
    if (!command.contains(kOrdinaryKey) && !command.contains(kExtraKey)) return all();
    LogMask mask;
    const size_t skippedOrdinary = addCodes(command, kOrdinaryKey, mask.ordinary_);
    const size_t skippedExtra = addCodes(command, kExtraKey, mask.extra_);
    if (problem) {
        if (skippedOrdinary + skippedExtra > 0)
            *problem = StringFormat::format("skipped %zu entries of %s and %zu of %s that are not codes 0..65535",
                                            skippedOrdinary, kOrdinaryKey, skippedExtra, kExtraKey);
    }
    return mask;
}

bool LogMask::forwards(ByteView message) const {
    if (all_) return true;
    const std::optional<Classification> c = classify(message);
    if (!c) return true;  // junk goes through, as from a real modem
    const std::set<uint16_t>& codes = c->isOrdinary() ? ordinary_ : extra_;
    return codes.count(c->code) != 0;
}

std::string LogMask::description() const {
    if (all_) return "all codes";
    return StringFormat::format("%zu log codes, %zu extra codes", ordinary_.size(), extra_.size());
}

}  // namespace vantorel
