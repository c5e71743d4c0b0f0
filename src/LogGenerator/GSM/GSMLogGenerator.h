// GSMLogGenerator: the GSM decoder for the IFX channel, whose messages are property lists already shaped as a display.
#pragma once

#include "LogGenerator/LogGenerator.h"

#include <memory>
#include <string>

namespace vantorel {

// Every IFX message is a serialised property list (XML or binary) that becomes the
// whole display once simplified; nothing accumulates between messages except the
// history. No template, class index or sections.
class GSMLogGenerator : public LogGenerator {
public:
    static std::unique_ptr<LogGenerator> generator();
    ~GSMLogGenerator() override;

    // Deserialises the message and stores "DisplayState" (the object as received),
    // "Display" (processObject of it) and a fresh "ExtraInfo". A message that is not a
    // property list, or holds a number, date, data or boolean, is logged at error
    // priority with its size and dropped: the last good display stays.
    void updateState(Dictionary& state, ByteView withData) override;
    // Records a history entry and returns the state's "Display" (null before the first
    // message, or when the message's top level is not a dictionary).
    DictionaryRef generateLogUsingState(Dictionary& state) override;
    // {"SetState": "Streaming"}: the IFX channel has no log codes to select.
    DictionaryRef getStartCommand() override;
    // The history entries; this channel has no raw records, so no DLF entry.
    Value getSaveContentsFromState(Dictionary& state) override;

    // The display form of a message object: strings as they are; dictionaries and
    // arrays copied with every value processed and then collapsed (canCollapse), and
    // every array without its first element (the modem's arrays lead with an element
    // that is not shown). Any other value refuses the whole object: the result is null
    // and `error` says "Unknown object of type <type> encountered".
    static Value processObject(const Value& object, std::string* error = nullptr);
    // The one value of a one-entry dictionary; null for anything else.
    static Value canCollapse(const Value& object);

private:
    GSMLogGenerator() = default;
};

}  // namespace vantorel
