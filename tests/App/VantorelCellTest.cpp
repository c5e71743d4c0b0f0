// Tests for VantorelCell's value row: where the value goes beside its key, the scroll extent, and the layout following the row's width.
#include "App/VantorelCell.h"

#include "PaneTestSupport.h"

#include <QLabel>
#include <QScrollArea>
#include <QScrollBar>
#include <gtest/gtest.h>

#include <memory>

using namespace vantorel;
using namespace vantorel::panetest;

namespace {

std::unique_ptr<VantorelCell> valueRow(const QString& key, const QString& value, int width) {
    auto cell = std::make_unique<VantorelCell>(VantorelCell::CellStyle::Value1, VantorelCell::kReuseIdentifier);
    cell->key()->setText(key);
    cell->value()->setText(value);
    cell->resize(width, VantorelCell::kRowHeight);
    cell->show();
    cell->setLayoutValue();
    settle();
    return cell;
}

}  // namespace

TEST(VantorelCell, AValueFitsFlushRightOrStarts50RightOfItsKeyAndScrollsAndFollowsTheRowsWidth) {
    const QString longValue = "A value far too long to fit beside its key in one row of four hundred points";
    const int kw = VantorelCell::measure("Band").width();
    const int fill = 10 + kw + 50 + VantorelCell::measure("GSM 1900").width();
    const struct {
        QString key, value;
        int width;
        bool fits;  // 10 + key + 50 + value < width, both measured in the bold font
    } rows[] = {
        {"MCC", "310", 400, true},
        {"Cell Identity", longValue, 400, false},
        {"Band", "GSM 1900", fill, false},  // exactly filling: not less, so placed after the key
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.value.toStdString());
        auto cell = valueRow(row.key, row.value, row.width);
        const QSize k = VantorelCell::measure(row.key);
        const QSize v = VantorelCell::measure(row.value);
        EXPECT_EQ(cell->key()->geometry(), QRect(10, (50 - k.height() + 1) / 2, k.width(), k.height()));
        EXPECT_EQ(cell->value()->x(), row.fits ? row.width - v.width() : 10 + k.width() + 50);
        const int extent = 10 + k.width() + 50 + v.width() > row.width ? row.width + k.width() + v.width() : row.width;
        EXPECT_EQ(cell->scrollExtent().width(), extent);
        EXPECT_EQ(cell->view()->horizontalScrollBar()->maximum(), extent - row.width);
    }
    auto cell = valueRow("RSSI", "-71 dBm", 400);  // a narrower row lays out again
    cell->resize(300, VantorelCell::kRowHeight);
    settle();
    EXPECT_EQ(cell->value()->x(), 300 - VantorelCell::measure("-71 dBm").width());
}
