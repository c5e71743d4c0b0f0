// Tests for ActivityIndicator, the toolbar's small spinning indicator (Part 1.2, createToolbarItems item 1).
#include "App/ActivityIndicator.h"

#include "PaneTestSupport.h"

#include <QElapsedTimer>
#include <QImage>

#include <gtest/gtest.h>

using namespace vantorel;
using namespace vantorel::panetest;

TEST(ActivityIndicator, SpinsOnlyBetweenStartAndStop) {
    ActivityIndicator indicator;
    EXPECT_FALSE(indicator.isAnimating());
    EXPECT_EQ(indicator.sizeHint(), QSize(20, 20));
    indicator.startAnimating();
    EXPECT_TRUE(indicator.isAnimating());
    indicator.show();
    settle();
    // The picture changes while it spins.
    const QImage first = indicator.grab().toImage();
    QElapsedTimer clock;
    clock.start();
    while (clock.elapsed() < 3 * ActivityIndicator::kStepMilliseconds) QApplication::processEvents();
    EXPECT_NE(indicator.grab().toImage(), first);
    indicator.stopAnimating();
    EXPECT_FALSE(indicator.isAnimating());
}
