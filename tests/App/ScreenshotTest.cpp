// Screenshots (PNG) of the window for a person to look at: the root pane and a drilled-down pane on the emulator's UTRAN data, under build/<dir>/screenshots/.
#include "App/NavigationController.h"
#include "App/VantorelApp.h"
#include "PaneTestSupport.h"
#include "Platform/Preferences.h"
#include "support/EventLoopWait.h"

#include <QDir>
#include <QMainWindow>
#include <QTemporaryDir>
#include <gtest/gtest.h>

using namespace vantorel;
using namespace vantorel::testing;

TEST(Screenshots, RootPaneAndADrilledDownPane) {
    QTemporaryDir settings;
    Preferences::setDirectory(settings.path().toStdString());
    VantorelApp::Options options;
    options.source.emulate = "utran";
    options.allowSave = true;
    VantorelApp app(options);
    std::string error;
    ASSERT_TRUE(app.applicationDidFinishLaunching(&error)) << error;
    app.window()->resize(480, 720);
    NavigationController& nav = *app.navigationController();
    ASSERT_TRUE(waitUntil([&] { return nav.topPane()->numberOfRowsInSection() == 6; }, 10000));
    QDir().mkpath(VANTOREL_SCREENSHOT_DIR);
    const QDir dir(VANTOREL_SCREENSHOT_DIR);
    spin(300);
    EXPECT_TRUE(app.window()->grab().save(dir.filePath("root-pane.png"), "PNG"));
    for (const char* name : {"Serving Cell", "Serving Cell Info"})
        nav.topPane()->didSelectRowAtIndexPath(panetest::rowOf(*nav.topPane(), name));
    ASSERT_EQ(nav.topPane()->path(), "/Serving Cell/Serving Cell Info");
    spin(300);
    EXPECT_TRUE(app.window()->grab().save(dir.filePath("serving-cell-info-pane.png"), "PNG"));
    app.applicationWillTerminate();
    Preferences::setDirectory("");
}
