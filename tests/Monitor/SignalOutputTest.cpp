// Tests the signal outputs of the monitor: gpsd positions (a stand-in gpsd, and none), the CSV rows, the sparkline bars.
#include "Monitor/GpsPosition.h"
#include "Monitor/SignalCsvWriter.h"
#include "Monitor/Sparkline.h"

#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include "support/EventLoopWait.h"

#include <QElapsedTimer>
#include <QTcpServer>
#include <QTcpSocket>
#include <gtest/gtest.h>

using namespace vantorel;
using vantorel::testing::waitUntil;

TEST(GpsPosition, FollowsTheFixOfAGpsdAndSurvivesItsEnd) {
    QTcpServer gpsd;
    ASSERT_TRUE(gpsd.listen(QHostAddress::LocalHost));
    GpsPosition gps("127.0.0.1", std::to_string(gpsd.serverPort()));
    gps.start();
    ASSERT_TRUE(gps.isConnected());
    ASSERT_TRUE(waitUntil([&] { return gpsd.hasPendingConnections(); }));
    QTcpSocket* client = gpsd.nextPendingConnection();
    auto send = [&](const char* lines) { client->write(lines); client->flush(); };

    // Two reports in one segment and a half report: the last whole one counts.
    send("{\"class\":\"TPV\",\"mode\":1}\n{\"class\":\"TPV\",\"mode\":3,\"lat\":48.137,\"lon\":11.575,\"speed\":13.5}\n"
         "{\"class\":\"SKY\",");
    ASSERT_TRUE(waitUntil([&] { return gps.position().has_value(); }));
    EXPECT_EQ(gps.position()->latitude, 48.137);
    EXPECT_EQ(gps.position()->longitude, 11.575);
    EXPECT_EQ(gps.position()->speed, 13.5);
    send("\"satellites\":[]}\n{\"class\":\"TPV\",\"mode\":1}\n");  // the fix is lost
    EXPECT_TRUE(waitUntil([&] { return !gps.position(); }));
    client->close();
    EXPECT_TRUE(waitUntil([&] { return !gps.isConnected(); }));
}

TEST(GpsPosition, WithoutGpsdThereIsNoPositionAndNoWait) {
    QElapsedTimer timer;
    timer.start();
    GpsPosition gps("127.0.0.1", "1");  // a privileged port no gpsd listens on
    gps.start();
    EXPECT_FALSE(gps.isConnected());
    EXPECT_FALSE(gps.position());
    EXPECT_LT(timer.elapsed(), 1000);
}

TEST(SignalCsvWriter, RowsHoldCNumbersGapsAndQuotedNames) {
    SignalCsvWriter csv({"/a", "/b,c", "/d\"e"}, true);
    EXPECT_EQ(csv.header(), "time,/a,\"/b,c\",\"/d\"\"e\",latitude,longitude,speed\r\n");
    EXPECT_EQ(csv.row(1438395100985, {-96.56, std::nullopt, 1e-3}, SignalCsvWriter::Position{48.5, -11.25, {}}),
              "2015-08-01T02:11:40.985Z,-96.56,,0.001,48.5,-11.25,\r\n");
    EXPECT_EQ(csv.row(std::nullopt, {3}), ",3,,,,,\r\n");
    SignalSeries series;
    series.add("/a", 2000, 1);
    series.add("/d\"e", 0, 2);
    series.add("/d\"e", 2000, 3);
    EXPECT_EQ(csv.fromSeries(series), csv.header() + csv.row(0, {std::nullopt, std::nullopt, 2}) + csv.row(2000, {1, std::nullopt, 3}));
}

TEST(Sparkline, BarsSpanTheRangeShownWithGapsAsSpaces) {
    const std::pair<std::deque<std::optional<double>>, const char*> rows[] = {
        {{-120, -110, std::nullopt, -100}, "▁▅ █"}, {{5, 5}, "▄▄"}, {{}, ""}, {{std::nullopt}, " "},
        {{0, 1, 2, 3, 4, 5, 6, 7}, "▁▂▃▄▅▆▇█"}, {{-1e308, 1e308}, "▁█"},
    };
    for (const auto& [values, bars] : rows) EXPECT_EQ(Sparkline::bars(values), bars);
}

// --plot takes the keys --csv-keys takes: a list entry by its cell, its rank or its position,
// each line naming its cell, with the value in the catalogue's unit (Srxlev is dB, whatever
// its display string says).
TEST(Sparkline, FollowsSelectedCellsNamesThemAndShowsTheCataloguesUnit) {
    auto cell = [](const char* pci, const char* rsrp) {
        auto entry = Dictionary::create();
        entry->set("Physical Cell ID", Value(pci));
        entry->set("Filtered RSRP", Value(rsrp));
        return Value(entry);
    };
    auto cells = Array::create();
    cells->append(cell("251", "-104.00 dBm"));
    cells->append(cell("17", "-98.50 dBm"));
    auto neighbours = Dictionary::create(), serving = Dictionary::create(),
         measurements = Dictionary::create(), top = Dictionary::create();
    neighbours->set("Measured Neighbor Cells", Value(cells));
    measurements->set("Srxlev", Value("12 dBm"));
    serving->set("Serving Cell Measurements", Value(measurements));
    top->set("Neighbours", Value(neighbours));
    top->set("Serving Cell", Value(serving));
    PathDictionary nodes;
    VantorelModelNode::makeTreeFromObject(Value(top), nodes);

    const std::string list = "/Neighbours/Measured Neighbor Cells/";
    const std::pair<std::string, std::string> rows[] = {
        {list + "[Physical Cell ID=251]/Filtered RSRP", "RSRP (PCI 251) ▄ -104 dBm"},
        {list + "[Physical Cell ID=17]/Filtered RSRP", "RSRP (PCI 17) ▄ -98.5 dBm"},
        {list + "[#1 Filtered RSRP]/Filtered RSRP", "RSRP (strongest: PCI 17) ▄ -98.5 dBm"},
        {list + "[#2 Filtered RSRP]/Physical Cell ID", "Physical Cell ID (2nd strongest: PCI 251) ▄ 251"},
        {list + "0/Filtered RSRP", "0/RSRP (PCI 251) ▄ -104 dBm"},
        {list + "[Physical Cell ID=99]/Filtered RSRP", "RSRP (PCI 99)   (not in the display)"},
        {"/Serving Cell/Serving Cell Measurements/Srxlev", "Srxlev ▄ 12 dB"},
    };
    for (const auto& [key, line] : rows) {
        Sparkline sparkline(key);
        sparkline.sample(nodes);
        EXPECT_EQ(sparkline.line(200), line) << key;
    }
}
