// TelephonyIdentifiers: the telephony service's technology identifiers and cell-monitor keys, defined once for the model, decoders and service.
#pragma once

namespace vantorel {

// Technology identifiers answered to "GetTechnology", in the order the service lists them.
inline constexpr const char* kTSLogChannelTechnology_IFX = "kTSLogChannelTechnology_IFX";
inline constexpr const char* kTSLogChannelTechnology_Morvek_GSM = "kTSLogChannelTechnology_Morvek_GSM";
inline constexpr const char* kTSLogChannelTechnology_Morvek_CDMA = "kTSLogChannelTechnology_Morvek_CDMA";
inline constexpr const char* kTSLogChannelTechnology_Morvek_LTE = "kTSLogChannelTechnology_Morvek_LTE";
inline constexpr const char* kTSLogChannelTechnology_Morvek_UTRAN2 = "kTSLogChannelTechnology_Morvek_UTRAN2";

// Cell-monitor dictionary keys (the 0xFF0001 extra record the GSM, LTE and UTRAN decoders read).
inline constexpr const char* kTSCellMonitorMCC = "kTSCellMonitorMCC";
inline constexpr const char* kTSCellMonitorMNC = "kTSCellMonitorMNC";
inline constexpr const char* kTSCellMonitorLAC = "kTSCellMonitorLAC";
inline constexpr const char* kTSCellMonitorTAC = "kTSCellMonitorTAC";
inline constexpr const char* kTSCellMonitorCellId = "kTSCellMonitorCellId";
inline constexpr const char* kTSCellMonitorPID = "kTSCellMonitorPID";
inline constexpr const char* kTSCellMonitorARFCN = "kTSCellMonitorARFCN";
inline constexpr const char* kTSCellMonitorUARFCN = "kTSCellMonitorUARFCN";
inline constexpr const char* kTSCellMonitorSCN = "kTSCellMonitorSCN";
inline constexpr const char* kTSCellMonitorRSCP = "kTSCellMonitorRSCP";
inline constexpr const char* kTSCellMonitorECN0 = "kTSCellMonitorECN0";
inline constexpr const char* kTSCellMonitorRSSI = "kTSCellMonitorRSSI";
inline constexpr const char* kTSCellMonitorBandInfo = "kTSCellMonitorBandInfo";
inline constexpr const char* kTSCellMonitorCellType = "kTSCellMonitorCellType";
inline constexpr const char* kTSCellMonitorCellRadioAccessTechnology = "kTSCellMonitorCellRadioAccessTechnology";

// Values of kTSCellMonitorCellType and kTSCellMonitorCellRadioAccessTechnology.
inline constexpr const char* kTSCellMonitorCellTypeServing = "kTSCellMonitorCellTypeServing";
inline constexpr const char* kTSCellMonitorCellTypeNeighbor = "kTSCellMonitorCellTypeNeighbor";
inline constexpr const char* kTSCellMonitorRadioAccessTechnologyGSM = "kTSCellMonitorRadioAccessTechnologyGSM";
inline constexpr const char* kTSCellMonitorRadioAccessTechnologyUMTS = "kTSCellMonitorRadioAccessTechnologyUMTS";
inline constexpr const char* kTSCellMonitorRadioAccessTechnologyUTRAN2 = "kTSCellMonitorRadioAccessTechnologyUTRAN2";
inline constexpr const char* kTSCellMonitorRadioAccessTechnologyLTE = "kTSCellMonitorRadioAccessTechnologyLTE";

}  // namespace vantorel
