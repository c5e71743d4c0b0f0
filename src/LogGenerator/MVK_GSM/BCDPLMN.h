// BCDPLMN: the MCC and MNC digits of a 3-byte PLMN identity in binary-coded decimal, as the network codes it.
#pragma once

#include <cstdint>
#include <string>

namespace vantorel {

// The PLMN identity of 3GPP TS 24.008 (high | low nibble of each byte):
//   byte 0: MCC digit 2 | MCC digit 1
//   byte 1: MNC digit 3 | MCC digit 3   (MNC digit 3 is the filler 0xF for a two-digit MNC)
//   byte 2: MNC digit 2 | MNC digit 1
// A nibble above 9 has no digit and shows as a blank. The digits are kept as text, so
// leading zeros ("001", "05") stay.
struct BCDPLMN {
    enum class Filler {
        Blank,  // a two-digit MNC keeps a third character, the blank of its filler: "10 "
        Drop,   // a two-digit MNC shows its two digits: "10"
    };

    std::string mcc;
    std::string mnc;

    static BCDPLMN read(uint8_t byte0, uint8_t byte1, uint8_t byte2, Filler filler);
};

}  // namespace vantorel
