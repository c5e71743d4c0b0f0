// LogCodes: the diagnostic log codes the decoders subscribe to and the emulator sends, each defined once.
#pragma once

#include <cstdint>

namespace vantorel::LogCode {

// A record's type byte: 1 for an ordinary modem record, 255 for an extra record that the
// telephony service adds to the stream (SIM files, cell monitor, PDP contexts). An extra
// record's effective code is kExtraBase | its 16-bit code.
inline constexpr uint8_t kOrdinaryType = 1;
inline constexpr uint8_t kExtraType = 255;
inline constexpr int32_t kExtraBase = 0xFF0000;

// Extra records (effective codes).
inline constexpr int32_t kSimFiles = 0xFF0000;     // extra 0: SIM elementary files
inline constexpr int32_t kCellMonitor = 0xFF0001;  // extra 1: cell-monitor array of dictionaries
inline constexpr int32_t kPDPContexts = 0xFF0002;  // extra 2: packet-data contexts

// GSM/UMTS non-access stratum.
inline constexpr int32_t kGMMState = 0x7130;             // GMM state, sub-state, update status
inline constexpr int32_t kMMState = 0x7131;              // MM state, sub-state, update status
inline constexpr int32_t kRegistrationState = 0x7132;    // MM service state, PLMN selection mode
inline constexpr int32_t kServingPLMNAndArea = 0x7135;   // BCD PLMN, LAC, RAC, service type
inline constexpr int32_t kEquivalentPLMNs = 0x7150;      // equivalent PLMN list

// UTRAN (TD-SCDMA).
inline constexpr int32_t kUTRANNeighbourList = 0xD00A;      // neighbour cells per UARFCN
inline constexpr int32_t kUTRANBLERAndSIR = 0xD00C;         // transport-channel BLER and CCTrCH SIR
inline constexpr int32_t kUTRANGSMNeighbourList = 0xD00E;   // GSM neighbours
inline constexpr int32_t kUTRANRRCState = 0xD0E0;           // RRC state
inline constexpr int32_t kUTRANServingCell = 0xD0E2;        // serving cell

// LTE.
inline constexpr int32_t kLTEMasterInfoBlock = 0xB0C1;             // RRC master information block: transmit antennas
inline constexpr int32_t kLTEServingCellInfo = 0xB0C2;             // RRC serving cell: PCI, E-ARFCNs, bandwidths, TAC, band
inline constexpr int32_t kLTEIntraFreqMeasurement = 0xB179;        // connected mode intra-frequency measurement results
inline constexpr int32_t kLTEServingCellMeasurement = 0xB17F;      // idle mode serving cell measurement and evaluation
inline constexpr int32_t kLTEIdleNeighbourMeasurements = 0xB180;  // idle-mode neighbour cell measurements
inline constexpr int32_t kLTEReselectionCandidates = 0xB186;      // cell reselection candidates

// The DLF file's own version-report record.
inline constexpr int32_t kDlfVersionReport = 0x1FFD;

}  // namespace vantorel::LogCode
