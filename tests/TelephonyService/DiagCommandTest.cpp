// Tests the DIAG request side: framing vectors, log masks per equipment, reply matching, and the raw mode a serial port is put in.
#include "TelephonyService/Device/DiagCommand.h"
#include "TelephonyService/Device/DiagPort.h"
#include "TelephonyService/Device/SerialDiagPort.h"
#include "TelephonyService/Replay/HdlcDeframer.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QFile>
#include <QProcess>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <fcntl.h>
#include <pty.h>
#include <unistd.h>

#include <string>
#include <tuple>
#include <vector>

namespace vantorel {
namespace {

Bytes hex(const std::string& text) {
    Bytes out;
    for (size_t i = 0; i + 1 < text.size(); ++i) {
        if (text[i] == ' ') continue;
        out.push_back(static_cast<uint8_t>(std::stoi(text.substr(i, 2), nullptr, 16)));
        ++i;
    }
    return out;
}

TEST(DiagCommand, FramesAsTheModemExpectsAndTheDeframerReadsBackAtEveryCut) {
    const std::string check = "123456789";
    EXPECT_EQ(HdlcDeframer::crc16(ByteView(reinterpret_cast<const uint8_t*>(check.data()), check.size())), 0x906E);
    const std::vector<std::pair<Bytes, Bytes>> vectors = {
        {hex("01 02 03 04"), hex("01 02 03 04 91 39 7E")},
        // Flag and escape bytes in the body are escaped; no leading flag.
        {hex("7E 7D 10"), hex("7D 5E 7D 5D 10") },
    };
    for (const auto& [body, framed] : vectors) {
        const Bytes out = DiagCommand::frame(body);
        ASSERT_GE(out.size(), framed.size());
        EXPECT_EQ(Bytes(out.begin(), out.begin() + static_cast<long>(framed.size())), framed);
        EXPECT_EQ(out.back(), 0x7E);
        EXPECT_NE(out.front(), 0x7E);
    }
    // Every request, and one whose CRC needs escaping, read back whatever the split.
    std::vector<Bytes> bodies = DiagCommand::clearingSequence();
    bodies.push_back(DiagCommand::setMask(0xB, 0x200, {0x0C1, 0x0C2}));
    Bytes crcEscaped{0x73, 0x00, 0x00};
    for (unsigned i = 0; i < 0x10000 && (HdlcDeframer::crc16(crcEscaped) & 0xFF) != 0x7E; ++i) {
        crcEscaped[1] = static_cast<uint8_t>(i);
        crcEscaped[2] = static_cast<uint8_t>(i >> 8);
    }
    bodies.push_back(crcEscaped);
    Bytes stream;
    for (const Bytes& body : bodies) {
        const Bytes framed = DiagCommand::frame(body);
        stream.insert(stream.end(), framed.begin(), framed.end());
    }
    for (size_t cut = 0; cut <= stream.size(); ++cut) {
        HdlcDeframer deframer;
        deframer.feed(ByteView(stream).first(cut));
        deframer.feed(ByteView(stream).subspan(cut));
        EXPECT_EQ(deframer.takeFrames(), bodies) << "cut at " << cut;
    }
}

TEST(DiagCommand, LogMaskPerEquipmentFollowsTheModemsItemCounts) {
    DiagCommand::ItemCounts counts{};
    counts[0x1] = 0x400;
    counts[0x4] = 0x130;
    counts[0xB] = 0x200;
    // 0xB0C2 and 0xB0C1: equipment 0xB, items 0x0C2 / 0x0C1: byte 24, bits 2 and 1.
    // 0x4127: equipment 4, item 0x127: byte 36, bit 7. 0x1FFF: item 0xFFF of 0x400: skipped.
    // 0x7130: equipment 7 has no items at all: skipped.
    const DiagCommand::MaskPlan plan = DiagCommand::planMasks({0xB0C2, 0xB0C1, 0x4127, 0x1FFF, 0x7130}, counts);
    ASSERT_EQ(plan.requests.size(), 2u);
    Bytes lte = hex("73 00 00 00 03 00 00 00 0B 00 00 00 00 02 00 00");
    lte.resize(lte.size() + 0x200 / 8);
    lte[16 + 24] = 0x06;
    EXPECT_EQ(plan.requests.at(0xB), lte);
    Bytes umts = hex("73 00 00 00 03 00 00 00 04 00 00 00 30 01 00 00");
    umts.resize(umts.size() + 0x130 / 8);
    umts[16 + 36] = 0x80;
    EXPECT_EQ(plan.requests.at(0x4), umts);
    EXPECT_EQ(plan.skipped, (std::vector<uint16_t>{0x1FFF, 0x7130}));
    // A count that is not a multiple of 8 still gets its last item's byte.
    EXPECT_EQ(DiagCommand::setMask(1, 9, {8}).size(), 16u + 2u);
    EXPECT_EQ(DiagCommand::setMask(1, 9, {8}).back(), 0x01);
}

TEST(DiagCommand, RepliesAreTheFramesThatAnswerTheRequestInFlight) {
    const Bytes ranges = DiagCommand::logConfig(1);
    const Bytes levels = DiagCommand::messageLevelsOff();
    const std::vector<std::tuple<const char*, Bytes, Bytes, bool, std::string>> rows = {
        {"same op", hex("73 00 00 00 01 00 00 00 00 00 00 00"), ranges, true, ""},
        {"other op", hex("73 00 00 00 03 00 00 00 00 00 00 00"), ranges, false, ""},
        {"cut before the op", hex("73 00 00"), ranges, false, ""},
        {"bad parameter echoing it", hex("14 73 00 00 00 01 00 00 00"), ranges, true, "bad parameter"},
        {"bad command echoing another", hex("13 7C"), ranges, false, "bad command"},
        {"bad length", hex("15 7D 05"), levels, true, "bad length"},
        {"bad mode", hex("18 7D 05"), levels, true, "bad mode"},
        {"log packet meanwhile", hex("10 00 0E 00 0E 00 C2 B0"), ranges, false, ""},
        {"debug message subcommand", hex("7D 04 00 00"), levels, false, ""},
        {"version", hex("00 41 42"), DiagCommand::version(), true, ""},
        {"empty frame", {}, DiagCommand::version(), false, ""},
    };
    for (const auto& [name, reply, request, answers, error] : rows) {
        EXPECT_EQ(DiagCommand::answers(reply, request), answers) << name;
        EXPECT_EQ(DiagCommand::errorName(reply), error) << name;
    }
    Bytes counts = hex("73 00 00 00 01 00 00 00 00 00 00 00");
    for (uint32_t i = 0; i < 16; ++i) counts.insert(counts.end(), {uint8_t(i), 0, 0, 0});
    ASSERT_TRUE(DiagCommand::itemCounts(counts));
    EXPECT_EQ((*DiagCommand::itemCounts(counts))[15], 15u);
    counts.pop_back();
    EXPECT_FALSE(DiagCommand::itemCounts(counts)) << "cut reply";
    counts = hex("73 00 00 00 01 00 00 00 01 00 00 00");
    counts.resize(12 + 64);
    EXPECT_FALSE(DiagCommand::itemCounts(counts)) << "status 1";
}

// A pseudo-terminal starts in cooked mode: output turns 0A into 0D 0A, input 0D into 0A,
// either of which breaks a frame. The port must be raw in both directions.
TEST(DiagPort, PutsATerminalInRawMode) {
    int master = -1, slave = -1;
    char name[128] = {};
    ASSERT_EQ(::openpty(&master, &slave, name, nullptr, nullptr), 0);
    ::close(slave);  // held only by the port: another holder would be refused
    std::string error;
    std::unique_ptr<DiagPort> port = DiagPort::open(name, &error);
    ASSERT_TRUE(port) << error;
    Bytes got;
    QObject::connect(port.get(), &DiagPort::received, [&](const Bytes& b) { got.insert(got.end(), b.begin(), b.end()); });

    const Bytes out = hex("0A 0D 7E 11 13");
    ASSERT_TRUE(port->write(out));
    Bytes atModem(16);
    QElapsedTimer clock;
    clock.start();
    ssize_t n = 0;
    while (n <= 0 && clock.elapsed() < 2000) n = ::read(master, atModem.data(), atModem.size());
    atModem.resize(n > 0 ? static_cast<size_t>(n) : 0);
    EXPECT_EQ(atModem, out);

    ASSERT_EQ(::write(master, out.data(), out.size()), static_cast<ssize_t>(out.size()));
    while (got.size() < out.size() && clock.elapsed() < 4000) QCoreApplication::processEvents(QEventLoop::AllEvents, 20);
    EXPECT_EQ(got, out);
    ::close(master);
}

// What a user who typed the wrong --device reads.
TEST(DiagPort, AWrongDeviceIsRefusedWithWhatToDo) {
    QTemporaryDir dir;
    const std::string file = dir.filePath("capture.qmdl").toStdString();
    QFile(QString::fromStdString(file)).open(QIODevice::WriteOnly);
    const std::vector<std::pair<std::string, std::string>> rows = {
        {"/dev/ttyUSB97", "/dev/ttyUSB97: no such device (is the modem plugged in"},
        {file, file + ": a regular file, not a device (to play a recorded capture use --replay FILE)"},
        {dir.path().toStdString(), dir.path().toStdString() + ": a directory, not a device"},
        {"tcp:2500", "tcp:2500: give tcp:HOST:PORT, such as tcp:127.0.0.1:2500"},
        {"tcp:127.0.0.1:70000", "tcp:127.0.0.1:70000: the port must be a number from 1 to 65535"},
        {"tcp:127.0.0.1:1", "tcp:127.0.0.1:1: Connection refused (is the bridge running and the port forwarded?)"},
    };
    for (const auto& [device, message] : rows) {
        std::string error;
        EXPECT_FALSE(DiagPort::open(device, &error)) << device;
        EXPECT_EQ(error.substr(0, message.size()), message) << device;
    }
}

// Another program on the port would take the modem's replies: the service names it.
TEST(DiagPort, FindsTheProgramsThatHoldAPort) {
    int master = -1, slave = -1;
    char name[128] = {};
    ASSERT_EQ(::openpty(&master, &slave, name, nullptr, nullptr), 0);
    ::close(slave);
    QProcess holder;
    holder.setStandardInputFile(name);
    holder.start("sleep", {"30"});
    ASSERT_TRUE(holder.waitForStarted());
    const std::vector<SerialDiagPort::Holder> holders = SerialDiagPort::holders(name);
    ASSERT_EQ(holders.size(), 1u);
    EXPECT_EQ(holders[0].pid, holder.processId());
    EXPECT_EQ(holders[0].program, "sleep");
    holder.kill();
    holder.waitForFinished();
    ::close(master);
}

}  // namespace
}  // namespace vantorel
