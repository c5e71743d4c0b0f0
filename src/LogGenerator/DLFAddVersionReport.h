// DLFAddVersionReport: writes the DLF file's 161-byte version-report record (code 0x1FFD) that opens every saved log.
#pragma once

#include <cstdint>

namespace vantorel {

inline constexpr unsigned kDLFVersionReportLength = 161;

// Returns 0 on success (161 bytes written at the start of buffer, *written = 161) and
// 3 when capacity is below 161 (buffer untouched, *written = 0). Texts are copied
// with truncation to their fields and a terminating NUL.
int DLFAddVersionReport(uint8_t* buffer, unsigned capacity, unsigned* written, uint16_t firstVersion,
                        uint16_t secondVersion, const char* versionText, const char* executableName,
                        const char* buildDate, uint32_t time, int16_t timeZoneMinutes, int16_t daylightSaving);

}  // namespace vantorel
