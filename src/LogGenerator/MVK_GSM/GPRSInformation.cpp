// GPRSInformation: the "GPRS Information" section: GPRS cell options and parameters read field by field from eight GSM/GPRS records.
#include "LogGenerator/MVK_GSM/GPRSInformation.h"

#include "LogGenerator/MVK_GSM/RecordFields.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"

namespace vantorel {

namespace {

using F = RecordFields;

const char* const kSI13Position[] = {"Located on BCCH", "Located on Extended BCCH"};
const char* const kNetworkControlOrder[] = {"NC0", "NC1", "NC2"};
const char* const kPFCSupported[] = {"Not Supported", "Supported"};
const char* const kPriorityAccessThreshold[] = {
    "Barred (PKT access not allowed in the Cell)", "Barred", "Barred", "1 Only", "1 to 2", "1 to 3", "1 to 4",
    "Allowed",
};
// T3192 in its air-interface coding: 0 is 500 ms and 3 is 0 ms.
const char* const kT3192[] = {"500 ms", "1000 ms", "1500 ms", "0 ms", "80 ms", "120 ms", "160 ms", "200 ms"};
const char* const kNetworkOperatingMode[] = {"Class 1", "Class 2", "Class 3"};

// Byte 255 means "field not available", except for PFC, whose 255 the modem reports
// as "Available".
const RecordFields::Field kCellOptions[] = {  // 0x51F5, at least 18 bytes
    F::text("Network Control Order", 15, kNetworkControlOrder, "Unknown", "Not Available"),
    F::text("PFC Supported", 13, kPFCSupported, "Unknown", "Available"),
    F::text("Priority Access Threshold", 14, kPriorityAccessThreshold, "Unknown", "Not Available"),
};
const RecordFields::Field kNetworkMode[] = {  // 0x7135, at least 28 bytes
    F::text("Network Operating Mode", 13, kNetworkOperatingMode),
};
const RecordFields::Field kGeneralParameters[] = {  // 0x51F6, at least 24 bytes
    F::text("T3192", 15, kT3192, "?? ms"),
    F::flag("Access Burst Type", 17, "8-bit format", "11-bit format"),
    F::number("DRX Timer Max", 16),
};
const RecordFields::Field kPBCCH[] = {  // 0x51FB, at least 34 bytes
    F::number("PBCCH Present", 13),
};
const RecordFields::Field kPacketSystemInfo[] = {  // 0x51FD, at least 35 bytes
    F::number("Ext Measurement Order", 16), F::number("Packet PSI Status", 13),
    F::flag("Packet SI Status", 33, "Not Supported", "Supported"),
    F::number("Count LR", 14),       F::number("Count HR", 15),
};
const RecordFields::Field kSI13[] = {  // 0x51F4, at least 15 bytes
    F::text("SI13 Position", 14, kSI13Position, "Unknown", "Not Available"),
};
const RecordFields::Field kServingMeasurement[] = {  // 0x5137, at least 29 bytes
    F::flag("Cell Reselect Hysteresis", 26, "Not Applied", "Applied"),
};

// In the order the section subscribes to them.
const RecordFields::Record kRecords[] = {
    {LogCode::kGPRSCellOptions, 18, kCellOptions},
    {LogCode::kServingPLMNAndArea, 28, kNetworkMode},
    {LogCode::kGPRSGeneralParameters, 24, kGeneralParameters},
    {LogCode::kGPRSPBCCHDescription, 34, kPBCCH},
    {LogCode::kGPRSPacketSystemInfo, 35, kPacketSystemInfo},
    {LogCode::kGPRSSI13Position, 15, kSI13},
    {LogCode::kGSMServingMeasurement, 29, kServingMeasurement},
};

}  // namespace

std::string GPRSInformation::getSectionName() const { return "GPRS Information"; }

std::vector<int32_t> GPRSInformation::getLogCodeArray() const { return RecordFields::codes(kRecords); }

void GPRSInformation::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "GPRSInformation");
    if (!RecordFields::showRecord(data, logCode, kRecords,
                                  [this](const std::string& key, const std::string& text) { setValue(key, text); }))
        logUnknownCode(logCode);
}

}  // namespace vantorel
