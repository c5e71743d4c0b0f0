// Tests of the terminal view's keys, its screen in a small terminal, moving through a changing tree, its status line, and the X display probe.
#include "Model/VantorelModel.h"
#include "Monitor/TerminalFallback.h"
#include "Monitor/TerminalKeys.h"
#include "Monitor/TerminalNavigator.h"
#include "Monitor/TerminalView.h"
#include "Platform/RecordBuilder.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "support/EventLoopWait.h"
#include "support/FakeTelephonyService.h"
#include "support/FastMonitorClock.h"

#include <gtest/gtest.h>

#include <arpa/inet.h>
#include <chrono>
#include <cstdio>
#include <functional>
#include <poll.h>
#include <sys/socket.h>
#include <thread>
#include <vector>
#include <unistd.h>

using namespace vantorel;
using Key = TerminalKeys::Key;

namespace {

// "Cells" holds `cells` rows (none: no "Cells"), each two values; `before` adds a value row first.
NodeRef tree(int cells, const std::string& before = "") {
    auto root = Dictionary::create();
    auto list = Array::create();
    for (int i = 0; i < cells; ++i) {
        auto cell = Dictionary::create();
        cell->set("UARFCN", std::to_string(10000 + i));
        cell->set("Note", std::string(100, 'x') + "×");
        list->append(Value(cell));
    }
    if (!before.empty()) root->set(before, "new");
    root->set("Technology", "UTRAN (TD-SCDMA)");
    if (cells >= 0) root->set("Cells", Value(list));
    root->set("Span", "3×4 " + std::string(72, '-') + "×");  // 85 columns with its name
    PathDictionary paths;
    return VantorelModelNode::makeTreeFromObject(Value(root), paths);
}

}  // namespace

TEST(TerminalView, TextTakesTheColumnsATerminalGivesIt) {
    // "×" one column; a combining mark (U+036F) and a zero-width space (U+200B) none;
    // a fullwidth sign (U+FFE6) and a CJK ideograph two; a stray continuation byte one.
    const std::pair<const char*, int> rows[] = {{"12 \u00d7 64", 7}, {"e\u036f", 1}, {"a\u200bb", 2},
                                                {"\uffe6", 2}, {"\u4e2d\u6587", 4}, {"\x80x", 2}};
    for (const auto& [text, columns] : rows) EXPECT_EQ(TerminalNavigator::columns(text), columns) << text;
    EXPECT_EQ(TerminalNavigator::cut("\u4e2d\u6587abc", 4), "\u4e2d\u2026");
}

TEST(TerminalView, KeySequencesSplitAcrossReadsAndUnknownBytesDropped) {
    // Home and End also as the console's 1~/4~ and rxvt's 7~/8~.
    std::string pending = "\x1b[A\x1b[B\r\x7f\x1b[5~\x1b[6~\x1b[H\x1bOF\x1b[1~\x1b[4~\x1b[7~\x1b[8~\x1b[C\x1b[Dzq\x1b[1;5";
    const std::vector<Key> keys{Key::Up,   Key::Down, Key::Enter, Key::Back, Key::PageUp, Key::PageDown, Key::Home,
                                Key::End,  Key::Home, Key::End,   Key::Home, Key::End,    Key::Enter,    Key::Back,
                                Key::Quit};
    EXPECT_EQ(TerminalKeys::take(pending), keys);
    EXPECT_EQ(pending, "\x1b[1;5");  // the rest of the sequence is still to come
    pending += "B";
    EXPECT_EQ(TerminalKeys::take(pending), std::vector<Key>{Key::Down});
    EXPECT_TRUE(pending.empty());
}

TEST(TerminalView, An80x24ScreenKeepsTheHeaderCutsLinesAndScrollsToTheCursor) {
    TerminalNavigator nav;
    nav.setRoot(tree(40));
    auto screen = nav.render("Vantorel - Updated 2016-06-28 at 22:01:10 - 12 messages decoded", 80, 24);
    ASSERT_EQ(screen.size(), 24u);
    EXPECT_EQ(screen[0].rfind("Vantorel - Updated", 0), 0u);
    EXPECT_EQ(screen[4], "  Span: 3×4 " + std::string(67, '-') + "…");  // cut to 80 columns, "×" is one
    for (const auto& line : screen) EXPECT_LE(TerminalNavigator::columns(line), 80) << line;

    ASSERT_TRUE(nav.handle(Key::Down, 21) && nav.handle(Key::Enter, 21));
    for (int i = 0; i < 25; ++i) nav.handle(Key::Down, 21);
    screen = nav.render("status", 80, 24);
    EXPECT_EQ(screen[1], "Vantorel / Cells  (26 of 40)");
    EXPECT_EQ(screen[22].rfind("> 25 > UARFCN 10025 | Note xxx", 0), 0u);  // the cursor row on the last body line
    EXPECT_EQ(screen[23].rfind("rows 6-26 of 40", 0), 0u);
    nav.handle(Key::PageDown, 21), nav.handle(Key::PageDown, 21), nav.handle(Key::Home, 21);
    EXPECT_EQ(nav.render("status", 80, 24)[2].rfind("> 0 > ", 0), 0u);
    nav.handle(Key::Enter, 21), nav.handle(Key::Down, 21), nav.handle(Key::Enter, 21);  // a value row: stays
    EXPECT_EQ(nav.path(), (std::vector<std::string>{"Cells", "0"}));
    EXPECT_EQ(nav.cursorName(), "Note");
    nav.handle(Key::Back, 21), nav.handle(Key::Back, 21), nav.handle(Key::Back, 21);
    EXPECT_TRUE(nav.path().empty());
    EXPECT_EQ(nav.cursorName(), "Cells");  // back on the row it came from
    EXPECT_FALSE(nav.handle(Key::Quit, 21));
}

TEST(TerminalView, ARefreshKeepsTheLevelAndTheCursorRowByName) {
    TerminalNavigator nav;
    nav.setRoot(tree(5));
    nav.handle(Key::Down, 21), nav.handle(Key::Enter, 21), nav.handle(Key::End, 21);
    nav.setRoot(tree(8, "Alarm"));  // a row above, more rows: still Cells, still "4"
    EXPECT_EQ(nav.path(), std::vector<std::string>{"Cells"});
    EXPECT_EQ(nav.cursorName(), "4");
    nav.setRoot(tree(-1));  // Cells gone: its parent
    EXPECT_TRUE(nav.path().empty());
}

TEST(TerminalView, AnXDisplayAnswersOnlyWhenItsServerLetsAClientInAndAResettingServerIsAskedAgain) {
    const int listener = ::socket(AF_INET, SOCK_STREAM, 0);
    sockaddr_in address{AF_INET, 0, {htonl(INADDR_LOOPBACK)}, {}};
    int n = 59;  // a free port 6000 + n on the loopback
    do address.sin_port = htons(static_cast<uint16_t>(6000 + ++n));
    while (::bind(listener, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0);
    ASSERT_EQ(::listen(listener, 8), 0);
    const std::string tcp = "127.0.0.1:" + std::to_string(n) + ".0";
    const auto start = std::chrono::steady_clock::now();
    for (const std::string& nothing : {":" + std::to_string(n + 9000), "127.0.0.1:" + std::to_string(n + 1), std::string("junk")})
        EXPECT_FALSE(TerminalFallback::displayAnswers(nothing, 2000)) << nothing;
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(500));  // refused at once

    // Setup replies: Success; Failed with its reason (length in byte 1, text from byte 8).
    const std::string success("\x01\0\x0b\0\0\0\0\0", 8);
    const std::string full = std::string("\0\x21\x0b\0\0\0\x09\0", 8) + "Maximum number of clients reached\0\0\0";
    const struct {
        const char* server;
        std::vector<std::string> replies;  // one per connection; "" closes it without a reply
        int timeoutMs;
        bool answers;
        std::string why;
    } rows[] = {
        {"lets the client in", {success}, 2000, true, ""},
        {"is full", {full}, 2000, false, "refuses connections: Maximum number of clients reached"},
        {"resets as its last client leaves", {"", "", success}, 2000, true, ""},
        {"is a proxy with nothing behind it", {"", "", "", "", "", "", "", ""}, 300, false, "does not answer"},
        {"never replies", {"never"}, 200, false, "does not answer"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.server);
        std::thread server([&] {
            for (const std::string& reply : row.replies) {
                pollfd p{listener, POLLIN, 0};
                if (::poll(&p, 1, 1000) != 1) return;
                const int c = ::accept(listener, nullptr, nullptr);
                char request[12];
                EXPECT_EQ(::recv(c, request, sizeof request, MSG_WAITALL), 12);
                if (reply == "never") ::poll(&p, 0, row.timeoutMs + 100);
                else ::send(c, reply.data(), reply.size(), MSG_NOSIGNAL);
                ::close(c);
            }
        });
        std::string why;
        int connection = -1;
        EXPECT_EQ(TerminalFallback::displayAnswers(tcp, row.timeoutMs, &why, &connection), row.answers);
        if (!row.answers) EXPECT_EQ(why, row.why);
        EXPECT_EQ(connection >= 0, row.answers);  // the connection that answered is handed over
        if (connection >= 0) ::close(connection);
        server.join();
    }
    ::close(listener);
}

TEST(TerminalView, TheStatusLineSaysWhatTheWindowSaysOfStaleValuesDropsAndAServiceNobodyRuns) {
    vantorel::testing::FastMonitorClock::installed();
    vantorel::testing::FakeTelephonyService service;
    auto failed = Dictionary::create();
    failed->set("State", "Failed");
    failed->set("Problem", "device /dev/ttyUSB0: the device hung up");
    auto dropped = Dictionary::create();
    dropped->set("Dropped", Value::integer(1087244));
    const std::string nobody = vantorel::testing::uniquePortName("nobody");
    const struct {
        const char* what;
        std::string port;
        std::function<void()> happen;
        std::string says;
    } rows[] = {
        {"the modem hung up", service.name(), [&] { service.notify("BackendStateChanged", Value(failed)); },
         "Vantorel - no data since "},
        {"messages dropped", service.name(), [&] { service.notifyChannel("ChannelStatus", Value(dropped)); },
         " \u00b7 1087244 messages dropped"},
        {"a service nobody runs", nobody, [] {}, "Vantorel - Connecting... nothing serves port " + nobody + "; trying again"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.what);
        std::FILE* out = std::tmpfile();
        TerminalView view(out);
        VantorelModel model(&view, row.port);
        view.setModel(&model);
        model.startMonitor();
        if (model.isRunning()) {
            service.send(RecordBuilder::ordinary(0xD0E0, 15).u8(13, 1).u8(14, 3).build());
            ASSERT_TRUE(vantorel::testing::waitUntil([&] { return model.messagesDecoded() == 1; }));
        }
        row.happen();
        ASSERT_TRUE(vantorel::testing::waitUntil([&] { return view.statusLine().find(row.says) != std::string::npos; }, 3000))
            << view.statusLine();
        vantorel::testing::spin(50);
        std::string printed(1 << 16, '\0');  // the plain screens printed so far
        std::rewind(out);
        printed.resize(std::fread(printed.data(), 1, printed.size(), out));
        EXPECT_NE(printed.find(row.says), std::string::npos) << printed;
        std::fclose(out);
    }
}
