// VantorelCell: a pane's row: the key inset 10 from the left, the value flush right or 50 right of the key and scrollable.
#include "App/VantorelCell.h"

#include <QApplication>
#include <QFontMetrics>
#include <QLabel>
#include <QPainter>
#include <QScrollArea>

#include <algorithm>
#include <cmath>

namespace vantorel {

namespace {

// The disclosure indicator: a grey chevron, inset from the row's right edge.
constexpr const char* kDisclosureText = "\u203A";
constexpr int kDisclosureFontSize = 22;
constexpr int kDisclosureInset = 10;

// (height - h) × 0.5 on whole pixels.
int centred(int height, int h) { return int(std::lround((height - h) * 0.5)); }

}  // namespace

VantorelCell::VantorelCell(StyleKeyTag, CellStyle style, std::string reuseIdentifier, QWidget* parent)
    : QWidget(parent), style_(style), reuseIdentifier_(std::move(reuseIdentifier)) {
    key_ = makeLabel(boldFont(), this);
    makeAccessory();
    resize(width(), kRowHeight);
}

VantorelCell::VantorelCell(CellStyle style, std::string reuseIdentifier, QWidget* parent)
    : QWidget(parent), style_(style), reuseIdentifier_(std::move(reuseIdentifier)) {
    view_ = new QScrollArea(this);
    view_->setFrameShape(QFrame::NoFrame);
    // The platform's scroll view has no bars at rest; the row scrolls with a
    // horizontal wheel or touchpad swipe. A vertical wheel has nothing to scroll
    // here and goes on to the table.
    view_->setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
    view_->setVerticalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
    view_->setWidgetResizable(false);
    // Keyboard focus stays with the table, and the row's selection shows through.
    view_->setFocusPolicy(Qt::NoFocus);
    view_->viewport()->setAutoFillBackground(false);
    scrollContent_ = new QWidget;
    scrollContent_->setAutoFillBackground(false);
    key_ = makeLabel(boldFont(), scrollContent_);
    value_ = makeLabel(regularFont(), scrollContent_);
    view_->setWidget(scrollContent_);
    view_->setGeometry(0, 0, width(), kRowHeight - kSeparatorHeight);
    makeAccessory();
    resize(width(), kRowHeight);
}

QLabel* VantorelCell::makeLabel(const QFont& font, QWidget* parent) {
    auto* label = new QLabel(parent);
    label->setFont(font);
    label->setTextFormat(Qt::PlainText);  // display names and values are never markup
    label->setAlignment(Qt::AlignLeft | Qt::AlignVCenter);
    return label;
}

void VantorelCell::makeAccessory() {
    accessory_ = new QLabel(QString::fromUtf8(kDisclosureText), this);
    QFont font = regularFont();
    font.setPixelSize(kDisclosureFontSize);
    accessory_->setFont(font);
    QPalette palette = accessory_->palette();
    palette.setColor(QPalette::WindowText, Qt::gray);
    accessory_->setPalette(palette);
    accessory_->setTextFormat(Qt::PlainText);
    accessory_->adjustSize();
    accessory_->hide();
}

QFont VantorelCell::boldFont() {
    QFont font = QApplication::font();
    font.setPixelSize(kFontSize);
    font.setBold(true);
    return font;
}

QFont VantorelCell::regularFont() {
    QFont font = QApplication::font();
    font.setPixelSize(kFontSize);
    font.setBold(false);
    return font;
}

QSize VantorelCell::measure(const QString& text) {
    return QFontMetrics(boldFont()).size(Qt::TextSingleLine, text);
}

void VantorelCell::setAccessoryType(AccessoryType type) {
    accessoryType_ = type;
    accessory_->setVisible(type == AccessoryType::DisclosureIndicator);
    placeAccessory();
}

void VantorelCell::placeAccessory() {
    const QSize size = accessory_->sizeHint();
    accessory_->setGeometry(width() - kDisclosureInset - size.width(), centred(height(), size.height()), size.width(),
                            size.height());
    accessory_->raise();  // above `view`, which fills the row
}

QSize VantorelCell::scrollExtent() const { return scrollContent_ ? scrollContent_->size() : QSize(); }

void VantorelCell::setLayoutKey() {
    layoutMode_ = LayoutMode::Key;
    const QRect content = rect();
    const QSize k = measure(key_->text());
    key_->setGeometry(content.x() + kKeyInset, centred(content.height(), k.height()), k.width(), k.height());
}

void VantorelCell::setLayoutValue() {
    layoutMode_ = LayoutMode::Full;
    // The base layout: only the accessory has a place of its own.
    placeAccessory();

    const QRect content = rect();
    const int W = content.width();
    const QSize k = measure(key_->text());
    key_->setGeometry(content.x() + kKeyInset, centred(content.height(), k.height()), k.width(), k.height());

    // A drill-down row reused for a leaf has no value label: its value counts as
    // the measure of nothing (deliberate: reuse keeps the cell's kind, see
    // VantorelPaneController::cellForRow).
    const QSize v = value_ ? measure(value_->text()) : QSize(0, 0);
    const int needed = kKeyInset + k.width() + kValueGap + v.width();
    if (value_) {
        // The fit test uses the width only, not the content origin.
        const int vx = needed < W ? W - v.width() : content.x() + kKeyInset + k.width() + kValueGap;
        value_->setGeometry(vx, centred(content.height(), v.height()), v.width(), v.height());
    }
    if (view_) {
        const int extent = W < needed ? W + k.width() + v.width() : W;
        // Above the separator, which the cell paints along its bottom pixel row.
        const int viewHeight = std::max(0, content.height() - kSeparatorHeight);
        scrollContent_->resize(extent, viewHeight);
        view_->setGeometry(content.x(), content.y(), W, viewHeight);
    }
}

void VantorelCell::paintEvent(QPaintEvent*) {
    QPainter painter(this);
    painter.setPen(QColor(200, 199, 204));
    painter.drawLine(kKeyInset, height() - 1, width() - 1, height() - 1);
}

void VantorelCell::resizeEvent(QResizeEvent* event) {
    QWidget::resizeEvent(event);
    switch (layoutMode_) {
        case LayoutMode::Key: setLayoutKey(); break;
        case LayoutMode::Full: setLayoutValue(); break;
        case LayoutMode::None: break;
    }
    placeAccessory();
}

}  // namespace vantorel
