// ActivityIndicator: the small grey spinning indicator at the left of a pane's toolbar, shown while the pane is loading.
#pragma once

#include <QWidget>

class QTimer;

namespace vantorel {

// Qt has no activity indicator; this stands in for the platform's small grey one:
// twelve spokes whose brightest spoke turns while it animates. Inside a toolbar the
// toolbar decides the widget's visibility, so the pane hides the indicator's toolbar
// action while it is stopped.
class ActivityIndicator : public QWidget {
    Q_OBJECT
public:
    static constexpr int kSize = 20;      // the platform's small style, in points (= pixels)
    static constexpr int kSpokes = 12;
    static constexpr int kStepMilliseconds = 80;

    explicit ActivityIndicator(QWidget* parent = nullptr);

    void startAnimating();
    void stopAnimating();
    bool isAnimating() const;

    QSize sizeHint() const override;

protected:
    void paintEvent(QPaintEvent* event) override;

private:
    QTimer* timer_;
    int step_ = 0;
};

}  // namespace vantorel
