// C2KTexts: the CDMA band-class texts (3GPP2 C.S0057 band classes 0 to 12).
#include "LogGenerator/C2K/C2KTexts.h"

#include "Platform/StringFormat.h"

#include <iterator>

namespace vantorel {

namespace {

// "900 MHzband" lacks its blank in the modem tools' wording; engineers' filters expect it so.
const char* const kBandClass[] = {
    "800 MHz cellular band [0]",       "1.8 to 2.0GHz PCS band [1]",      "872 to 960MHz TACS band [2]",
    "832 to 925MHz JTACS band [3]",    "1.75 to 1.87GHz Korean PCS band [4]", "450MHz band [5]",
    "2GHz band [6]",                   "700MHz band [7]",                 "1800 MHz band [8]",
    "900 MHzband [9]",                 "Secondary 800 MHz band [10]",     "400 MHz European PAMR band [11]",
    "800 MHz European PAMR band [12]",
};

}  // namespace

std::string C2KTexts::bandClass(unsigned value) {
    if (value < std::size(kBandClass)) return kBandClass[value];
    return StringFormat::format("[Bad Value %d]", static_cast<int>(value));
}

}  // namespace vantorel
