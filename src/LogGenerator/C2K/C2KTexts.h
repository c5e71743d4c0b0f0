// C2KTexts: enumeration texts shared by the CDMA decoder's 1x and EV-DO routines.
#pragma once

#include <string>

namespace vantorel {

class C2KTexts {
public:
    // The CDMA band class, its number in brackets ("800 MHz cellular band [0]");
    // "[Bad Value %d]" outside the table.
    static std::string bandClass(unsigned value);
};

}  // namespace vantorel
