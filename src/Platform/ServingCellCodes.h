// ServingCellCodes: the serving-cell log codes that say which radio technology a modem is on, shared by the live DIAG modem and recorded streams.
#pragma once

#include <cstdint>
#include <set>
#include <string>

namespace vantorel {

// A modem logs its serving cell only on the radio it is camped on: LTE's master
// information block and serving-cell info (0xB0C1, 0xB0C2), the UMTS cell identity and the
// GSM serving cell (0x4127, 0x5134), the CDMA 1x and EV-DO status (0x119C, 0x1183), the
// UTRAN serving cell (0xD0E2). The mobility records 0x7130-0x7150 belong to several
// technologies and decide nothing.
class ServingCellCodes {
public:
    // The technology identifier of a serving-cell record's code; empty for any other code.
    static std::string technologyOf(uint16_t code);
    static const std::set<uint16_t>& codes();
};

}  // namespace vantorel
