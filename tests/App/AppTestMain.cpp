// AppTestMain: GoogleTest entry point for the widget tests, with a QApplication on the offscreen platform.
#include <QApplication>
#include <gtest/gtest.h>

#include <cstdlib>

int main(int argc, char** argv) {
    ::testing::InitGoogleTest(&argc, argv);
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    setenv("QT_QPA_PLATFORM", "offscreen", 0);  // no screen needed
    QApplication app(argc, argv);
    return RUN_ALL_TESTS();
}
