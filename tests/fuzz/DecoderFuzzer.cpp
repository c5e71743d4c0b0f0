// Fuzz target: records through a decoder as the model drives it, then its display as the panes' text; built once per technology (VANTOREL_FUZZ_TECHNOLOGY).
#include "FuzzSupport.h"
#include "LogGenerator/LogGenerator.h"
#include "Monitor/TreeFormatter.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Dictionary.h"

#include <algorithm>

using namespace vantorel;

// The input is a run of records (messages of id 0, whole and unchanged), separated by these bytes.
static constexpr uint8_t kSeparator[] = {0xFE, 0xED, 0xFA, 0xCE};

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    std::unique_ptr<LogGenerator> decoder = LogGenerator::generatorFromTechnology(VANTOREL_FUZZ_TECHNOLOGY);
    FUZZ_CHECK(decoder);
    Dictionary state;
    for (const uint8_t *begin = data, *end = data + size;; begin += sizeof kSeparator) {
        const uint8_t* next = std::search(begin, end, std::begin(kSeparator), std::end(kSeparator));
        decoder->updateState(state, ByteView(begin, next));
        if ((begin = next) == end) break;
    }
    DictionaryRef display = decoder->generateLogUsingState(state);
    if (!display) display = decoder->generateLogUsingState(state);  // the call that builds it returns null
    (void)TreeFormatter::format(TreeFormatter::Format::Tree, display ? Value(display) : Value());
    return 0;
}
