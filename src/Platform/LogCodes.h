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

// CDMA2000 1x and EV-DO (HDR).
inline constexpr int32_t kC2KFingerCI = 0x108A;          // searcher fingers: PN offset and C/I
inline constexpr int32_t kC2KHDRStatus = 0x1183;         // EV-DO channel, AGC, pilot, device and session state, UATI
inline constexpr int32_t kC2KForwardDataRate = 0x1192;   // EV-DO forward-link packet counters
inline constexpr int32_t kC2K1xStatus = 0x119C;          // 1x status subpackets: state, RF, active set, fingers
inline constexpr int32_t kC2KTrafficFER = 0x119D;        // 1x traffic demodulation: frame in error
inline constexpr int32_t kC2KReverseDataRate = 0x127E;   // EV-DO reverse-link packet counters
inline constexpr int32_t kC2KHDRActiveSet = 0x12B6;      // EV-DO active-set pilots and strengths
inline constexpr int32_t kC2KSystemIdentity = 0x134F;    // roaming indicator, SID, NID, packet zone, base ID

// UMTS (WCDMA) access stratum.
inline constexpr int32_t kUMTSReselectionRanking = 0x4005;  // ranked UMTS and GSM cells of cell reselection
inline constexpr int32_t kUMTSTransmitPower = 0x4031;       // uplink transmit power samples
inline constexpr int32_t kUMTSBLER = 0x4116;                // transport-channel block error counts
inline constexpr int32_t kUMTSRRCState = 0x4125;            // RRC state
inline constexpr int32_t kUMTSCellIdentity = 0x4127;        // uplink and downlink UARFCN, cell ID, URA ID
inline constexpr int32_t kUMTSCiphering = 0x4157;           // ciphering on or off
inline constexpr int32_t kUMTSSearcher = 0x417A;            // searcher cells: scrambling code, set, Ec/Io energies
inline constexpr int32_t kHSDPADecodeStatistics = 0x4221;   // HSDPA HARQ processes: bits, new transmissions, errors

// GSM access stratum.
inline constexpr int32_t kGSMChannelParameters = 0x5072;      // dedicated channel parameters: DTX
inline constexpr int32_t kGSMDedicatedAllocation = 0x5076;    // dedicated-mode mobile allocation ARFCN
inline constexpr int32_t kGSMRRState = 0x512C;                // RR state, sub-state, status, mode
inline constexpr int32_t kGSMServingCellIdentity = 0x5134;    // serving ARFCN, BSIC, cell ID
inline constexpr int32_t kGSMServingMeasurement = 0x5137;     // serving level, C1/C2, quality, neighbours
inline constexpr int32_t kGPRSSI13Position = 0x51F4;          // where SI13 is broadcast
inline constexpr int32_t kGPRSCellOptions = 0x51F5;           // PFC, priority access threshold, NC order
inline constexpr int32_t kGPRSGeneralParameters = 0x51F6;     // T3192, DRX timer max, access burst type
inline constexpr int32_t kGSMMobileAllocation = 0x51F8;       // hopping sequence number and ARFCN list
inline constexpr int32_t kGPRSPBCCHDescription = 0x51FB;      // PBCCH present
inline constexpr int32_t kGPRSPacketSystemInfo = 0x51FD;      // PSI/SI status, measurement order, counts
inline constexpr int32_t kGSMBSICReport = 0x51FF;             // ARFCN to BSIC of the neighbours

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
