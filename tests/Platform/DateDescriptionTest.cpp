// Tests for DateDescription: the default date text "YYYY-MM-DD HH:MM:SS +ZZZZ" and the local zone facts, in a zone with a half-hour offset.
#include "Platform/DateDescription.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <ctime>

using namespace vantorel;

TEST(DateDescription, DescribesInTheLocalZoneWithNumericOffset) {
    const char* old = std::getenv("TZ");
    std::string saved = old ? old : "";
    setenv("TZ", "NST3:30", 1);
    tzset();
    // 2016-06-28 22:01:10 UTC is 18:31:10 at UTC-03:30.
    auto t = std::chrono::system_clock::from_time_t(1467151270);
    EXPECT_EQ(DateDescription::describe(t), "2016-06-28 18:31:10 -0330");
    EXPECT_EQ(DateDescription::utcOffsetSeconds(t), -12600);
    EXPECT_FALSE(DateDescription::isDaylightSaving(t));
    if (old)
        setenv("TZ", saved.c_str(), 1);
    else
        unsetenv("TZ");
    tzset();
}
