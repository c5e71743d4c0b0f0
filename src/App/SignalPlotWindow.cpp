// SignalPlotWindow: Qt Charts lines of the sampler's series, one value axis per unit, a time axis scrolled by a scroll bar, marks as labelled vertical lines.
#include "App/SignalPlotWindow.h"

#include "Model/SignalSampler.h"
#include "Monitor/SignalCsvWriter.h"

#include <QChart>
#include <QChartView>
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

}  // namespace

SignalPlotWindow::SignalPlotWindow(const SignalSampler& sampler, UnitLookup units, QWidget* parent)
    : QWidget(parent, Qt::Window),
      sampler_(sampler),
      units_(std::move(units)),
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

std::string SignalPlotWindow::unitOf(const std::string& display) {
    std::size_t i = display.find_first_not_of(' ');
    if (i == std::string::npos) return {};
    if (display[i] == '-' || display[i] == '+') ++i;
    const std::size_t digits = display.find_first_not_of("0123456789.", i);
    if (digits == i) return {};
    const std::size_t from = display.find_first_not_of(' ', digits == std::string::npos ? display.size() : digits);
    if (from == std::string::npos || display[from] == '(') return {};
    return display.substr(from, display.find(' ', from) - from);
}

QString SignalPlotWindow::labelOf(const std::string& key) const {
    // The key's last path component, with as many parents as it takes to tell two apart.
    auto tail = [](const std::string& path, int parts) {
        std::size_t at = path.size();
        for (int i = 0; i < parts && at != std::string::npos && at > 0; ++i) at = path.rfind('/', at - 1);
        return at == std::string::npos ? path : path.substr(at + 1);
    };
    const auto& keys = sampler_.keys();
    for (int parts = 1; parts < 6; ++parts) {
        const std::string mine = tail(key, parts);
        if (std::any_of(keys.begin(), keys.end(), [&](const std::string& k) { return k != key && tail(k, parts) == mine; }))
            continue;
        // "Filtered RSRP [2]" for the third entry of a list, "Parent › Name" otherwise.
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

QValueAxis* SignalPlotWindow::axisFor(const std::string& unit) {
    if (auto it = axes_.find(unit); it != axes_.end()) return it->second;
    auto* axis = new QValueAxis;
    axis->setTitleText(unit.empty() ? tr("value") : QString::fromStdString(unit));
    axis->setLabelFormat("%.4g");
    chart_->addAxis(axis, axes_.empty() ? Qt::AlignLeft : Qt::AlignRight);
    axes_[unit] = axis;
    return axis;
}

void SignalPlotWindow::addLine(const std::string& key) {
    Line line;
    line.unit = units_ ? units_(key) : std::string();
    line.axis = axisFor(line.unit);
    line.label = labelOf(key);
    line.series = newSeries(line.axis, true);
    line.series->setName(line.label);
    lines_[key] = line;
}

QLineSeries* SignalPlotWindow::newSeries(QValueAxis* axis, bool inLegend) {
    auto* series = new QLineSeries;
    chart_->addSeries(series);
    series->attachAxis(timeAxis_);
    series->attachAxis(axis);
    if (!inLegend)
        for (QLegendMarker* marker : chart_->legend()->markers(series)) marker->setVisible(false);
    return series;
}

void SignalPlotWindow::refresh() {
    const SignalSeries& series = sampler_.series();
    first_ = std::numeric_limits<int64_t>::max();
    last_ = std::numeric_limits<int64_t>::min();
    for (const std::string& key : sampler_.keys()) {
        const auto& points = series.points(key);
        if (points.empty()) continue;
        // A line is made once its key has a value, so that its unit can be read.
        if (!lines_.count(key)) addLine(key);
        first_ = std::min(first_, points.front().timeMs);
        last_ = std::max(last_, points.back().timeMs);
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
    start_ = first_ + int64_t(scroll_->value()) * 1000;
    const int64_t end = start_ + kSpanMs;
    timeAxis_->setRange(QDateTime::fromMSecsSinceEpoch(start_), QDateTime::fromMSecsSinceEpoch(end));

    // The lines' points in the span, with one on either side so that they reach the edges.
    std::map<QValueAxis*, std::pair<double, double>> ranges;
    const SignalSeries& series = sampler_.series();
    for (auto& [key, line] : lines_) {
        const auto& points = series.points(key);
        auto from = std::lower_bound(points.begin(), points.end(), start_,
                                     [](const SignalSeries::Point& p, int64_t t) { return p.timeMs < t; });
        auto to = std::upper_bound(from, points.end(), end,
                                   [](int64_t t, const SignalSeries::Point& p) { return t < p.timeMs; });
        if (from != points.begin()) --from;
        if (to != points.end()) ++to;
        QList<QPointF> shown;
        shown.reserve(int(std::distance(from, to)));
        auto& [low, high] = ranges.try_emplace(line.axis, std::numeric_limits<double>::max(),
                                               std::numeric_limits<double>::lowest()).first->second;
        for (auto p = from; p != to; ++p) {
            shown.append(QPointF(double(p->timeMs), p->value));
            if (p->timeMs >= start_ && p->timeMs <= end) {
                low = std::min(low, p->value);
                high = std::max(high, p->value);
            }
        }
        // A gap (ticks without a value) breaks the line: a step longer than the steps on
        // either side of it. Thinned older points are evenly spaced too, so only gaps break.
        std::vector<double> steps;
        for (qsizetype i = 1; i < shown.size(); ++i) steps.push_back(shown[i].x() - shown[i - 1].x());
        auto gapAt = [&](std::size_t i) {
            const bool before = i > 0, after = i + 1 < steps.size();
            return (before || after) && (!before || steps[i] > 1.5 * steps[i - 1]) &&
                   (!after || steps[i] > 1.5 * steps[i + 1]);
        };
        std::vector<QList<QPointF>> pieces(1);
        for (qsizetype i = 0; i < shown.size(); ++i) {
            if (i > 0 && gapAt(std::size_t(i - 1))) pieces.emplace_back();
            pieces.back().append(shown[i]);
        }
        line.series->replace(pieces.front());
        while (line.pieces.size() + 1 < pieces.size()) line.pieces.push_back(newSeries(line.axis, false));
        for (std::size_t i = 0; i < line.pieces.size(); ++i) {
            line.pieces[i]->setPen(line.series->pen());
            line.pieces[i]->replace(i + 1 < pieces.size() ? pieces[i + 1] : QList<QPointF>());
        }
        const std::optional<double> latest = series.latest(key);
        // The legend shows each value's latest reading beside its name.
        const QString unit = QString::fromStdString(line.unit);
        line.series->setName(latest ? QStringLiteral("%1  %2 %3").arg(line.label).arg(*latest, 0, 'g', 4).arg(unit)
                                    : line.label);
    }
    for (auto& [axis, range] : ranges) {
        auto [low, high] = range;
        if (low > high) low = 0, high = 1;
        const double pad = std::max(1.0, (high - low) * 0.08);
        axis->setRange(low - pad, high + pad);
        axis->applyNiceNumbers();
    }

    // The marks in the span: a vertical line on the first value axis, its text at the top.
    QValueAxis* markAxis = axes_.empty() ? nullptr : axes_.begin()->second;
    for (const auto& [unit, axis] : axes_)
        if (axis->alignment() == Qt::AlignLeft) markAxis = axis;
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
        QPen pen(markColour(mark.kind), 1.5, Qt::DashLine);
        item.line->setPen(pen);
        item.line->replace({QPointF(double(mark.timeMs), markAxis->min()), QPointF(double(mark.timeMs), markAxis->max())});
        item.line->setVisible(true);
        item.text->setToolTip(QString::fromStdString(mark.text));
        item.text->setBrush(markColour(mark.kind));
        item.back->setVisible(true);
    }
    for (std::size_t i = shownMarks_; i < marks_.size(); ++i) {
        marks_[i].line->setVisible(false);
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
    // Each text runs up along its line, on its right, elided to the plot's height (whole in
    // the tooltip): marks a few pixels apart then never write over each other.
    const QRectF area = chart_->plotArea();
    for (std::size_t i = 0; i < shownMarks_; ++i) {
        MarkItem& item = marks_[i];
        const QPointF at = chart_->mapToPosition(QPointF(double(item.timeMs), 0), item.line);
        const QFontMetrics metrics(item.text->font());
        item.text->setText(metrics.elidedText(item.text->toolTip(), Qt::ElideRight, int(area.height()) - 8));
        const QRectF box = item.text->boundingRect();
        item.back->setRect(box.adjusted(-2, 0, 2, 0));
        item.back->setRotation(-90);
        item.back->setPos(at.x() + 1, area.top() + 6 + box.width());
    }
}

std::vector<QString> SignalPlotWindow::shownMarks() const {
    std::vector<QString> texts;
    for (std::size_t i = 0; i < shownMarks_; ++i) texts.push_back(marks_[i].text->toolTip());
    return texts;
}

QLineSeries* SignalPlotWindow::seriesOf(const std::string& key) const {
    auto it = lines_.find(key);
    return it == lines_.end() ? nullptr : it->second.series;
}

bool SignalPlotWindow::exportCsv(const QString& path, std::string* error) const {
    // The command line's CSV of the whole session; the file appears only once complete.
    const std::string text = SignalCsvWriter(sampler_.keys(), false).fromSeries(sampler_.series());
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
