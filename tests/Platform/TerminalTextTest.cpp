// Tests for TerminalText: what a terminal would obey is shown instead, everything printable passes.
#include "Platform/TerminalText.h"

#include <gtest/gtest.h>

using vantorel::TerminalText;

TEST(TerminalTextTest, ControlsAndBrokenUtf8BecomeVisibleTextStaysAsItIs) {
    const struct {
        std::string in, out;
    } rows[] = {
        {"internet", "internet"},
        {"\x1b]0;owned\x07" "apn", "\\x1b]0;owned\\x07apn"},  // window title
        {"\x1b[2J\x1b[H", "\\x1b[2J\\x1b[H"},                   // clear screen
        {std::string("a\0b\tc\nd\x7f", 8), "a\\x00b\\x09c\\x0ad\\x7f"},
        {"\xc2\x9b" "2J", "\\xc2\\x9b2J"},                      // C1 CSI
        {"\xc2\xa0\xc3\xa9 \xe2\x82\xac \xf0\x9f\x93\xb6", "\xc2\xa0\xc3\xa9 \xe2\x82\xac \xf0\x9f\x93\xb6"},
        {"\xff\xfe", "\\xff\\xfe"},
        {"\xc0\xaf", "\\xc0\\xaf"},                              // overlong '/'
        {"\xed\xa0\x80", "\\xed\\xa0\\x80"},                    // surrogate
        {"\xf4\x90\x80\x80", "\\xf4\\x90\\x80\\x80"},           // past U+10FFFF
        {"\xe0\x9f\xbf", "\\xe0\\x9f\\xbf"},                    // overlong 3-byte
        {"\xf0\x8f\xbf\xbf", "\\xf0\\x8f\\xbf\\xbf"},           // overlong 4-byte
        {"\xe2\x82", "\\xe2\\x82"},                              // cut off by the end
        {"\xe2\x28\xa1", "\\xe2(\\xa1"},                         // bad continuation
    };
    for (const auto& row : rows) EXPECT_EQ(TerminalText::visible(row.in), row.out) << row.out;
}
