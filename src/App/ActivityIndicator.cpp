// ActivityIndicator: the small grey spinning indicator at the left of a pane's toolbar, shown while the pane is loading.
#include "App/ActivityIndicator.h"

#include <QPainter>
#include <QTimer>

namespace vantorel {

ActivityIndicator::ActivityIndicator(QWidget* parent) : QWidget(parent), timer_(new QTimer(this)) {
    setFixedSize(kSize, kSize);
    setAttribute(Qt::WA_TranslucentBackground);
    timer_->setInterval(kStepMilliseconds);
    connect(timer_, &QTimer::timeout, this, [this] {
        step_ = (step_ + 1) % kSpokes;
        update();
    });
}

void ActivityIndicator::startAnimating() { timer_->start(); }

void ActivityIndicator::stopAnimating() { timer_->stop(); }

bool ActivityIndicator::isAnimating() const { return timer_->isActive(); }

QSize ActivityIndicator::sizeHint() const { return {kSize, kSize}; }

void ActivityIndicator::paintEvent(QPaintEvent*) {
    QPainter painter(this);
    painter.setRenderHint(QPainter::Antialiasing);
    painter.translate(width() / 2.0, height() / 2.0);
    const double outer = qMin(width(), height()) / 2.0 - 1.0;
    QPen pen(Qt::gray, 2.0, Qt::SolidLine, Qt::RoundCap);
    for (int i = 0; i < kSpokes; ++i) {
        // The spoke at the current step is opaque; the ones behind it fade out.
        const int age = (step_ - i + kSpokes) % kSpokes;
        QColor color(Qt::gray);
        color.setAlphaF(1.0 - 0.8 * age / double(kSpokes));
        pen.setColor(color);
        painter.setPen(pen);
        painter.save();
        painter.rotate(360.0 * i / kSpokes);
        painter.drawLine(QPointF(0, -outer * 0.45), QPointF(0, -outer));
        painter.restore();
    }
}

}  // namespace vantorel
