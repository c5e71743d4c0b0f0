// VantorelCell: one row of a pane, a drill-down row or a value row, key at the left, value flush right or scrolled.
#pragma once

#include <QWidget>

#include <string>

class QLabel;
class QScrollArea;

namespace vantorel {

// The platform's table cell stands behind this class: the cell itself is the row's
// content area (its rect, origin 0,0), and "points" are pixels.
class VantorelCell : public QWidget {
    Q_OBJECT
public:
    static constexpr const char* kReuseIdentifier = "VantorelPaneControllerCell";
    static constexpr int kRowHeight = 50;
    static constexpr int kKeyInset = 10;     // the key's left edge within the content area
    static constexpr int kValueGap = 50;     // a long value starts this far right of its key
    static constexpr int kFontSize = 15;     // bold key, regular value (pixels)
    static constexpr int kSeparatorHeight = 1;

    // The platform's row styles; every row is made with the value style.
    enum class CellStyle { Default, Value1 };
    enum class AccessoryType { None, DisclosureIndicator };
    // What the cell was made as; a reused cell keeps it, as the platform's cells do.
    enum class Kind { DrillDown, Value };

    // Selects the constructor that stands for `initWithStyleKey:reuseIdentifier:`.
    struct StyleKeyTag {};
    static constexpr StyleKeyTag withStyleKey{};

    // `initWithStyleKey:reuseIdentifier:`: a drill-down row, `key` only, placed
    // directly in the content area; `value` and `view` are null.
    VantorelCell(StyleKeyTag, CellStyle style, std::string reuseIdentifier, QWidget* parent = nullptr);
    // `initWithStyle:reuseIdentifier:`: a value row, `key` and `value` inside `view`,
    // the horizontally scrollable container that fills the row.
    VantorelCell(CellStyle style, std::string reuseIdentifier, QWidget* parent = nullptr);

    QLabel* key() const { return key_; }
    QLabel* value() const { return value_; }   // nullptr in a drill-down row
    QScrollArea* view() const { return view_; } // nullptr in a drill-down row
    Kind kind() const { return view_ ? Kind::Value : Kind::DrillDown; }
    CellStyle cellStyle() const { return style_; }
    const std::string& reuseIdentifier() const { return reuseIdentifier_; }

    void setAccessoryType(AccessoryType type);
    AccessoryType accessoryType() const { return accessoryType_; }
    // The disclosure indicator ("›" at the right edge), visible iff the accessory is set.
    QLabel* accessoryView() const { return accessory_; }

    // The scroll extent of `view` (its scrolled content's size); empty without `view`.
    QSize scrollExtent() const;

    // The drill-down row's layout (the key alone) and the value row's (key, value and
    // scroll extent). Each is run again whenever the row changes size, so that the
    // arithmetic always uses the row's current content area.
    void setLayoutKey();
    void setLayoutValue();

    // Bold system 15 pt (key, and every measurement) and system 15 pt (value).
    static QFont boldFont();
    static QFont regularFont();
    // A text's size as the rows measure it: in the bold 15 pt font, values included.
    static QSize measure(const QString& text);

protected:
    void resizeEvent(QResizeEvent* event) override;
    // The row separator: a hairline along the bottom, from the key's inset. The value
    // row's scroll view stops one pixel above it so that it stays visible.
    void paintEvent(QPaintEvent* event) override;

private:
    enum class LayoutMode { None, Key, Full };

    void makeAccessory();
    void placeAccessory();
    static QLabel* makeLabel(const QFont& font, QWidget* parent);

    CellStyle style_;
    std::string reuseIdentifier_;
    QLabel* key_ = nullptr;
    QLabel* value_ = nullptr;
    QScrollArea* view_ = nullptr;
    QWidget* scrollContent_ = nullptr;  // what `view` scrolls; holds key and value
    QLabel* accessory_ = nullptr;
    AccessoryType accessoryType_ = AccessoryType::None;
    LayoutMode layoutMode_ = LayoutMode::None;
};

}  // namespace vantorel
