// BCDPLMN: reads the MCC and MNC digit characters out of the three BCD bytes.
#include "LogGenerator/MVK_GSM/BCDPLMN.h"

namespace vantorel {

namespace {

constexpr uint8_t kFiller = 0x0F;

char digit(uint8_t nibble) { return nibble < 10 ? static_cast<char>('0' + nibble) : ' '; }
char low(uint8_t byte) { return digit(byte & 0x0F); }
char high(uint8_t byte) { return digit(byte >> 4); }

}  // namespace

BCDPLMN BCDPLMN::read(uint8_t byte0, uint8_t byte1, uint8_t byte2, Filler filler) {
    BCDPLMN plmn;
    plmn.mcc = {low(byte0), high(byte0), low(byte1)};
    plmn.mnc = {low(byte2), high(byte2)};
    if (filler == Filler::Blank || (byte1 >> 4) != kFiller) plmn.mnc += high(byte1);
    return plmn;
}

}  // namespace vantorel
