// Tests for the signal plot window: the shown ten minutes of each key, a gap breaking its line, marks, scrolling back, one axis per unit, the CSV export.
#include "App/SignalPlotWindow.h"

#include "Model/SignalSampler.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PaneTestSupport.h"

#include <QChart>
#include <QFile>
#include <QLegend>
#include <QLegendMarker>
#include <QLineSeries>
#include <QScrollBar>
#include <QTemporaryDir>
#include <QValueAxis>
#include <gtest/gtest.h>

using namespace vantorel;
using panetest::dict;

TEST(SignalPlotWindow, ShowsTheNewestTenMinutesOfEachKeyWithItsMarksScrollsBackAndExportsTheSession) {
    SignalSampler sampler;
    sampler.setKeys({"/Cell/RSRP", "/Cell/Load", "/Cell/Late"});
    SignalPlotWindow plot(sampler);
    const int64_t t0 = 1'700'000'000'000;
    for (int i = 0; i <= 600; ++i) {  // 20 minutes, a tick every 2 s; the technology changes at 15 minutes
        PathDictionary paths;
        const std::string rsrp = "-" + std::to_string(80 + i % 30) + ".50 dBm";
        VantorelModelNode::makeTreeFromObject(
            dict({{"Cell", dict({{"RSRP", rsrp.c_str()}, {"Load", i % 100 == 50 ? "Unknown" : "40 %"}, {"Late", "-"}})}}),
            paths);
        sampler.sample(t0 + i * 2000, i < 450 ? "A" : "B", paths);
    }
    plot.refresh();
    EXPECT_EQ(plot.spanEnd(), t0 + 1'200'000);  // following the newest
    ASSERT_TRUE(plot.seriesOf("/Cell/RSRP") && plot.seriesOf("/Cell/Load"));
    EXPECT_EQ(plot.seriesOf("/Cell/RSRP")->count(), 302);  // the span and one point before it
    EXPECT_EQ(plot.seriesOf("/Cell/RSRP")->at(301), QPointF(double(t0 + 1'200'000), -80.5));
    EXPECT_NE(plot.seriesOf("/Cell/RSRP")->attachedAxes(), plot.seriesOf("/Cell/Load")->attachedAxes());
    EXPECT_EQ(plot.seriesOf("/Cell/RSRP")->name(), "RSRP  -80.5 dBm");  // the legend's latest reading
    EXPECT_EQ(plot.shownMarks(), std::vector<QString>{"\u2192 B"});
    EXPECT_EQ(plot.seriesOf("/Cell/Late"), nullptr) << "a key that never had a value";

    plot.scrollBar()->setValue(0);
    EXPECT_EQ(plot.spanStart(), t0);
    EXPECT_TRUE(plot.shownMarks().empty());
    EXPECT_EQ(plot.seriesOf("/Cell/Load")->count(), 50);  // up to its first gap
    EXPECT_EQ(plot.piecesOf("/Cell/Load").size(), 4u);   // broken at ticks 50, 150 and 250
    plot.refresh();
    EXPECT_EQ(plot.spanStart(), t0);  // a refresh leaves a scrolled-back view where it is
    plot.scrollBar()->setValue(60);
    EXPECT_EQ(plot.spanStart(), t0 + 60'000);
    EXPECT_EQ(plot.seriesOf("/Cell/RSRP")->at(0).x(), double(t0 + 58'000));

    QTemporaryDir dir;
    std::string error;
    ASSERT_TRUE(plot.exportCsv(dir.filePath("signal.csv"), &error)) << error;
    QFile csv(dir.filePath("signal.csv"));
    ASSERT_TRUE(csv.open(QIODevice::ReadOnly));
    const QList<QByteArray> lines = csv.readAll().split('\n');
    EXPECT_EQ(lines.front().trimmed(), "time,/Cell/RSRP,/Cell/Load,/Cell/Late");
    EXPECT_EQ(lines.size(), 603);  // header, 601 rows, the empty text after the last line end
    EXPECT_FALSE(plot.exportCsv(dir.filePath("no/such/dir/signal.csv"), &error));
}

TEST(SignalPlotWindow, AMarkIsLabelledWithWhatItChangedTo) {
    const std::vector<std::pair<std::string, QString>> rows = {
        {"Physical Cell ID 301 \u2192 17, Download Frequency 6300 \u2192 6400", "\u2192 17"},
        {"LTE \u2192 UTRAN (TD-SCDMA)", "\u2192 UTRAN (TD-SCDMA)"},
        {"no arrow in this one at all", "no arrow in "},
    };
    for (const auto& [text, label] : rows) EXPECT_EQ(SignalPlotWindow::shortMarkText(text), label) << text;
}

TEST(SignalPlotWindow, ACrowdedLegendKeepsTheLinesThatHaveAReadingNow) {
    SignalSampler sampler;
    std::vector<std::string> keys;
    for (int k = 0; k < 40; ++k) keys.push_back("/Cells/C" + std::to_string(k));
    sampler.setKeys(keys);
    SignalPlotWindow plot(sampler);
    panetest::showAt(plot, 900, 420);
    for (int i = 0; i < 3; ++i) {  // every cell reads at first; at the last tick only the first five
        auto cells = Dictionary::create();
        for (size_t k = 0; k < keys.size(); ++k) cells->set("C" + std::to_string(k), Value(i < 2 || k < 5 ? "-90 dBm" : "-"));
        PathDictionary paths;
        VantorelModelNode::makeTreeFromObject(dict({{"Cells", Value(cells)}}), paths);
        sampler.sample(1'700'000'000'000 + i * 2000, "LTE", paths);
        plot.refresh();
        panetest::settle();
    }
    int listed = 0;
    for (size_t k = 0; k < keys.size(); ++k) {
        const bool visible = plot.chart()->legend()->markers(plot.seriesOf(keys[k])).front()->isVisible();
        listed += visible;
        if (k < 5) EXPECT_TRUE(visible) << keys[k];
    }
    EXPECT_EQ(listed, 5) << "the cells without a reading leave the legend";
}

// Axes and legend take units from the catalogue: LTE's Srxlev ("37 dBm" on the display) is a
// dB margin beside RSRQ, not a power beside RSRP; GSM's "36 dBm" RSSI is RxLev, a level;
// TD-SCDMA's RSCP fraction is drawn in dBm.
TEST(SignalPlotWindow, PutsEachValueOnTheAxisOfItsCatalogueUnit) {
    const struct {
        const char* technology;
        std::vector<std::pair<const char*, const char*>> leaves;  // under "/Serving Cell/M"
        const char* key;
        QString axis, legend;
    } rows[] = {
        {kTSLogChannelTechnology_Morvek_LTE,
         {{"Measured RSRP", "-87.75 dBm"}, {"Measured RSRQ", "-12.50 dB"}, {"Srxlev", "37 dBm"}},
         "/Serving Cell/Serving Cell Measurements/Srxlev", "signal quality, margin (dB)", "Srxlev  37 dB"},
        {kTSLogChannelTechnology_Morvek_LTE, {{"Measured RSRP", "-87.75 dBm"}, {"Srxlev", "37 dBm"}},
         "/Serving Cell/Serving Cell Measurements/Measured RSRP", "received power (dBm)", "RSRP  -87.75 dBm"},
        {kTSLogChannelTechnology_Morvek_GSM, {{"RSSI", "36 dBm"}}, "/Serving Cell/GSM Serving Cell/RSSI", "level",
         "RxLev  36 (level)"},
        {kTSLogChannelTechnology_Morvek_UTRAN2, {{"Filter RSCP", "0.183594"}}, "/Neighbours/Neighbor Cell List/0/Filter RSCP",
         "received power (dBm)", "RSCP  -69 dBm"},
        {"", {{"Load", "40 %"}}, "/Cell/Load", "%", "Load  40 %"},  // not catalogued: the display's unit
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.key);
        SignalSampler sampler;
        std::vector<std::string> keys;
        const std::string key = row.key;
        const std::string parent = key.substr(0, key.rfind('/') + 1);
        for (const auto& [name, value] : row.leaves) keys.push_back(parent + name);
        sampler.setKeys(keys);
        SignalPlotWindow plot(sampler);
        // The tree: the key's parents as nested dictionaries holding the leaves.
        auto leaves = Dictionary::create();
        for (const auto& [name, value] : row.leaves) leaves->set(name, Value(value));
        Value tree(leaves);
        const QStringList names = QString::fromStdString(parent).split('/', Qt::SkipEmptyParts);
        for (auto name = names.rbegin(); name != names.rend(); ++name) {
            auto above = Dictionary::create();
            above->set(name->toStdString(), tree);
            tree = Value(above);
        }
        PathDictionary paths;
        VantorelModelNode::makeTreeFromObject(tree, paths);
        sampler.sample(1'700'000'000'000, row.technology, paths);
        plot.refresh();
        QLineSeries* line = plot.seriesOf(row.key);
        ASSERT_TRUE(line);
        QValueAxis* axis = nullptr;
        for (QAbstractAxis* a : line->attachedAxes())
            if (auto* value = qobject_cast<QValueAxis*>(a)) axis = value;
        ASSERT_TRUE(axis);
        EXPECT_EQ(axis->titleText(), row.axis);
        EXPECT_EQ(line->name(), row.legend);
    }
}
