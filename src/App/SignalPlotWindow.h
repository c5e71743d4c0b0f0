// SignalPlotWindow: the plotted signal values over time (the last 10 minutes, scrollable back to the session's start) with handover and technology marks.
#pragma once

#include "Model/SignalCatalogue.h"

#include <QWidget>

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

class QChart;
class QChartView;
class QDateTimeAxis;
class QGraphicsRectItem;
class QGraphicsSimpleTextItem;
class QLabel;
class QLineSeries;
class QPushButton;
class QScrollBar;
class QValueAxis;

namespace vantorel {

class SignalSampler;

// One line per plotted key of the sampler (SignalSampler::plotKeys: the chosen values and a
// line per strong neighbour cell), each in a colour of its own, named by the catalogue's short
// name ("RxLev", "RSRP (PCI 251)"); a vertical axis per unit ("dBm", "dB", "%", or the
// quantity of a unitless one: "level"), titled with the quantities on it ("received power
// (dBm)", "signal quality, margin (dB)"), the first on the left, the others on the right,
// so that values on different scales stay readable. Units and quantities come from
// SignalCatalogue; a key it does not hold goes on the axis of its display string's unit. A line is broken where its key had no value. The view
// ends at the newest values unless the scroll bar was moved back. Marks are dashed vertical
// lines with a short text ("→ 17"), the whole text in their tooltip; a text that would
// overlap the one before it is left out (its line stays).
class SignalPlotWindow : public QWidget {
    Q_OBJECT
public:
    static constexpr int64_t kSpanMs = 10 * 60 * 1000;
    // A line is made once its key has a value, on the axis of its unit.
    explicit SignalPlotWindow(const SignalSampler& sampler, QWidget* parent = nullptr);
    ~SignalPlotWindow() override;

    // Reads the sampler again (after a display tick or a new key) and redraws.
    void refresh();
    // Writes the sampler as CSV; false with *error when the file cannot be written.
    bool exportCsv(const QString& path, std::string* error) const;

    // The line of a key (nullptr until it has a point and a quantity), its pieces after gaps,
    // and the marks shown in the span (their labels as drawn).
    QLineSeries* seriesOf(const std::string& key) const;
    std::vector<QLineSeries*> piecesOf(const std::string& key) const;
    std::vector<QString> shownMarks() const;
    // "→ 17" for "Physical Cell ID 301 → 17, ...": what a mark's line is labelled with.
    static QString shortMarkText(const std::string& text);
    QChart* chart() const { return chart_; }
    QScrollBar* scrollBar() const { return scroll_; }
    // The value axis a key's line is drawn against (nullptr without a line).
    QValueAxis* axisOf(const std::string& key) const;
    QPushButton* exportButton() const { return export_; }
    // The shown span's start and end (ms since 1970).
    int64_t spanStart() const { return start_; }
    int64_t spanEnd() const { return start_ + kSpanMs; }

private:
    struct Line {
        QLineSeries* series = nullptr;       // the first piece, and the legend's entry
        std::vector<QLineSeries*> pieces;    // the pieces after a gap, in the same colour
        QValueAxis* axis = nullptr;
        QString label;
        SignalQuantity quantity;
    };
    struct Axis {
        QValueAxis* axis = nullptr;
        std::vector<std::string> quantities;  // of its catalogued lines, in the order added
        std::string unit;
    };
    struct MarkItem {
        QLineSeries* line = nullptr;
        QGraphicsRectItem* back = nullptr;        // holds the text
        QGraphicsSimpleTextItem* text = nullptr;
        int64_t timeMs = 0;
        QString whole;
    };

    void addLine(const std::string& key, const SignalQuantity& quantity);
    QLineSeries* newSeries(const Line& line, bool inLegend);
    int legendRoom() const;  // how many entries the legend's column holds
    QValueAxis* axisFor(const SignalQuantity& quantity);
    void draw();
    void placeMarkTexts();
    void exportPressed();
    QString labelOf(const std::string& key) const;

    const SignalSampler& sampler_;
    QChart* chart_;
    QChartView* view_;
    QDateTimeAxis* timeAxis_;
    QScrollBar* scroll_;
    QLabel* hint_;
    QPushButton* export_;
    std::map<std::string, Line> lines_;          // by key
    std::map<std::string, Axis> axes_;           // by unit label (SignalQuantity::unitLabel)
    std::vector<MarkItem> marks_;                // the pool; those past shownMarks_ are hidden
    std::size_t shownMarks_ = 0;
    int64_t first_ = 0, last_ = 0;               // the session's first and newest time
    int64_t start_ = 0;                          // the shown span's start
    bool following_ = true;                      // the span ends at the newest time
    std::size_t colours_ = 0;                    // lines coloured so far
};

}  // namespace vantorel
