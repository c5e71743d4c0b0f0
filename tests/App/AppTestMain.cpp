// AppTestMain: GoogleTest entry point for the widget tests: a QApplication on the offscreen platform, and the fast monitor clock installed once.
#include "support/FastMonitorClock.h"

#include <QApplication>
#include <gtest/gtest.h>

#include <cstdlib>

int main(int argc, char** argv) {
    ::testing::InitGoogleTest(&argc, argv);
    setenv("QT_QPA_PLATFORM", "offscreen", 0);  // no screen needed
    QApplication app(argc, argv);
    vantorel::testing::FastMonitorClock::installed();
    return RUN_ALL_TESTS();
}
