// C2K1xDecoders: the CDMA2000 1x log-code routines of the CDMA decoder: status subpackets, traffic frame error rate, system identity.
#pragma once

#include "PropertyList/Value.h"

#include <cstdint>
#include <optional>

namespace vantorel {

class Dictionary;

// Same calling convention as C2KHDRDecoders: record after any 0x81 prefix, the decoder's
// state (the running "TrafficFER"), and the lookup (may be null).
class C2K1xDecoders {
public:
    static void oneXStatus(ByteView record, Dictionary& state, const DictionaryRef& lookup);      // 0x119C
    static void trafficFER(ByteView record, Dictionary& state, const DictionaryRef& lookup);      // 0x119D
    static void systemIdentity(ByteView record, Dictionary& state, const DictionaryRef& lookup);  // 0x134F

private:
    // Offset of the first subpacket with that identifier in the record's list, or none
    // (a size that runs past the list's bound is logged).
    static std::optional<size_t> findSubpacket(ByteView record, uint8_t identifier);
};

}  // namespace vantorel
