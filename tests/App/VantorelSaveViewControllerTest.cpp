// Tests for the snapshot save screen: the file it writes (read back with libplist), its failure alert, and Cancel, Escape and Return writing nothing.
#include "App/VantorelSaveViewController.h"

#include "PaneTestSupport.h"
#include "Platform/DateDescription.h"
#include "Platform/DiagnosticLogDirectory.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"
#include "support/FastMonitorClock.h"

#include <QAbstractButton>
#include <QDir>
#include <QFile>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QTemporaryDir>
#include <gtest/gtest.h>

using namespace vantorel;
using namespace vantorel::panetest;
using namespace std::chrono_literals;

namespace {

class VantorelSaveViewControllerTest : public ::testing::Test {
protected:
    void SetUp() override {
        logDir = tmp.filePath("state/DiagnosticLogs").toStdString();  // created on demand
        DiagnosticLogDirectory::setOverride(logDir);
        clock.frozen = std::chrono::system_clock::from_time_t(1467151270) + 250ms;
    }
    void TearDown() override {
        settle();
        clock.frozen.reset();
        DiagnosticLogDirectory::setOverride("");
    }
    std::unique_ptr<VantorelSaveViewController> makeScreen(const Value& contents) {
        auto screen = std::make_unique<VantorelSaveViewController>(contents, &app, &window);
        screen->show();
        QApplication::setActiveWindow(screen.get());
        settle();
        return screen;
    }
    vantorel::testing::FastMonitorClock& clock = vantorel::testing::FastMonitorClock::installed();
    QTemporaryDir tmp;
    std::string logDir;
    FakeApplication app;
    QWidget window;
};

}  // namespace

TEST_F(VantorelSaveViewControllerTest, SaveWritesTheContentsAsTakenAtOpeningStampedWhenOpenedNamedWhenPressed) {
    const Value contents(Array::of({dict({{"Description", "Snapshot"}, {"Date", "today"}}), dict({{"DLF", Value::data({1, 2})}})}));
    const Value copy = contents.deepCopy();
    const auto opened = *clock.frozen;

    auto screen = makeScreen(contents);
    ASSERT_EQ(screen->saveContentTable()->count(), 2);
    contents.asArray()->append(Value("added after opening"));
    screen->saveDescription()->setText("drive test, cell edge");
    clock.frozen = opened + 5min + 700ms;  // the name takes whole seconds
    screen->saveButton()->click();
    EXPECT_EQ(screen->lastWritePath(), logDir + "/VantorelSnapshot-1467151570.vantorel");
    QFile file(QString::fromStdString(screen->lastWritePath()));
    ASSERT_TRUE(file.open(QIODevice::ReadOnly));
    const QByteArray all = file.readAll();
    EXPECT_TRUE(all.startsWith("<?xml"));
    DictionaryRef snapshot = PropertyListSerialization::readDictionary(Bytes(all.begin(), all.end())).value->asDictionary();
    ASSERT_TRUE(snapshot);
    EXPECT_EQ(snapshot->keys(), (std::vector<std::string>{"Timestamp", "Data", "Description"}));
    EXPECT_EQ(*snapshot->get("Timestamp").asString(), DateDescription::describe(opened));
    EXPECT_EQ(*snapshot->get("Description").asString(), "drive test, cell edge");
    EXPECT_EQ(snapshot->get("Data"), copy);

    EXPECT_EQ(app.closeSaveViewCalls, 0);  // queued, not called from inside the click
    settle();
    EXPECT_EQ(app.closeSaveViewCalls, 1);
}

TEST_F(VantorelSaveViewControllerTest, AFailedWriteLeavesTheFileErrorAlertUpAfterTheScreenCloses) {
    QFile blocker(tmp.filePath("plain-file"));  // the directory would lie under a regular file
    ASSERT_TRUE(blocker.open(QIODevice::WriteOnly));
    blocker.close();
    DiagnosticLogDirectory::setOverride(tmp.filePath("plain-file/DiagnosticLogs").toStdString());
    auto screen = makeScreen(Value());
    screen->savePressed();
    QPointer<QMessageBox> alert = screen->errorAlert();
    ASSERT_TRUE(alert);
    EXPECT_EQ(alert->text(), "Unable to write file to disk");
    settle();
    EXPECT_EQ(app.closeSaveViewCalls, 1);
    screen.reset();
    ASSERT_TRUE(alert && alert->isVisible());
    alert->buttons().at(0)->click();  // "Close"
    settle();
    EXPECT_TRUE(alert.isNull());
}
