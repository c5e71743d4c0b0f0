// C2KLogGenerator: CDMA template binding, record framing and dispatch to the 1x and EV-DO routines.
#include "LogGenerator/C2K/C2KLogGenerator.h"

#include "LogGenerator/C2K/C2K1xDecoders.h"
#include "LogGenerator/C2K/C2KHDRDecoders.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/ResourceBundle.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

constexpr size_t kHeaderLength = 13;
constexpr uint8_t kPrefixByte = 0x81;
constexpr uint8_t kWideCodeType = 0xFF;

using Routine = void (*)(ByteView, Dictionary&, const DictionaryRef&);

// Code to routine, in the order the start command asks for the codes.
struct Route {
    int32_t code;
    Routine routine;
};
const Route kRoutes[] = {
    {LogCode::kC2KFingerCI, &C2KHDRDecoders::fingerCI},
    {LogCode::kC2KHDRStatus, &C2KHDRDecoders::hdrStatus},
    {LogCode::kC2KForwardDataRate, &C2KHDRDecoders::forwardDataRate},
    {LogCode::kC2KHDRActiveSet, &C2KHDRDecoders::hdrActiveSet},
    {LogCode::kC2K1xStatus, &C2K1xDecoders::oneXStatus},
    {LogCode::kC2KTrafficFER, &C2K1xDecoders::trafficFER},
    {LogCode::kC2KReverseDataRate, &C2KHDRDecoders::reverseDataRate},
    {LogCode::kC2KSystemIdentity, &C2K1xDecoders::systemIdentity},
};

}  // namespace

std::unique_ptr<LogGenerator> C2KLogGenerator::generator() {
    SystemLog::log(SystemLog::kError, "%s", "Creating C2KLogGenerator object");
    return std::unique_ptr<LogGenerator>(new C2KLogGenerator());
}

C2KLogGenerator::~C2KLogGenerator() {
    SystemLog::log(SystemLog::kWarning, "C2KLogGenerator is destructed %p", static_cast<const void*>(this));
}

void C2KLogGenerator::updateState(Dictionary& state, ByteView withData) {
    getDisplayFromState(state);
    updateFromLog(withData, state.get("Lookup").asDictionary(), state);
}

void C2KLogGenerator::updateFromLog(ByteView data, const DictionaryRef& lookup, Dictionary& state) {
    // Framing: 0 log type (1) | 1..2 not read | 3..4 code, LE | 5..12 time stamp | 13.. payload,
    // behind an optional two-byte prefix whose first byte is 0x81. The 13 bytes are measured
    // before the prefix is removed, so an 11-byte record still reaches its routine, which
    // then refuses it by its own length rule.
    if (data.size() < kHeaderLength) return;
    const ByteReader buffer(data);
    const ByteView record = buffer.u8(0) == kPrefixByte ? buffer.from(2) : data;
    const ByteReader reader(record);
    const uint8_t type = reader.u8(0).value_or(0);
    // The modem's own wording; the record is decoded all the same.
    if (type != LogCode::kOrdinaryType) SystemLog::log(SystemLog::kError, "Invalid log type: %x. Dropping.", type);
    int32_t code = reader.u16(3).value_or(0);
    if (type == kWideCodeType) code |= 0xFF0000;  // matches no routine: neither decoded nor kept

    for (const Route& route : kRoutes) {
        if (route.code != code) continue;
        route.routine(record, state, lookup);
        // Kept whether or not the routine accepted it: the DLF holds what arrived.
        _binData.insert(_binData.end(), record.begin(), record.end());
        return;
    }
}

DictionaryRef C2KLogGenerator::generateLogUsingState(Dictionary& state) {
    DictionaryRef display = getDisplayFromState(state);
    state.set("DisplayState", Value::data(std::move(_binData)));
    _binData = Bytes();
    updateHistoryInState(state);
    return display;
}

DictionaryRef C2KLogGenerator::getStartCommand() {
    auto codes = Array::create();
    for (const Route& route : kRoutes) codes->append(Value::integer(route.code));
    auto command = Dictionary::create();
    command->set("SetState", "Streaming");
    command->set("SetMorvekLogCodes", Value(codes));
    return command;
}

void C2KLogGenerator::processTemplate(const Dictionary& templateDict, const DictionaryRef& display, Dictionary& lookup) {
    for (const auto& [key, item] : templateDict) {
        if (DictionaryRef sub = item.asDictionary()) {
            auto nested = Dictionary::create();
            processTemplate(*sub, nested, lookup);
            display->set(key, Value(nested));
        } else if (const std::string* lookupKey = item.asString()) {
            if (*lookupKey == "_sorted") {
                display->set(key, item);
                continue;
            }
            display->set(key, Value(""));
            // The binding refers to the display dictionary that holds the key, so a routine
            // overwrites the leaf in place.
            auto binding = Dictionary::create();
            binding->set("key", Value(key));
            binding->set("dict", Value(display));
            ArrayRef places = lookup.get(*lookupKey).asArray();
            if (!places) {
                places = Array::create();
                lookup.set(*lookupKey, Value(places));
            }
            places->append(Value(binding));
        }
        // Numbers, data, dates, booleans and arrays leave no key.
    }
    SystemLog::log(SystemLog::kWarning, "%s", "Processing the template");
}

DictionaryRef C2KLogGenerator::getDisplayFromState(Dictionary& state) {
    if (DictionaryRef display = state.get("Display").asDictionary()) return display;
    DictionaryRef templateDict = state.get("Template").asDictionary();
    if (!templateDict) {
        const std::optional<Value> loaded = ResourceBundle::loadPropertyList("C2KTemplate", "plist");
        templateDict = loaded ? loaded->asDictionary() : nullptr;
        if (!templateDict) {
            SystemLog::log(SystemLog::kError, "%s", "Cannot load C2K template for display");
            return nullptr;
        }
        state.set("Template", Value(templateDict));
    }
    auto display = Dictionary::create();
    auto lookup = Dictionary::create();
    processTemplate(*templateDict, display, *lookup);
    state.set("Display", Value(display));
    state.set("Lookup", Value(lookup));
    state.set("ExtraInfo", Value(Dictionary::create()));
    return display;
}

}  // namespace vantorel
