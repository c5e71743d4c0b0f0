// Fuzz target: property-list bytes (XML or binary) through PropertyListSerialization's readers, and what they read written back.
#include "FuzzSupport.h"
#include "PropertyList/PropertyListSerialization.h"

using namespace vantorel;
using Serialization = PropertyListSerialization;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const ByteView input(data, size);
    const PropertyListResult any = Serialization::read(input);
    const PropertyListResult dictionary = Serialization::readDictionary(input);
    FUZZ_CHECK(bool(any) != !any.error.empty());
    FUZZ_CHECK(bool(dictionary) == (any && any.value->isDictionary()));
    if (!any) return 0;
    // Whatever was read can be written in both formats, and read back.
    for (auto format : {Serialization::Format::Binary, Serialization::Format::XML}) {
        const std::optional<Bytes> written = Serialization::write(*any.value, format);
        FUZZ_CHECK(written && Serialization::read(*written));
    }
    return 0;
}
