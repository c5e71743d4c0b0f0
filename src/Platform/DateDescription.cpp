// DateDescription: the default date text and the local zone's offset and abbreviation.
#include "Platform/DateDescription.h"

#include <ctime>

namespace vantorel {

namespace {
std::tm localTm(DateDescription::TimePoint t) {
    std::time_t secs = std::chrono::system_clock::to_time_t(t);
    std::tm tm{};
    localtime_r(&secs, &tm);
    return tm;
}
}  // namespace

std::string DateDescription::describe(TimePoint t) {
    std::tm tm = localTm(t);
    char buf[64];
    std::strftime(buf, sizeof buf, "%Y-%m-%d %H:%M:%S %z", &tm);
    return buf;
}

long DateDescription::utcOffsetSeconds(TimePoint t) { return localTm(t).tm_gmtoff; }

bool DateDescription::isDaylightSaving(TimePoint t) { return localTm(t).tm_isdst > 0; }

}  // namespace vantorel
