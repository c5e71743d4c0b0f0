// GSMLogGenerator: decodes IFX messages (property lists) into the display, refusing what it cannot show.
#include "LogGenerator/GSM/GSMLogGenerator.h"

#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

namespace vantorel {

std::unique_ptr<LogGenerator> GSMLogGenerator::generator() {
    SystemLog::log(SystemLog::kError, "%s", "Creating GSMLogGenerator object");
    return std::unique_ptr<LogGenerator>(new GSMLogGenerator());
}

GSMLogGenerator::~GSMLogGenerator() {
    SystemLog::log(SystemLog::kWarning, "GSMLogGenerator is destructed %p", static_cast<const void*>(this));
}

void GSMLogGenerator::updateState(Dictionary& state, ByteView withData) {
    // A modem must not be able to end the program: a refused message is logged with
    // its size and dropped, and the state keeps the last good display whole.
    const auto refuse = [&](const std::string& why) {
        SystemLog::log(SystemLog::kError, "%s (%zu bytes)", why.c_str(), withData.size());
    };
    // PropertyListSerialization checks the bytes (PropertyListGuard) before libplist
    // parses them, so the object is at most PropertyListGuard::kMaxDepth deep.
    PropertyListResult object = PropertyListSerialization::read(withData);
    if (!object) return refuse("Could not deserialize the object");
    std::string error;
    Value display = processObject(*object.value, &error);
    if (display.isNull()) return refuse(error);
    state.set("DisplayState", *object.value);
    state.set("Display", display);
    state.set("ExtraInfo", Value(Dictionary::create()));
}

DictionaryRef GSMLogGenerator::generateLogUsingState(Dictionary& state) {
    updateHistoryInState(state);
    return state.get("Display").asDictionary();
}

DictionaryRef GSMLogGenerator::getStartCommand() {
    auto command = Dictionary::create();
    command->set("SetState", "Streaming");
    return command;
}

Value GSMLogGenerator::getSaveContentsFromState(Dictionary& state) {
    auto contents = Array::create();
    if (ArrayRef history = state.get("History").asArray())
        for (const Value& entry : *history) contents->append(entry);
    return Value(contents);
}

// Recursive: bounded because every object reaching it from a message has passed
// PropertyListGuard, which refuses nesting deeper than PropertyListGuard::kMaxDepth.
Value GSMLogGenerator::processObject(const Value& object, std::string* error) {
    // A processed child, then collapsed one level; null when the child was refused.
    const auto simplified = [error](const Value& child) {
        Value processed = processObject(child, error);
        Value collapsed = canCollapse(processed);
        return collapsed.isNull() ? processed : collapsed;
    };
    if (object.isString()) return object;
    if (DictionaryRef source = object.asDictionary()) {
        auto out = Dictionary::create();
        for (const auto& [key, value] : *source) {
            Value item = simplified(value);
            if (item.isNull()) return Value();
            out->set(key, std::move(item));
        }
        return Value(out);
    }
    if (ArrayRef source = object.asArray()) {
        auto out = Array::create();
        for (size_t i = 1; i < source->size(); ++i) {
            Value item = simplified(source->at(i));
            if (item.isNull()) return Value();
            out->append(std::move(item));
        }
        return Value(out);
    }
    if (error) *error = std::string("Unknown object of type ") + object.typeName() + " encountered";
    return Value();
}

Value GSMLogGenerator::canCollapse(const Value& object) {
    DictionaryRef d = object.asDictionary();
    if (!d || d->size() != 1) return Value();
    return d->begin()->second;
}

}  // namespace vantorel
