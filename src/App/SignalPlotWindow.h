// SignalPlotWindow: the plotted signal values over time (the last 10 minutes, scrollable back to the session's start) with handover and technology marks.
#pragma once

#include <QWidget>

#include <cstdint>
#include <functional>
#include <map>
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

// One line per key of the sampler; a vertical axis per unit ("dBm", "dB", "%"), the first on
// the left, the others on the right, so that values on different scales stay readable. The
// view follows the newest values unless the scroll bar was moved back.
class SignalPlotWindow : public QWidget {
    Q_OBJECT
public:
    static constexpr int64_t kSpanMs = 10 * 60 * 1000;
    // The unit a key's current display string shows, or "" (the app asks the display tree).
    using UnitLookup = std::function<std::string(const std::string& key)>;

    SignalPlotWindow(const SignalSampler& sampler, UnitLookup units, QWidget* parent = nullptr);
    ~SignalPlotWindow() override;

    // Reads the sampler again (after a display tick or a new key) and redraws.
    void refresh();
    // Writes the sampler as CSV; false with *error when the file cannot be written.
    bool exportCsv(const QString& path, std::string* error) const;

    // The text after a display string's number ("-95.50 dBm" -> "dBm"), "" without one.
    static std::string unitOf(const std::string& display);

    // The line of a key (nullptr until it has a point) and the marks shown in the span.
    QLineSeries* seriesOf(const std::string& key) const;
    std::vector<QString> shownMarks() const;
    QChart* chart() const { return chart_; }
    QScrollBar* scrollBar() const { return scroll_; }
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
        std::string unit;
    };
    struct MarkItem {
        QLineSeries* line = nullptr;
        QGraphicsRectItem* back = nullptr;        // holds the text
        QGraphicsSimpleTextItem* text = nullptr;
        int64_t timeMs = 0;
    };

    void addLine(const std::string& key);
    QLineSeries* newSeries(QValueAxis* axis, bool inLegend);
    QValueAxis* axisFor(const std::string& unit);
    void draw();
    void placeMarkTexts();
    void exportPressed();
    QString labelOf(const std::string& key) const;

    const SignalSampler& sampler_;
    UnitLookup units_;
    QChart* chart_;
    QChartView* view_;
    QDateTimeAxis* timeAxis_;
    QScrollBar* scroll_;
    QLabel* hint_;
    QPushButton* export_;
    std::map<std::string, Line> lines_;          // by key
    std::map<std::string, QValueAxis*> axes_;    // by unit, in the order made
    std::vector<MarkItem> marks_;                // the pool; those past shownMarks_ are hidden
    std::size_t shownMarks_ = 0;
    int64_t first_ = 0, last_ = 0;               // the session's first and newest time
    int64_t start_ = 0;                          // the shown span's start
    bool following_ = true;                      // the span ends at the newest time
};

}  // namespace vantorel
