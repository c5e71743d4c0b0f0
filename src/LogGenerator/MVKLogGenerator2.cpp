// MVKLogGenerator2: the template-driven generator: record framing, routing to sections, display binding, start command.
#include "LogGenerator/MVKLogGenerator2.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/ResourceBundle.h"
#include "Platform/RecordVersions.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {
constexpr size_t kHeaderLength = 13;
constexpr uint8_t kPrefixByte = 0x81;
}  // namespace

MVKLogGenerator2::MVKLogGenerator2() = default;

MVKLogGenerator2::MVKLogGenerator2(std::string pListName_, std::unique_ptr<ClassIndex> cIndexObj) {
    SystemLog::log(SystemLog::kError, "Creating MVKLogGenerator2 object with %p",
                   static_cast<void*>(cIndexObj.get()));
    pListName = std::move(pListName_);
    cIndex = std::move(cIndexObj);
    SystemLog::log(SystemLog::kError, "Class Index: %ld", static_cast<long>(cIndex.use_count()));
}

MVKLogGenerator2::~MVKLogGenerator2() {
    // The one class name for every subclass, on purpose: log filters written for this
    // line match every decoder.
    SystemLog::log(SystemLog::kWarning, "MVK_GSMLogGenerator is destructed %p", static_cast<void*>(this));
}

void MVKLogGenerator2::updateState(Dictionary& state, ByteView withData) {
    getDisplayFromState(state);
    updateWithData(withData);
    // Kept also when the record was dropped: the DLF holds what arrived.
    _binData.insert(_binData.end(), withData.begin(), withData.end());
}

void MVKLogGenerator2::updateWithData(ByteView data) {
    // Record header, after the optional 2-byte prefix (present when byte 0 is 0x81):
    //   0 type (1 ordinary, 255 extra) | 1..2 not read | 3..4 code, LE | 5..12 not read | 13.. payload
    if (data.size() < kHeaderLength) return;  // measured before the prefix is removed
    ByteReader buffer(data);
    ByteView record = buffer.u8(0) == kPrefixByte ? buffer.from(2) : data;
    ByteReader reader(record);
    const uint8_t type = reader.u8(0).value_or(0);
    if (type != LogCode::kOrdinaryType && type != LogCode::kExtraType) {
        SystemLog::log(SystemLog::kError, "Invalid log type: %x. Dropping.", type);
        return;
    }
    // An 11-byte record (13 bytes with the prefix) still has its code at 3..4.
    int32_t code = reader.u16(3).value_or(0);
    if (type == LogCode::kExtraType) code |= LogCode::kExtraBase;

    const SectionList* subscribers = cIndex ? cIndex->getSubscribers(code) : nullptr;
    if (!subscribers) return;
    // A record of a layout version newer than any the sections know is skipped whole.
    if (!RecordVersions::readable(record, code)) return;
    for (Base* section : *subscribers) {
        // A section's raised error ends that section's handling of this record only;
        // the others still get it, and the stream goes on.
        try {
            section->updateWithData(record, code);
        } catch (const SectionError& e) {
            SystemLog::log(SystemLog::kError, " ***** Section \"%s\" dropped record 0x%X: %s",
                           section->getSectionName().c_str(), static_cast<unsigned>(code), e.what());
        }
    }
}

DictionaryRef MVKLogGenerator2::getDisplayFromState(Dictionary& state) {
    if (DictionaryRef display = state.get("Display").asDictionary()) return display;

    Value templateObject = state.get("Template");
    if (!templateObject.asDictionary()) {
        std::optional<Value> loaded = ResourceBundle::loadPropertyList(pListName, "plist");
        if (pListName.empty() || !loaded || !loaded->asDictionary()) {
            SystemLog::log(SystemLog::kError, "Cannot load template for display");
            return nullptr;
        }
        templateObject = *loaded;
        state.set("Template", templateObject);
    }

    SystemLog::log(SystemLog::kWarning, "Initialized class index: %p, Self: %p", static_cast<void*>(cIndex.get()),
                   static_cast<void*>(this));
    if (cIndex) cIndex->status();

    Value display = processTemplate(templateObject);
    printDict(display);
    state.set("Display", display);
    state.set("ExtraInfo", Value(Dictionary::create()));
    // The call that builds the display returns null; only later calls return it.
    return nullptr;
}

Value MVKLogGenerator2::processTemplate(const Value& templateObject) {
    if (const std::string* s = templateObject.asString()) return Value(*s);
    if (DictionaryRef dict = templateObject.asDictionary()) {
        auto copy = Dictionary::create();
        for (const auto& [key, item] : *dict) {
            Value value = processTemplate(item);
            // A value of another type yields null, which no container can hold: it is
            // left out (logged above) instead of failing the whole display.
            if (value.isNull()) continue;
            if (Base* section = cIndex ? cIndex->getClass(key) : nullptr) section->updateSectionRef(value);
            copy->set(key, value);
        }
        return Value(copy);
    }
    if (ArrayRef array = templateObject.asArray()) {
        auto copy = Array::create();
        for (const Value& item : *array) {
            Value value = processTemplate(item);
            if (!value.isNull()) copy->append(value);
        }
        return Value(copy);
    }
    SystemLog::log(SystemLog::kError, "Received an object of unknown type");
    SystemLog::log(SystemLog::kWarning, "Processing the template");
    return Value();
}

void MVKLogGenerator2::printDict(const Value& object) const {
    if (object.isString()) return;
    if (DictionaryRef dict = object.asDictionary()) {
        for (const auto& entry : *dict) printDict(entry.second);
        return;
    }
    if (ArrayRef array = object.asArray()) {
        for (const Value& item : *array) printDict(item);
        return;
    }
    SystemLog::log(SystemLog::kError, "Received an object of unknown type");
}

DictionaryRef MVKLogGenerator2::generateLogUsingState(Dictionary& state) {
    DictionaryRef display = getDisplayFromState(state);
    state.set("DisplayState", Value::data(std::move(_binData)));
    _binData = Bytes();
    updateHistoryInState(state);
    return display;
}

DictionaryRef MVKLogGenerator2::getStartCommand() {
    auto ordinary = Array::create();
    auto extra = Array::create();
    if (cIndex) {
        for (const std::string& code : cIndex->getAllLogCodes()) {
            const long long value = std::stoll(code);  // keys are decimal strings we wrote
            if (value >= LogCode::kExtraBase)
                extra->append(Value::integer(value - LogCode::kExtraBase));
            else
                ordinary->append(Value::integer(value));
        }
    }
    auto command = Dictionary::create();
    command->set("SetState", "Streaming");
    command->set("SetMorvekLogCodes", Value(ordinary));
    command->set("SetTsExtraCodes", Value(extra));
    return command;
}

}  // namespace vantorel
