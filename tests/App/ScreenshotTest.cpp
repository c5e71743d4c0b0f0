// Screenshots (PNG) of what a user sees: the root pane and a drilled-down pane on the emulator's UTRAN data, written under the build tree (build/<dir>/screenshots/).
#include "App/NavigationController.h"
#include "App/VantorelApp.h"
#include "App/VantorelPaneController.h"
#include "Model/VantorelModel.h"
#include "Platform/Preferences.h"
#include "support/EventLoopWait.h"

#include <QDir>
#include <QImage>
#include <QMainWindow>
#include <QTemporaryDir>
#include <gtest/gtest.h>

using namespace vantorel;
using namespace vantorel::testing;

namespace {

std::string save(QWidget* window, const char* name) {
    QDir().mkpath(VANTOREL_SCREENSHOT_DIR);
    const QString path = QDir(VANTOREL_SCREENSHOT_DIR).filePath(name);
    EXPECT_TRUE(window->grab().save(path, "PNG")) << path.toStdString();
    return path.toStdString();
}

}  // namespace

TEST(Screenshots, RootPaneAndADrilledDownPaneShowEmulatorData) {
    QTemporaryDir settings;
    Preferences::setDirectory(settings.path().toStdString());
    VantorelApp::Options options;
    options.source.emulate = "utran";
    options.allowSave = true;
    options.timeScale = 0.1;  // refresh every 0.2 s
    VantorelApp app(options);
    std::string error;
    ASSERT_TRUE(app.applicationDidFinishLaunching(&error)) << error;
    app.window()->resize(480, 720);
    NavigationController& nav = *app.navigationController();
    ASSERT_TRUE(waitUntil(
        [&] {
            NodeRef node = app.model() ? app.model()->nodeAtPath("/Neighbours/Neighbor Cell List/0/UARFCN") : nullptr;
            return node && nav.topPane()->numberOfRowsInSection() == 6;
        },
        10000));
    spin(300);
    const std::string root = save(app.window(), "root-pane.png");
    EXPECT_FALSE(QImage(QString::fromStdString(root)).isNull());

    // Drill down: Serving Cell, then Serving Cell Info.
    for (const char* name : {"Serving Cell", "Serving Cell Info"}) {
        VantorelPaneController* top = nav.topPane();
        const auto* children = top->node()->childNodes();
        for (size_t row = 0; row < children->size(); ++row)
            if ((*children)[row]->displayName() == name) top->didSelectRowAtIndexPath(static_cast<int>(row));
    }
    ASSERT_EQ(nav.topPane()->path(), "/Serving Cell/Serving Cell Info");
    ASSERT_TRUE(waitUntil([&] { return nav.topPane()->status().rfind("Updated ", 0) == 0; }, 5000));
    spin(300);
    const std::string drilled = save(app.window(), "serving-cell-info-pane.png");
    EXPECT_FALSE(QImage(QString::fromStdString(drilled)).isNull());
    app.applicationWillTerminate();
    Preferences::setDirectory("");
}
