// LogGenerator: the abstract decoder with its bounded snapshot history and the choice of decoder by technology.
#pragma once

#include "PropertyList/Value.h"

#include <memory>
#include <string>

namespace vantorel {

class Dictionary;

class LogGenerator {
public:
    // `init`: logs "Creating Log object: %p" at warning priority.
    LogGenerator();
    virtual ~LogGenerator();
    LogGenerator(const LogGenerator&) = delete;
    LogGenerator& operator=(const LogGenerator&) = delete;

    // The four abstract operations. The base versions end in a programming error
    // (unrecognised operation), so a subclass that misses one fails loudly on first use.
    virtual void updateState(Dictionary& state, ByteView withData);
    // The display dictionary, or null (DictionaryRef()).
    virtual DictionaryRef generateLogUsingState(Dictionary& state);
    virtual DictionaryRef getStartCommand();
    // What the save screen writes (history entries and, for the Morvek decoders, a DLF).
    virtual Value getSaveContentsFromState(Dictionary& state);

    // Drops the display this or any earlier decoder kept in the state ("Display",
    // "Template", "ExtraInfo", "Lookup"), called when the model chooses a new decoder. A display
    // dictionary is bound to the sections of the decoder that built it: left in place,
    // the new decoder's sections would never be bound to it and the display would
    // freeze. "History" and the rest of the state stay.
    static void forgetDisplay(Dictionary& state);

    // Appends a snapshot entry to the state's "History", keeping at most 5.
    static void updateHistoryInState(Dictionary& state);
    // The decoder for a technology identifier (first match wins), or
    // null for an identifier with no decoder.
    static std::unique_ptr<LogGenerator> generatorFromTechnology(const std::string& technology);

    // False for a decoder that could not be set up (no display template resource);
    // the model treats such a decoder as unusable.
    virtual bool isUsable() const { return true; }
};

}  // namespace vantorel
