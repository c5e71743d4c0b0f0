// SignalPlotWindow: Qt Charts lines of the sampler's series, one value axis per unit (SignalCatalogue), a time axis scrolled by a scroll bar, marks as labelled vertical lines.
#include "App/SignalPlotWindow.h"

#include "Model/DisplayPath.h"
#include "Model/SignalSampler.h"
#include "Monitor/SignalCsvWriter.h"

#include <QChart>
#include <QChartView>
#include <QCursor>
#include <QDateTimeAxis>
#include <QFileDialog>
#include <QGraphicsRectItem>
#include <QGraphicsSimpleTextItem>
#include <QHBoxLayout>
#include <QLabel>
#include <QLegendMarker>
#include <QLineSeries>
#include <QMessageBox>
#include <QPushButton>
#include <QSaveFile>
#include <QScrollBar>
#include <QToolTip>
#include <QValueAxis>
#include <QVBoxLayout>

#include <algorithm>
#include <cmath>
#include <limits>

namespace vantorel {

namespace {

QColor markColour(SignalSeries::Mark::Kind kind) {
    return kind == SignalSeries::Mark::Kind::TechnologyChange ? QColor(190, 40, 40) : QColor(110, 110, 110);
}

// Twelve colours that tell apart on white and from each other, given to lines in the order
// they are made; the chart theme's five would repeat on an LTE plot's first seven lines.
const QColor& lineColour(std::size_t index) {
    static const QColor colours[] = {
        QColor(31, 119, 180), QColor(255, 127, 14), QColor(44, 160, 44),  QColor(214, 39, 40),
        QColor(148, 103, 189), QColor(140, 86, 75), QColor(227, 119, 194), QColor(23, 190, 207),
        QColor(188, 189, 34),  QColor(0, 0, 128),  QColor(128, 128, 0),   QColor(0, 128, 128)};
    return colours[index % (sizeof colours / sizeof colours[0])];
}

}  // namespace

SignalPlotWindow::SignalPlotWindow(const SignalSampler& sampler, QWidget* parent)
    : QWidget(parent, Qt::Window),
      sampler_(sampler),
      chart_(new QChart),
      view_(new QChartView(chart_, this)),
      timeAxis_(new QDateTimeAxis),
      scroll_(new QScrollBar(Qt::Horizontal, this)),
      hint_(new QLabel(this)),
      export_(new QPushButton(tr("Export CSV\u2026"), this)) {
    setWindowTitle(tr("Vantorel \u2013 Signal"));
    resize(900, 520);
    chart_->legend()->setAlignment(Qt::AlignRight);  // a column: the names stay whole
    chart_->setMargins(QMargins(4, 4, 4, 4));
    timeAxis_->setFormat("HH:mm:ss");
    timeAxis_->setTickCount(6);
    timeAxis_->setTitleText(tr("time"));
    chart_->addAxis(timeAxis_, Qt::AlignBottom);
    view_->setRenderHint(QPainter::Antialiasing);
    connect(chart_, &QChart::plotAreaChanged, this, [this] { placeMarkTexts(); });

    scroll_->setSingleStep(10);
    connect(scroll_, &QScrollBar::valueChanged, this, [this](int value) {
        following_ = value >= scroll_->maximum();
        draw();
    });
    connect(export_, &QPushButton::clicked, this, [this] { exportPressed(); });

    auto* bottom = new QHBoxLayout;
    bottom->addWidget(hint_, 1);
    bottom->addWidget(export_);
    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(6, 6, 6, 6);
    layout->addWidget(view_, 1);
    layout->addWidget(scroll_);
    layout->addLayout(bottom);
    refresh();
}

SignalPlotWindow::~SignalPlotWindow() = default;

namespace {

// The key's name as the display shows it: a list entry picked by its cell or rank is named by
// them ("Filtered RSRP (PCI 251)"); otherwise the last path component, with as many parents
// as it takes to tell it from the other keys ("Filtered RSRP [2]" for a list's third entry,
// "Parent › Name").
QString displayLabel(const std::string& key, const std::vector<std::string>& keys) {
    if (key.find("/[") != std::string::npos) return QString::fromStdString(DisplayPath::label(key));
    auto tail = [](const std::string& path, int parts) {
        std::size_t at = path.size();
        for (int i = 0; i < parts && at != std::string::npos && at > 0; ++i) at = path.rfind('/', at - 1);
        return at == std::string::npos ? path : path.substr(at + 1);
    };
    for (int parts = 1; parts < 6; ++parts) {
        const std::string mine = tail(key, parts);
        if (std::any_of(keys.begin(), keys.end(), [&](const std::string& k) { return k != key && tail(k, parts) == mine; }))
            continue;
        QStringList names = QString::fromStdString(mine).split('/');
        const QString last = names.takeLast();
        QStringList shown;
        QStringList indices;
        for (const QString& name : names) {
            bool index = false;
            name.toInt(&index);
            (index ? indices : shown).append(index ? "[" + name + "]" : name);
        }
        shown.append(last);
        return (shown.join(QStringLiteral(" \u203A ")) + " " + indices.join("")).trimmed();
    }
    return QString::fromStdString(key);
}

// The same with the leaf's name replaced by the catalogue's short name ("RSSI" of the GSM
// serving cell is "RxLev").
QString namedLabel(const std::string& key, const std::vector<std::string>& keys, const std::optional<SignalQuantity>& quantity) {
    QString label = displayLabel(key, keys);
    if (!quantity || !quantity->catalogued()) return label;
    const QString leaf = QString::fromStdString(SignalCatalogue::components(key).back());
    const qsizetype at = label.lastIndexOf(leaf);
    return at < 0 ? label : label.replace(at, leaf.size(), QString::fromStdString(quantity->name));
}

}  // namespace

QString SignalPlotWindow::labelOf(const std::string& key) const {
    // The short name, unless another line would read the same (a serving cell's "RSRP" and a
    // neighbour list's first "Filtered RSRP"): then the display's names.
    const std::vector<std::string> keys = sampler_.plotKeys();
    const QString named = namedLabel(key, keys, sampler_.quantity(key));
    for (const std::string& other : keys)
        if (other != key && namedLabel(other, keys, sampler_.quantity(other)) == named) return displayLabel(key, keys);
    return named;
}

QValueAxis* SignalPlotWindow::axisFor(const SignalQuantity& quantity) {
    Axis& slot = axes_[quantity.unitLabel()];
    if (!slot.axis) {
        slot.axis = new QValueAxis;
        slot.axis->setLabelFormat("%.4g");
        slot.unit = quantity.unit;
        chart_->addAxis(slot.axis, axes_.size() == 1 ? Qt::AlignLeft : Qt::AlignRight);
    }
    // "received power, threshold (dBm)"; a key the catalogue does not hold adds its unit alone.
    if (quantity.catalogued() &&
        std::find(slot.quantities.begin(), slot.quantities.end(), quantity.quantity) == slot.quantities.end())
        slot.quantities.push_back(quantity.quantity);
    QStringList names;
    for (const std::string& name : slot.quantities) names.append(QString::fromStdString(name));
    const QString unit = QString::fromStdString(slot.unit);
    QString title = names.join(QStringLiteral(", "));
    if (!unit.isEmpty()) title = title.isEmpty() ? unit : title + " (" + unit + ")";
    slot.axis->setTitleText(title.isEmpty() ? tr("value") : title);
    return slot.axis;
}

QValueAxis* SignalPlotWindow::axisOf(const std::string& key) const {
    auto it = lines_.find(key);
    return it == lines_.end() ? nullptr : it->second.axis;
}

void SignalPlotWindow::addLine(const std::string& key, const SignalQuantity& quantity) {
    Line line;
    line.quantity = quantity;
    line.axis = axisFor(quantity);
    line.label = labelOf(key);
    line.series = newSeries(line, true);
    // A neighbour cell's line is thinner than the serving cell's values.
    line.series->setPen(QPen(lineColour(colours_++), key.find("/[") != std::string::npos ? 1.2 : 2.2));
    line.series->setName(line.label);
    lines_[key] = line;
}

QLineSeries* SignalPlotWindow::newSeries(const Line& line, bool inLegend) {
    auto* series = new QLineSeries;
    chart_->addSeries(series);
    series->attachAxis(timeAxis_);
    series->attachAxis(line.axis);
    if (!inLegend)
        for (QLegendMarker* marker : chart_->legend()->markers(series)) marker->setVisible(false);
    // Many cell lines share a colour and some have no legend entry: the pointer names the line.
    connect(series, &QLineSeries::hovered, this,
            [label = line.label, quantity = line.quantity](const QPointF& point, bool entered) {
                if (!entered) return QToolTip::hideText();
                QToolTip::showText(QCursor::pos(),
                                   QStringLiteral("%1\n%2 at %3")
                                       .arg(label, QString::fromStdString(quantity.reading(point.y())),
                                            QDateTime::fromMSecsSinceEpoch(qint64(point.x())).toString("HH:mm:ss")));
            });
    return series;
}

int SignalPlotWindow::legendRoom() const {
    const qreal height = chart_->legend()->geometry().height();
    if (height <= 0) return std::numeric_limits<int>::max();  // not laid out yet
    // An entry is a line of the legend's font with a few pixels of margin above and below.
    return std::max(1, int(height / (QFontMetrics(chart_->legend()->font()).height() + 6)));
}

void SignalPlotWindow::refresh() {
    const SignalSeries& series = sampler_.series();
    first_ = std::numeric_limits<int64_t>::max();
    last_ = std::numeric_limits<int64_t>::min();
    for (const std::string& key : sampler_.plotKeys()) {
        const auto& points = series.points(key);
        if (points.empty()) continue;
        // A line is made once its key shows a value and what it is is known.
        if (!lines_.count(key))
            if (const std::optional<SignalQuantity> quantity = sampler_.quantity(key)) addLine(key, *quantity);
        first_ = std::min(first_, points.front().timeMs);
        last_ = std::max(last_, points.back().timeMs);
    }
    // Lines of cells the sampler no longer keeps go.
    const std::vector<std::string> plotted = sampler_.plotKeys();
    for (auto it = lines_.begin(); it != lines_.end();) {
        if (std::find(plotted.begin(), plotted.end(), it->first) != plotted.end()) {
            ++it;
            continue;
        }
        for (QLineSeries* piece : it->second.pieces) chart_->removeSeries(piece), delete piece;
        chart_->removeSeries(it->second.series);
        delete it->second.series;
        it = lines_.erase(it);
    }
    for (const SignalSeries::Mark& mark : series.marks()) {
        first_ = std::min(first_, mark.timeMs);
        last_ = std::max(last_, mark.timeMs);
    }
    if (first_ > last_) first_ = last_ = 0;

    // The scroll bar counts seconds from the session's start to the last span's start.
    const int maximum = int(std::max<int64_t>(0, (last_ - first_ - kSpanMs + 999) / 1000));
    const QSignalBlocker blocker(scroll_);
    scroll_->setRange(0, maximum);
    scroll_->setPageStep(int(kSpanMs / 1000));
    if (following_) scroll_->setValue(maximum);
    draw();
}

void SignalPlotWindow::draw() {
    // Following, the span ends at the newest time once the session is longer than the span;
    // a younger session fills it from the left.
    start_ = following_ ? std::max(first_, last_ - kSpanMs) : first_ + int64_t(scroll_->value()) * 1000;
    const int64_t end = start_ + kSpanMs;
    timeAxis_->setRange(QDateTime::fromMSecsSinceEpoch(start_), QDateTime::fromMSecsSinceEpoch(end));

    // The lines' points in the span, with one on either side so that they reach the edges.
    std::map<QValueAxis*, std::pair<double, double>> ranges;
    const SignalSeries& series = sampler_.series();
    struct Entry {
        QLineSeries* series;
        bool drawn, current;
    };
    std::vector<Entry> legend;
    for (auto& [key, line] : lines_) {
        const auto& points = series.points(key);
        auto from = std::lower_bound(points.begin(), points.end(), start_,
                                     [](const SignalSeries::Point& p, int64_t t) { return p.timeMs < t; });
        auto to = std::upper_bound(from, points.end(), end,
                                   [](int64_t t, const SignalSeries::Point& p) { return t < p.timeMs; });
        if (from != points.begin()) --from;
        if (to != points.end()) ++to;
        // A gap point (no value at that tick) breaks the line there.
        std::vector<QList<QPointF>> pieces(1);
        auto& [low, high] = ranges.try_emplace(line.axis, std::numeric_limits<double>::max(),
                                               std::numeric_limits<double>::lowest()).first->second;
        for (auto p = from; p != to; ++p) {
            if (SignalSeries::isGap(*p)) {
                if (!pieces.back().isEmpty()) pieces.emplace_back();
                continue;
            }
            pieces.back().append(QPointF(double(p->timeMs), p->value));
            if (p->timeMs >= start_ && p->timeMs <= end) {
                low = std::min(low, p->value);
                high = std::max(high, p->value);
            }
        }
        line.series->replace(pieces.front());
        while (line.pieces.size() + 1 < pieces.size()) line.pieces.push_back(newSeries(line, false));
        // Pieces the span no longer needs leave the chart: each is a series laid out and redrawn
        // at every tick, and kept they would add up to the most gaps any span of the session had.
        while (line.pieces.size() + 1 > pieces.size()) {
            chart_->removeSeries(line.pieces.back());
            delete line.pieces.back();
            line.pieces.pop_back();
        }
        for (std::size_t i = 0; i < line.pieces.size(); ++i) {
            if (line.pieces[i]->pen() != line.series->pen()) line.pieces[i]->setPen(line.series->pen());
            line.pieces[i]->replace(i + 1 < pieces.size() ? pieces[i + 1] : QList<QPointF>());
        }
        const bool drawn = std::any_of(pieces.begin(), pieces.end(), [](const QList<QPointF>& p) { return !p.isEmpty(); });
        const std::optional<double> latest = series.latest(key);
        legend.push_back({line.series, drawn, latest.has_value()});
        line.series->setName(latest ? line.label + "  " + QString::fromStdString(line.quantity.reading(*latest)) : line.label);
    }
    // The legend lists the lines drawn in the span, each with its latest reading. When they
    // are more than its column holds, the lines that have no reading now (cells no longer
    // among the strongest) leave it first.
    const bool crowded =
        std::count_if(legend.begin(), legend.end(), [](const Entry& e) { return e.drawn; }) > legendRoom();
    for (const Entry& entry : legend) {
        const bool listed = entry.drawn && (entry.current || !crowded);
        // Set every time: a marker reads as hidden while the legend regroups after a series
        // was added, and an entry left at that would come back when the group is shown.
        for (QLegendMarker* marker : chart_->legend()->markers(entry.series)) marker->setVisible(listed);
    }
    for (auto& [axis, range] : ranges) {
        auto [low, high] = range;
        if (low > high) low = 0, high = 1;
        const double pad = std::max(1.0, (high - low) * 0.08);
        axis->setRange(low - pad, high + pad);
        axis->applyNiceNumbers();
    }

    // The marks in the span: a vertical line on the first value axis, its text at the top.
    QValueAxis* markAxis = axes_.empty() ? nullptr : axes_.begin()->second.axis;
    for (const auto& [unit, axis] : axes_)
        if (axis.axis->alignment() == Qt::AlignLeft) markAxis = axis.axis;
    shownMarks_ = 0;
    for (const SignalSeries::Mark& mark : series.marks()) {
        if (!markAxis || mark.timeMs < start_ || mark.timeMs > end) continue;
        if (shownMarks_ == marks_.size()) {
            MarkItem item;
            item.line = new QLineSeries;
            chart_->addSeries(item.line);
            item.line->attachAxis(timeAxis_);
            item.line->attachAxis(markAxis);
            for (QLegendMarker* marker : chart_->legend()->markers(item.line)) marker->setVisible(false);
            // The text on a pale box, readable over the lines it crosses.
            item.back = new QGraphicsRectItem(chart_);
            item.back->setPen(Qt::NoPen);
            item.back->setBrush(QColor(255, 255, 255, 200));
            item.back->setZValue(1000);
            item.text = new QGraphicsSimpleTextItem(item.back);
            marks_.push_back(item);
        }
        MarkItem& item = marks_[shownMarks_++];
        item.timeMs = mark.timeMs;
        item.whole = QString::fromStdString(mark.text);
        const QPen pen(markColour(mark.kind), 1.5, Qt::DashLine);
        if (item.line->pen() != pen) item.line->setPen(pen);
        item.line->replace({QPointF(double(mark.timeMs), markAxis->min()), QPointF(double(mark.timeMs), markAxis->max())});
        item.text->setText(shortMarkText(mark.text));
        item.text->setToolTip(item.whole);
        item.text->setBrush(markColour(mark.kind));
    }
    // Spare items of the pool draw nothing; they stay in the chart (hiding a series and
    // showing it again would bring back its legend entry).
    for (std::size_t i = shownMarks_; i < marks_.size(); ++i) {
        if (marks_[i].line->count()) marks_[i].line->clear();
        marks_[i].back->setVisible(false);
    }
    placeMarkTexts();

    hint_->setText(lines_.empty() ? tr("Waiting for values: they are read at every display tick.")
                                  : tr("%1 \u2013 %2 \u00b7 session from %3")
                                        .arg(QDateTime::fromMSecsSinceEpoch(start_).toString("HH:mm:ss"),
                                             QDateTime::fromMSecsSinceEpoch(end).toString("HH:mm:ss"),
                                             QDateTime::fromMSecsSinceEpoch(first_).toString("HH:mm:ss")));
}

void SignalPlotWindow::placeMarkTexts() {
    // Each short text at the top of its line, on its right, on a pale box; one that would
    // overlap the text before it is left out, so that a busy span stays readable.
    const QRectF area = chart_->plotArea();
    qreal freeFrom = std::numeric_limits<qreal>::lowest();
    for (std::size_t i = 0; i < shownMarks_; ++i) {
        MarkItem& item = marks_[i];
        const QPointF at = chart_->mapToPosition(QPointF(double(item.timeMs), 0), item.line);
        const QRectF box = item.text->boundingRect();
        item.back->setRect(box.adjusted(-2, 0, 2, 0));
        item.back->setPos(at.x() + 2, area.top() + 2);
        const bool room = at.x() + 2 >= freeFrom && at.x() >= area.left() && at.x() <= area.right();
        item.back->setVisible(room);
        if (room) freeFrom = at.x() + 2 + box.width() + 6;
    }
}

QString SignalPlotWindow::shortMarkText(const std::string& text) {
    const QString whole = QString::fromStdString(text);
    const qsizetype arrow = whole.indexOf(QStringLiteral("→"));
    if (arrow < 0) return whole.left(12);
    const qsizetype comma = whole.indexOf(',', arrow);
    return whole.mid(arrow, comma < 0 ? -1 : comma - arrow).trimmed();
}

std::vector<QString> SignalPlotWindow::shownMarks() const {
    std::vector<QString> texts;
    for (std::size_t i = 0; i < shownMarks_; ++i) texts.push_back(marks_[i].text->text());
    return texts;
}

std::vector<QLineSeries*> SignalPlotWindow::piecesOf(const std::string& key) const {
    auto it = lines_.find(key);
    if (it == lines_.end()) return {};
    std::vector<QLineSeries*> pieces{it->second.series};
    for (QLineSeries* piece : it->second.pieces)
        if (piece->count()) pieces.push_back(piece);
    return pieces;
}

QLineSeries* SignalPlotWindow::seriesOf(const std::string& key) const {
    auto it = lines_.find(key);
    return it == lines_.end() ? nullptr : it->second.series;
}

bool SignalPlotWindow::exportCsv(const QString& path, std::string* error) const {
    // The command line's CSV of the whole session; the file appears only once complete.
    std::vector<std::string> titles;
    for (const std::string& key : sampler_.keys()) titles.push_back(sampler_.columnTitle(key));
    const std::string text = SignalCsvWriter(sampler_.keys(), false, titles).fromSeries(sampler_.series());
    QSaveFile file(path);
    if (!file.open(QIODevice::WriteOnly) || file.write(text.data(), qint64(text.size())) != qint64(text.size()) ||
        !file.commit()) {
        if (error) *error = path.toStdString() + ": " + file.errorString().toStdString();
        return false;
    }
    return true;
}

void SignalPlotWindow::exportPressed() {
    const QString path = QFileDialog::getSaveFileName(this, tr("Export CSV"), QStringLiteral("signal.csv"), tr("CSV (*.csv)"));
    if (path.isEmpty()) return;
    std::string error;
    if (!exportCsv(path, &error)) QMessageBox::warning(this, tr("Export CSV"), QString::fromStdString(error));
}

}  // namespace vantorel
