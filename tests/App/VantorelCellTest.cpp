// Tests for VantorelCell (Part 1.2): the two row kinds, their fonts, and the setLayoutKey / setLayout arithmetic.
#include "App/VantorelCell.h"

#include "PaneTestSupport.h"

#include <QLabel>
#include <QScrollArea>
#include <QScrollBar>
#include <QWheelEvent>

#include <gtest/gtest.h>

#include <memory>

using namespace vantorel;
using namespace vantorel::panetest;

namespace {

constexpr int kWidth = 400;

std::unique_ptr<VantorelCell> valueRow(const QString& key, const QString& value, int width = kWidth) {
    auto cell = std::make_unique<VantorelCell>(VantorelCell::CellStyle::Value1, VantorelCell::kReuseIdentifier);
    cell->key()->setText(key);
    cell->value()->setText(value);
    cell->resize(width, VantorelCell::kRowHeight);
    cell->show();
    cell->setLayout();
    settle();
    return cell;
}

std::unique_ptr<VantorelCell> drillDownRow(const QString& key, int width = kWidth) {
    auto cell = std::make_unique<VantorelCell>(VantorelCell::withStyleKey, VantorelCell::CellStyle::Value1,
                                               VantorelCell::kReuseIdentifier);
    cell->key()->setText(key);
    cell->setAccessoryType(VantorelCell::AccessoryType::DisclosureIndicator);
    cell->resize(width, VantorelCell::kRowHeight);
    cell->show();
    cell->setLayoutKey();
    settle();
    return cell;
}

// (height − h) × 0.5, which the label's whole-pixel frame rounds.
void expectCentred(const QLabel* label, int h) {
    EXPECT_NEAR(label->y(), (VantorelCell::kRowHeight - h) * 0.5, 0.5);
}

void sendHorizontalWheel(QWidget* widget, int delta) {
    const QPointF pos(widget->width() / 2.0, widget->height() / 2.0);
    QWheelEvent wheel(pos, widget->mapToGlobal(pos), QPoint(), QPoint(delta, 0), Qt::NoButton, Qt::NoModifier,
                      Qt::NoScrollPhase, false);
    QApplication::sendEvent(widget, &wheel);
}

}  // namespace

TEST(VantorelCell, DrillDownRowHoldsOnlyABoldKeyDirectlyInTheContentArea) {
    auto cell = drillDownRow("Serving Cell");
    EXPECT_EQ(cell->kind(), VantorelCell::Kind::DrillDown);
    EXPECT_EQ(cell->reuseIdentifier(), "VantorelPaneControllerCell");
    EXPECT_EQ(cell->value(), nullptr);
    EXPECT_EQ(cell->view(), nullptr);
    EXPECT_EQ(cell->key()->parentWidget(), cell.get());
    EXPECT_TRUE(cell->key()->font().bold());
    EXPECT_EQ(cell->key()->font().pixelSize(), 15);
    EXPECT_TRUE(cell->key()->alignment() & Qt::AlignLeft);
}

TEST(VantorelCell, ValueRowHoldsBoldKeyAndRegularValueInsideTheScrollableView) {
    auto cell = valueRow("RSSI", "-71 dBm");
    EXPECT_EQ(cell->kind(), VantorelCell::Kind::Value);
    ASSERT_NE(cell->view(), nullptr);
    ASSERT_NE(cell->value(), nullptr);
    EXPECT_EQ(cell->key()->parentWidget(), cell->view()->widget());
    EXPECT_EQ(cell->value()->parentWidget(), cell->view()->widget());
    EXPECT_TRUE(cell->key()->font().bold());
    EXPECT_EQ(cell->key()->font().pixelSize(), 15);
    EXPECT_FALSE(cell->value()->font().bold());
    EXPECT_EQ(cell->value()->font().pixelSize(), 15);
    // `view` fills the row: content origin, W × 50.
    EXPECT_EQ(cell->view()->geometry(), QRect(0, 0, kWidth, 50));
}

TEST(VantorelCell, SetLayoutKeyPlacesTheKeyTenPointsInAndCentredVertically) {
    auto cell = drillDownRow("Neighbour Cells");
    const QSize k = VantorelCell::measure("Neighbour Cells");
    EXPECT_EQ(k, QFontMetrics(VantorelCell::boldFont()).size(Qt::TextSingleLine, "Neighbour Cells"));
    EXPECT_EQ(cell->key()->x(), 10);
    EXPECT_EQ(cell->key()->size(), k);
    expectCentred(cell->key(), k.height());
}

TEST(VantorelCell, DisclosureIndicatorSitsAtTheRightOfADrillDownRow) {
    auto cell = drillDownRow("MM Info");
    ASSERT_TRUE(cell->accessoryView()->isVisible());
    EXPECT_EQ(cell->accessoryView()->text(), QString::fromUtf8("\u203A"));
    EXPECT_GT(cell->accessoryView()->x(), cell->key()->geometry().right());
    EXPECT_LE(cell->accessoryView()->geometry().right(), kWidth - 1);
    cell->setAccessoryType(VantorelCell::AccessoryType::None);
    EXPECT_FALSE(cell->accessoryView()->isVisible());
}

TEST(VantorelCell, ShortValueSitsFlushWithTheRowsRightEdge) {
    auto cell = valueRow("MCC", "310");
    const QSize k = VantorelCell::measure("MCC");
    const QSize v = VantorelCell::measure("310");  // measured in the bold font, as stated
    ASSERT_LT(10 + k.width() + 50 + v.width(), kWidth);
    EXPECT_EQ(cell->key()->geometry(), QRect(10, cell->key()->y(), k.width(), k.height()));
    expectCentred(cell->key(), k.height());
    EXPECT_EQ(cell->value()->x(), kWidth - v.width());
    EXPECT_EQ(cell->value()->size(), v);
    expectCentred(cell->value(), v.height());
    // Nothing to scroll: the extent is the row's width, 50 high.
    EXPECT_EQ(cell->scrollExtent(), QSize(kWidth, 50));
    EXPECT_EQ(cell->view()->horizontalScrollBar()->maximum(), 0);
}

TEST(VantorelCell, LongValueMovesRightOfItsKeyByExactly50PointsAndScrollsHorizontally) {
    const QString key = "Cell Identity";
    const QString value = "A value far too long to fit beside its key in one row of four hundred points";
    auto cell = valueRow(key, value);
    const QSize k = VantorelCell::measure(key);
    const QSize v = VantorelCell::measure(value);
    ASSERT_GE(10 + k.width() + 50 + v.width(), kWidth);
    EXPECT_EQ(cell->value()->x() - cell->key()->geometry().right() - 1, 50);
    EXPECT_EQ(cell->value()->x(), 10 + k.width() + 50);
    EXPECT_EQ(cell->value()->size(), v);
    // Scroll extent W + kw + vw wide, 50 high; the frame stays W × 50.
    EXPECT_EQ(cell->scrollExtent(), QSize(kWidth + k.width() + v.width(), 50));
    EXPECT_EQ(cell->view()->geometry(), QRect(0, 0, kWidth, 50));
    QScrollBar* bar = cell->view()->horizontalScrollBar();
    EXPECT_EQ(bar->maximum(), k.width() + v.width());
    // A horizontal wheel (or touchpad swipe) scrolls the value into view.
    sendHorizontalWheel(cell->view()->viewport(), -120);
    EXPECT_GT(bar->value(), 0);
    bar->setValue(bar->maximum());
    settle();
    const QPoint valueRight = cell->value()->mapTo(cell.get(), QPoint(v.width(), 0));
    EXPECT_LE(valueRight.x(), kWidth);
}

TEST(VantorelCell, ValueThatExactlyFillsTheRowGetsNoExtraScrollExtent) {
    // 10 + kw + 50 + vw == W: W is not less than the sum, so the extent stays W
    // (both placements of the value agree on this boundary).
    const QString key = "Band";
    const QString value = "GSM 1900";
    const QSize k = VantorelCell::measure(key);
    const QSize v = VantorelCell::measure(value);
    const int width = 10 + k.width() + 50 + v.width();
    auto cell = valueRow(key, value, width);
    EXPECT_EQ(cell->value()->x(), 10 + k.width() + 50);
    EXPECT_EQ(cell->scrollExtent(), QSize(width, 50));
}

TEST(VantorelCell, LayoutFollowsTheRowWhenItsWidthChanges) {
    const QString value = "-71 dBm";
    auto cell = valueRow("RSSI", value);
    const QSize v = VantorelCell::measure(value);
    cell->resize(300, VantorelCell::kRowHeight);
    settle();
    EXPECT_EQ(cell->value()->x(), 300 - v.width());
    EXPECT_EQ(cell->view()->geometry(), QRect(0, 0, 300, 50));
    EXPECT_EQ(cell->scrollExtent(), QSize(300, 50));
}

TEST(VantorelCell, DrillDownRowLaidOutAsAValueRowPlacesOnlyItsKey) {
    // What happens to a drill-down row reused for a leaf (Part 1.2): no value label,
    // no view; setLayout still places the key.
    auto cell = drillDownRow("Leaf Name");
    cell->setAccessoryType(VantorelCell::AccessoryType::None);
    cell->key()->setText("Leaf Name");
    cell->setLayout();
    const QSize k = VantorelCell::measure("Leaf Name");
    EXPECT_EQ(cell->key()->geometry(), QRect(10, cell->key()->y(), k.width(), k.height()));
    EXPECT_EQ(cell->value(), nullptr);
    EXPECT_EQ(cell->scrollExtent(), QSize());
}

TEST(VantorelCell, TextsAreShownAsPlainText) {
    auto cell = valueRow("<b>key</b>", "<i>value</i>");
    EXPECT_EQ(cell->key()->textFormat(), Qt::PlainText);
    EXPECT_EQ(cell->value()->textFormat(), Qt::PlainText);
    EXPECT_EQ(cell->key()->size(), VantorelCell::measure("<b>key</b>"));
}
