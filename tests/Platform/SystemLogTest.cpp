// Tests for SystemLog and SystemLogCapture: priorities, formatting and the test capture (DESIGN.md "Platform stand-ins").
#include "Platform/SystemLog.h"

#include "Platform/SystemLogCapture.h"
#include "Platform/StringFormat.h"

#include <gtest/gtest.h>

using namespace vantorel;

TEST(SystemLog, CaptureRecordsPriorityAndExactText) {
    SystemLogCapture capture;
    SystemLog::log(SystemLog::kError, " ***** INVALIDATED %p *****", static_cast<void*>(nullptr));
    SystemLog::log(SystemLog::kWarning, "Array Count: %d", 3);
    SystemLog::log(SystemLog::kDlf, "Could not write DLF header (result=%d)", 3);
    auto lines = capture.lines();
    ASSERT_EQ(lines.size(), 3u);
    EXPECT_EQ(lines[0].priority, 3);
    EXPECT_EQ(lines[1].text, "Array Count: 3");
    EXPECT_EQ(lines[2].priority, 16);
    EXPECT_TRUE(capture.contains(SystemLog::kDlf, "Could not write DLF header (result=3)"));
    EXPECT_FALSE(capture.contains(SystemLog::kError, "Array Count: 3"));
}

TEST(SystemLog, MirrorWritesToStderrWhenVerbose) {
    SystemLog::setMirrorToStderr(true);
    ::testing::internal::CaptureStderr();
    SystemLog::log(SystemLog::kWarning, "%s", "Serving PLMN");
    std::string err = ::testing::internal::GetCapturedStderr();
    SystemLog::setMirrorToStderr(false);
    EXPECT_NE(err.find("Serving PLMN"), std::string::npos);
    ::testing::internal::CaptureStderr();
    SystemLog::log(SystemLog::kWarning, "%s", "quiet");
    EXPECT_EQ(::testing::internal::GetCapturedStderr(), "");
}

TEST(SystemLog, CaptureStopsWhenDestroyed) {
    std::vector<SystemLogCapture::Line> seen;
    {
        SystemLogCapture capture;
        SystemLog::log(SystemLog::kError, "inside");
        seen = capture.lines();
    }
    SystemLog::log(SystemLog::kError, "outside");  // no observer: must not crash
    ASSERT_EQ(seen.size(), 1u);
}

TEST(StringFormat, UsesPrintfFormatsExactly) {
    EXPECT_EQ(StringFormat::format("%+.2f dB", 1.5), "+1.50 dB");
    EXPECT_EQ(StringFormat::format("%d dBm", -97), "-97 dBm");
    EXPECT_EQ(StringFormat::format("%f", 128 * 0.00390625), "0.500000");
    EXPECT_EQ(StringFormat::format("%c%c%c", '3', '1', '0'), "310");
    EXPECT_EQ(StringFormat::format("%s", ""), "");
}
