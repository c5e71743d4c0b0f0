// C2KHDRDecoders: the EV-DO (HDR) log-code routines of the CDMA decoder: status, active set, finger C/I, forward and reverse data rates.
#pragma once

#include "PropertyList/Value.h"

namespace vantorel {

class Dictionary;

// Each routine gets the record after any 0x81 prefix (payload from offset 13), the
// decoder's state dictionary (counters kept between records, "ExtraInfo") and the lookup
// (null when the display template is missing: values then land nowhere). A record that
// fails its length rule is logged and leaves the display as it was.
class C2KHDRDecoders {
public:
    static void hdrStatus(ByteView record, Dictionary& state, const DictionaryRef& lookup);        // 0x1183
    static void hdrActiveSet(ByteView record, Dictionary& state, const DictionaryRef& lookup);     // 0x12B6
    static void fingerCI(ByteView record, Dictionary& state, const DictionaryRef& lookup);         // 0x108A
    static void forwardDataRate(ByteView record, Dictionary& state, const DictionaryRef& lookup);  // 0x1192
    static void reverseDataRate(ByteView record, Dictionary& state, const DictionaryRef& lookup);  // 0x127E
};

}  // namespace vantorel
