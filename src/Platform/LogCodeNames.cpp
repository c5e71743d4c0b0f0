// LogCodeNames: one line per known log code, so that `info` and the logs name what a record holds.
#include "Platform/LogCodeNames.h"

#include "Platform/LogCodes.h"

namespace vantorel {

namespace {

struct CodeName {
    int32_t code;
    const char* name;
};

const CodeName kNames[] = {
    {LogCode::kSimFiles, "SIM elementary files"},
    {LogCode::kCellMonitor, "Cell monitor"},
    {LogCode::kPDPContexts, "Packet-data contexts"},
    {LogCode::kC2KFingerCI, "CDMA searcher fingers"},
    {LogCode::kC2KHDRStatus, "EV-DO status"},
    {LogCode::kC2KForwardDataRate, "EV-DO forward-link packets"},
    {LogCode::kC2K1xStatus, "CDMA 1x status"},
    {LogCode::kC2KTrafficFER, "CDMA 1x traffic frame errors"},
    {LogCode::kC2KReverseDataRate, "EV-DO reverse-link packets"},
    {LogCode::kC2KHDRActiveSet, "EV-DO active set"},
    {LogCode::kC2KSystemIdentity, "CDMA system identity"},
    {LogCode::kUMTSReselectionRanking, "UMTS cell reselection ranking"},
    {LogCode::kUMTSTransmitPower, "UMTS uplink transmit power"},
    {LogCode::kUMTSBLER, "UMTS transport-channel BLER"},
    {LogCode::kUMTSRRCState, "UMTS RRC state"},
    {LogCode::kUMTSCellIdentity, "UMTS cell identity"},
    {LogCode::kUMTSCiphering, "UMTS ciphering"},
    {LogCode::kUMTSSearcher, "UMTS searcher cells"},
    {LogCode::kHSDPADecodeStatistics, "HSDPA decode statistics"},
    {LogCode::kGSMChannelParameters, "GSM channel parameters"},
    {LogCode::kGSMDedicatedAllocation, "GSM dedicated allocation"},
    {LogCode::kGSMRRState, "GSM RR state"},
    {LogCode::kGSMServingCellIdentity, "GSM serving cell identity"},
    {LogCode::kGSMServingMeasurement, "GSM serving cell measurement"},
    {LogCode::kGPRSSI13Position, "GPRS SI13 position"},
    {LogCode::kGPRSCellOptions, "GPRS cell options"},
    {LogCode::kGPRSGeneralParameters, "GPRS general parameters"},
    {LogCode::kGSMMobileAllocation, "GSM mobile allocation"},
    {LogCode::kGPRSPBCCHDescription, "GPRS PBCCH description"},
    {LogCode::kGPRSPacketSystemInfo, "GPRS packet system information"},
    {LogCode::kGSMBSICReport, "GSM neighbour BSICs"},
    {LogCode::kGMMState, "GMM state"},
    {LogCode::kMMState, "MM state"},
    {LogCode::kRegistrationState, "MM registration state"},
    {LogCode::kServingPLMNAndArea, "Serving PLMN and area"},
    {LogCode::kEquivalentPLMNs, "Equivalent PLMNs"},
    {LogCode::kUTRANNeighbourList, "UTRAN neighbour cells"},
    {LogCode::kUTRANBLERAndSIR, "UTRAN BLER and SIR"},
    {LogCode::kUTRANGSMNeighbourList, "UTRAN GSM neighbours"},
    {LogCode::kUTRANRRCState, "UTRAN RRC state"},
    {LogCode::kUTRANServingCell, "UTRAN serving cell"},
    {LogCode::kLTEMasterInfoBlock, "LTE RRC master information block"},
    {LogCode::kLTEServingCellInfo, "LTE RRC serving cell info"},
    {LogCode::kLTEIntraFreqMeasurement, "LTE connected intra-frequency measurement"},
    {LogCode::kLTEServingCellMeasurement, "LTE idle serving cell measurement"},
    {LogCode::kLTEIdleNeighbourMeasurements, "LTE idle neighbour measurements"},
    {LogCode::kLTEReselectionCandidates, "LTE cell reselection candidates"},
    {LogCode::kDlfVersionReport, "DLF version report"},
};

}  // namespace

std::string LogCodeNames::nameOf(int32_t code) {
    for (const CodeName& entry : kNames)
        if (entry.code == code) return entry.name;
    return std::string();
}

}  // namespace vantorel
