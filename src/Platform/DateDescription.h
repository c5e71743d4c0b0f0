// DateDescription: the platform's default date description "YYYY-MM-DD HH:MM:SS +ZZZZ" and the local zone's offset and abbreviation.
#pragma once

#include <chrono>
#include <cstdint>
#include <string>

namespace vantorel {

class DateDescription {
public:
    using TimePoint = std::chrono::system_clock::time_point;

    // "2026-11-22 14:03:09 +0100", in the local time zone.
    static std::string describe(TimePoint t);
    static std::string now() { return describe(std::chrono::system_clock::now()); }

    // The local zone's offset from UTC in seconds at t, and whether daylight-saving
    // time is in force there.
    static long utcOffsetSeconds(TimePoint t);
    static bool isDaylightSaving(TimePoint t);
};

}  // namespace vantorel
