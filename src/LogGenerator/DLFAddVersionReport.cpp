// DLFAddVersionReport: the DLF file's 161-byte version-report record.
#include "LogGenerator/DLFAddVersionReport.h"

#include "Platform/LogCodes.h"
#include "Platform/RecordBuilder.h"

#include <algorithm>
#include <cstring>

namespace vantorel {

namespace {

// Copies at most fieldWidth - 1 characters and a NUL; the rest of the field stays 0.
void putText(uint8_t* field, size_t fieldWidth, const char* text) {
    if (!text) return;
    size_t n = std::min(std::strlen(text), fieldWidth - 1);
    std::memcpy(field, text, n);
    field[n] = 0;
}

}  // namespace

int DLFAddVersionReport(uint8_t* buffer, unsigned capacity, unsigned* written, uint16_t firstVersion,
                        uint16_t secondVersion, const char* versionText, const char* executableName,
                        const char* buildDate, uint32_t time, int16_t timeZoneMinutes, int16_t daylightSaving) {
    if (written) *written = 0;
    if (!buffer || capacity < kDLFVersionReportLength) return 3;

    // Record layout (little-endian; every byte not named is 0):
    //   0  u16 length 161       2  u16 code 0x1FFD      4  u64 time stamp, 0
    //  12  u16 first version   14  u16 second version  16  char[7]  version text
    //  23  char[16] executable name                    39  24 zero bytes
    //  63  char[18] build date 81  u32 time (s since 1970)
    //  85  s16 zone minutes    87  u16 daylight-saving 89  72 zero bytes
    // The body is the 149 bytes from 12; its own offsets 0, 2, 4, 11, 51, 69, 73, 75.
    Bytes record(kDLFVersionReportLength, 0);
    RecordBuilder::put(record, 0, kDLFVersionReportLength, 2);
    RecordBuilder::put(record, 2, LogCode::kDlfVersionReport, 2);
    RecordBuilder::put(record, 12, firstVersion, 2);
    RecordBuilder::put(record, 14, secondVersion, 2);
    putText(&record[16], 7, versionText);
    putText(&record[23], 16, executableName);
    putText(&record[63], 18, buildDate);
    RecordBuilder::put(record, 81, time, 4);
    RecordBuilder::put(record, 85, static_cast<uint16_t>(timeZoneMinutes), 2);
    RecordBuilder::put(record, 87, static_cast<uint16_t>(daylightSaving), 2);

    std::memcpy(buffer, record.data(), record.size());
    if (written) *written = kDLFVersionReportLength;
    return 0;
}

}  // namespace vantorel
