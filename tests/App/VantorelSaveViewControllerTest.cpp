// Tests for VantorelSaveViewController (Part 1.3): the list, Save/Cancel, the snapshot file read back with libplist, the failure alert; real widgets offscreen.
#include "App/VantorelSaveViewController.h"

#include "App/PaneApplication.h"
#include "LogGenerator/LogGenerator.h"
#include "Platform/ByteReader.h"
#include "Platform/DateDescription.h"
#include "Platform/DiagnosticLogDirectory.h"
#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"
#include "cli/SnapshotCommand.h"

#include <QAbstractButton>
#include <QApplication>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QKeyEvent>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QMessageBox>
#include <QMouseEvent>
#include <QPushButton>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <cstdlib>
#include <memory>

using namespace vantorel;
using namespace std::chrono_literals;

namespace {

// PaneApplication that counts what the screen asks of it.
class FakeApplication : public PaneApplication {
public:
    bool allowSaveButton() const override { return true; }
    void showSaveView() override { ++showCount; }
    void closeSaveView() override { ++closeCount; }
    int showCount = 0;
    int closeCount = 0;
};

// Runs queued calls (QMetaObject::invokeMethod with Qt::QueuedConnection) and deferred deletes.
void runQueuedCalls() {
    for (int i = 0; i < 3; ++i) {
        QCoreApplication::sendPostedEvents();
        QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
        QCoreApplication::processEvents();
    }
}

Value entry(const char* description, const char* date = nullptr) {
    auto d = Dictionary::create();
    if (date) d->set("Date", date);
    if (description) d->set("Description", description);
    return Value(d);
}

std::optional<Bytes> readFile(const std::string& path) {
    QFile file(QString::fromStdString(path));
    if (!file.open(QIODevice::ReadOnly)) return std::nullopt;
    const QByteArray all = file.readAll();
    return Bytes(all.begin(), all.end());
}

// The snapshot at path, read back with libplist.
DictionaryRef readSnapshot(const std::string& path) {
    auto bytes = readFile(path);
    if (!bytes) return nullptr;
    PropertyListResult result = PropertyListSerialization::readDictionary(*bytes);
    EXPECT_TRUE(result) << result.error;
    return result ? result.value->asDictionary() : nullptr;
}

void click(QWidget* widget, QPoint at) {
    QMouseEvent press(QEvent::MouseButtonPress, at, widget->mapToGlobal(at), Qt::LeftButton, Qt::LeftButton,
                      Qt::NoModifier);
    QApplication::sendEvent(widget, &press);
    QMouseEvent release(QEvent::MouseButtonRelease, at, widget->mapToGlobal(at), Qt::LeftButton, Qt::NoButton,
                        Qt::NoModifier);
    QApplication::sendEvent(widget, &release);
}

void pressKey(QWidget* widget, int key) {
    QKeyEvent press(QEvent::KeyPress, key, Qt::NoModifier, key == Qt::Key_Return ? "\r" : QString());
    QApplication::sendEvent(widget, &press);
    QKeyEvent release(QEvent::KeyRelease, key, Qt::NoModifier, key == Qt::Key_Return ? "\r" : QString());
    QApplication::sendEvent(widget, &release);
}

class VantorelSaveViewControllerTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(tmp.isValid());
        if (const char* old = std::getenv(DiagnosticLogDirectory::kEnvironmentVariable)) savedVariable = old;
        unsetenv(DiagnosticLogDirectory::kEnvironmentVariable);
        // Not created yet: the screen creates it on demand.
        logDir = tmp.filePath("state/vantorel/DiagnosticLogs").toStdString();
        DiagnosticLogDirectory::setOverride(logDir);
        VantorelSaveViewController::setClock([this] { return clockNow; });
    }
    void TearDown() override {
        runQueuedCalls();
        VantorelSaveViewController::setClock({});
        DiagnosticLogDirectory::setOverride("");
        if (savedVariable) setenv(DiagnosticLogDirectory::kEnvironmentVariable, savedVariable->c_str(), 1);
    }

    std::unique_ptr<VantorelSaveViewController> makeScreen(const Value& contents) {
        return std::make_unique<VantorelSaveViewController>(contents, &app, &window);
    }
    std::string expectedPath(std::chrono::system_clock::time_point t) const {
        return logDir + "/VantorelSnapshot-" + std::to_string(std::chrono::system_clock::to_time_t(t)) +
               ".vantorel";
    }
    QStringList filesWritten() const {
        return QDir(QString::fromStdString(logDir)).entryList(QDir::Files | QDir::NoDotAndDotDot);
    }

    QTemporaryDir tmp;
    std::string logDir;
    std::optional<std::string> savedVariable;
    // 2016-06-28 22:01:10.250 UTC.
    std::chrono::system_clock::time_point clockNow = std::chrono::system_clock::from_time_t(1467151270) + 250ms;
    FakeApplication app;
    QWidget window;  // the screen's parent, as the navigation controller is in the application
};

}  // namespace

// Edge: "Saving with an empty description writes an empty "Description"."
TEST_F(VantorelSaveViewControllerTest, SavingWithAnEmptyDescriptionWritesAnEmptyDescription) {
    auto screen = makeScreen(Value(Array::of({entry("Snapshot (a)")})));
    ASSERT_TRUE(screen->saveDescription()->text().isEmpty());
    screen->savePressed();
    DictionaryRef snapshot = readSnapshot(expectedPath(clockNow));
    ASSERT_TRUE(snapshot);
    const std::string* description = snapshot->get("Description").asString();
    ASSERT_TRUE(description) << "Description must be a string, even when nothing was typed";
    EXPECT_EQ(*description, "");
    EXPECT_TRUE(screen->lastWriteError().empty()) << screen->lastWriteError();
}

// Edge: "The "Timestamp" is the time the screen was opened, even if Save is pressed
// minutes later; the file name uses the time of the press."
TEST_F(VantorelSaveViewControllerTest, TheTimestampIsTheTimeTheScreenWasOpenedWhileTheFileNameUsesTheTimeOfThePress) {
    const auto opened = clockNow;
    auto screen = makeScreen(Value(Array::of({entry("Snapshot (a)")})));
    EXPECT_EQ(screen->timeStamp(), opened);

    clockNow = opened + 5min + 700ms;  // 22:06:10.950: the name takes whole seconds, 1467151570
    screen->saveDescription()->setText("walk test");
    screen->savePressed();

    EXPECT_EQ(screen->lastWritePath(), logDir + "/VantorelSnapshot-1467151570.vantorel");
    EXPECT_FALSE(QFileInfo::exists(QString::fromStdString(expectedPath(opened))));
    DictionaryRef snapshot = readSnapshot(screen->lastWritePath());
    ASSERT_TRUE(snapshot);
    EXPECT_EQ(*snapshot->get("Timestamp").asString(), DateDescription::describe(opened));
    EXPECT_NE(*snapshot->get("Timestamp").asString(), DateDescription::describe(clockNow));
    EXPECT_EQ(*snapshot->get("Description").asString(), "walk test");
}

// Edge: "Contents with no elements show an empty list and save an empty "Data" array."
TEST_F(VantorelSaveViewControllerTest, ContentsWithNoElementsShowAnEmptyListAndSaveAnEmptyDataArray) {
    // An empty array, and a missing (null) one, which the screen treats the same way.
    for (const Value& contents : {Value(Array::create()), Value()}) {
        auto screen = makeScreen(contents);
        EXPECT_EQ(screen->saveContentTable()->count(), 0);
        // Sized to fit: nothing but the frame.
        EXPECT_EQ(screen->saveContentTable()->height(), 2 * screen->saveContentTable()->frameWidth());
        screen->savePressed();
        DictionaryRef snapshot = readSnapshot(screen->lastWritePath());
        ASSERT_TRUE(snapshot);
        ArrayRef data = snapshot->get("Data").asArray();
        ASSERT_TRUE(data) << "Data must be an array";
        EXPECT_TRUE(data->empty());
        QFile::remove(QString::fromStdString(screen->lastWritePath()));
    }
}

TEST_F(VantorelSaveViewControllerTest, TheListShowsEachDescriptionInHelvetica13WithACheckMarkThatCannotBeRemoved) {
    auto screen = makeScreen(Value(Array::of({entry("Snapshot (one)"), entry(nullptr), Value("not a dictionary"),
                                              entry("DLF binary (161 bytes)")})));
    QListWidget* list = screen->saveContentTable();
    ASSERT_EQ(list->count(), 4);
    const char* const expected[] = {"Snapshot (one)", "", "", "DLF binary (161 bytes)"};
    for (int row = 0; row < list->count(); ++row) {
        QListWidgetItem* item = list->item(row);
        EXPECT_EQ(item->text().toStdString(), expected[row]) << row;
        EXPECT_EQ(item->font().family(), "Helvetica") << row;
        EXPECT_EQ(item->font().pointSize(), 13) << row;
        EXPECT_EQ(item->checkState(), Qt::Checked) << row;
        EXPECT_FALSE(item->flags() & Qt::ItemIsUserCheckable) << row;
        EXPECT_FALSE(item->flags() & Qt::ItemIsSelectable) << row;
    }
    // Sized to fit its rows: no scrolling needed to see them all.
    int rows = 0;
    for (int row = 0; row < list->count(); ++row) rows += list->sizeHintForRow(row);
    EXPECT_EQ(list->height(), rows + 2 * list->frameWidth());

    // A click on a row's check mark leaves it checked.
    screen->show();
    const QRect first = list->visualItemRect(list->item(0));
    click(list->viewport(), QPoint(first.left() + 8, first.center().y()));
    click(list->viewport(), first.center());
    EXPECT_EQ(list->item(0)->checkState(), Qt::Checked);
    runQueuedCalls();
    EXPECT_EQ(app.closeCount, 0);
}

TEST_F(VantorelSaveViewControllerTest, TheContentsAreACopyTakenWhenTheScreenOpens) {
    ArrayRef contents = Array::of({entry("Snapshot (a)")});
    auto screen = makeScreen(Value(contents));
    contents->at(0).asDictionary()->set("Description", "changed later");
    contents->append(entry("added later"));
    EXPECT_EQ(screen->saveContentTable()->count(), 1);
    screen->savePressed();
    DictionaryRef snapshot = readSnapshot(screen->lastWritePath());
    ASSERT_TRUE(snapshot);
    EXPECT_EQ(snapshot->get("Data"), Value(Array::of({entry("Snapshot (a)")})));
}

TEST_F(VantorelSaveViewControllerTest, SaveWritesAnXmlSnapshotWithTimestampDataAndDescriptionFromARealDecoder) {
    // The UTRAN decoder (an MVKLogGenerator2) fed as the model does.
    std::unique_ptr<LogGenerator> decoder = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_UTRAN2);
    ASSERT_TRUE(decoder);
    Dictionary state;
    const Bytes rrc = RecordBuilder::ordinary(0xD0E0, 15)
                          .u8(13, 1)  // validity flag
                          .u8(14, 2)  // RRC mode
                          .build();
    const Bytes rrcPrefixed = RecordBuilder::ordinary(0xD0E0, 15).u8(13, 1).u8(14, 3).buildWithPrefix();
    const Bytes unknown = RecordBuilder::ordinary(0x1234, 20).build();  // no section subscribes: kept for the DLF
    decoder->updateState(state, rrc);
    decoder->updateState(state, rrcPrefixed);
    decoder->generateLogUsingState(state);  // builds the display, first history entry
    decoder->updateState(state, unknown);
    decoder->generateLogUsingState(state);  // second history entry
    const Value contents = decoder->getSaveContentsFromState(state);
    ASSERT_EQ(contents.asArray()->size(), 3u);  // two history entries, then the DLF entry

    auto screen = makeScreen(contents);
    ASSERT_EQ(screen->saveContentTable()->count(), 3);
    EXPECT_EQ(screen->saveContentTable()->item(0)->text().toStdString(),
              *contents.asArray()->at(0).asDictionary()->get("Description").asString());
    screen->saveDescription()->setText("drive test, cell edge");
    clockNow += 90s;
    screen->savePressed();
    ASSERT_EQ(screen->lastWritePath(), expectedPath(clockNow));
    EXPECT_TRUE(screen->lastWriteError().empty()) << screen->lastWriteError();

    auto bytes = readFile(screen->lastWritePath());
    ASSERT_TRUE(bytes);
    EXPECT_EQ(std::string(bytes->begin(), bytes->begin() + 5), "<?xml");  // the format chosen: XML
    DictionaryRef snapshot = readSnapshot(screen->lastWritePath());
    ASSERT_TRUE(snapshot);
    EXPECT_EQ(snapshot->keys(), (std::vector<std::string>{"Timestamp", "Data", "Description"}));
    EXPECT_EQ(*snapshot->get("Timestamp").asString(), DateDescription::describe(clockNow - 90s));
    EXPECT_EQ(*snapshot->get("Description").asString(), "drive test, cell edge");
    EXPECT_EQ(snapshot->get("Data"), contents);  // history and DLF entry, whole

    ArrayRef data = snapshot->get("Data").asArray();
    DictionaryRef first = data->at(0).asDictionary();
    EXPECT_EQ(first->keys(), (std::vector<std::string>{"DisplayState", "Display", "ExtraInfo", "Date", "Description"}));
    DictionaryRef dlfEntry = data->at(2).asDictionary();
    const Bytes* dlf = dlfEntry->get("DLF").asData();
    ASSERT_TRUE(dlf);
    // Version record, then each entry's buffer without its first byte.
    Bytes expected(dlf->begin(), dlf->begin() + 161);
    Bytes firstBuffer = rrc;
    firstBuffer.insert(firstBuffer.end(), rrcPrefixed.begin(), rrcPrefixed.end());
    expected.insert(expected.end(), firstBuffer.begin() + 1, firstBuffer.end());
    expected.insert(expected.end(), unknown.begin() + 1, unknown.end());
    EXPECT_EQ(*dlf, expected);
    ByteReader version(*dlf);
    EXPECT_EQ(version.u16(0), 161);     // record length
    EXPECT_EQ(version.u16(2), 0x1FFD);  // version-report code
    EXPECT_EQ(*dlfEntry->get("Description").asString(), "DLF binary (" + std::to_string(dlf->size()) + " bytes)");

    runQueuedCalls();
    EXPECT_EQ(app.closeCount, 1);
}

TEST_F(VantorelSaveViewControllerTest, TheSaveButtonSavesAndAsksToBeClosedOnceAfterTheQueue) {
    auto screen = makeScreen(Value(Array::of({entry("Snapshot (a)")})));
    screen->show();
    screen->saveButton()->click();
    EXPECT_TRUE(QFileInfo::exists(QString::fromStdString(expectedPath(clockNow))));
    EXPECT_EQ(app.closeCount, 0) << "closeSaveView must be queued, not called from within savePressed";
    runQueuedCalls();
    EXPECT_EQ(app.closeCount, 1);
    EXPECT_EQ(app.showCount, 0);
}

TEST_F(VantorelSaveViewControllerTest, TwoSavesWithinOneSecondWriteTheSameFileInPlace) {
    auto screen = makeScreen(Value(Array::of({entry("Snapshot (a)")})));
    screen->saveDescription()->setText("a much longer first description than the second");
    screen->savePressed();
    const std::string firstPath = screen->lastWritePath();
    clockNow += 500ms;  // still the same second
    screen->saveDescription()->setText("second");
    screen->savePressed();
    EXPECT_EQ(screen->lastWritePath(), firstPath);
    EXPECT_EQ(filesWritten().size(), 1);
    DictionaryRef snapshot = readSnapshot(firstPath);  // truncated and rewritten: still a valid plist
    ASSERT_TRUE(snapshot);
    EXPECT_EQ(*snapshot->get("Description").asString(), "second");
}

TEST_F(VantorelSaveViewControllerTest, AFailedWriteLogsShowsTheFileErrorAlertAndTheScreenStillAsksToBeClosed) {
    // The directory lies under a regular file: it cannot be created, nothing can be written.
    QFile blocker(tmp.filePath("plain-file"));
    ASSERT_TRUE(blocker.open(QIODevice::WriteOnly));
    blocker.close();
    const std::string badDir = tmp.filePath("plain-file/DiagnosticLogs").toStdString();
    DiagnosticLogDirectory::setOverride(badDir);

    auto screen = makeScreen(Value(Array::of({entry("Snapshot (a)")})));
    screen->show();
    SystemLogCapture capture;
    screen->savePressed();
    const std::string path = badDir + "/VantorelSnapshot-1467151270.vantorel";
    EXPECT_EQ(screen->lastWritePath(), path);
    EXPECT_FALSE(screen->lastWriteError().empty());
    EXPECT_TRUE(capture.contains(SystemLog::kError, "Unable to write snapshot to " + path));
    EXPECT_EQ(capture.lines().size(), 1u);

    QMessageBox* alert = screen->errorAlert();
    ASSERT_TRUE(alert);
    EXPECT_TRUE(alert->isVisible());
    EXPECT_EQ(alert->windowTitle(), "File Error");
    EXPECT_EQ(alert->text(), "Unable to write file to disk");
    const QList<QAbstractButton*> buttons = alert->buttons();
    ASSERT_EQ(buttons.size(), 1);
    EXPECT_EQ(buttons[0]->text(), "Close");
    // Not owned by the screen: it outlives the screen the application closes.
    EXPECT_NE(alert->parent(), screen.get());

    runQueuedCalls();
    EXPECT_EQ(app.closeCount, 1);
    screen.reset();
    EXPECT_TRUE(alert->isVisible());
    delete alert;
}

TEST_F(VantorelSaveViewControllerTest, TheAlertsCloseButtonDismissesIt) {
    DiagnosticLogDirectory::setOverride("/proc/vantorel-cannot-exist");
    auto screen = makeScreen(Value());
    screen->savePressed();
    QPointer<QMessageBox> alert = screen->errorAlert();
    ASSERT_TRUE(alert);
    alert->buttons().at(0)->click();
    runQueuedCalls();
    EXPECT_FALSE(alert) << "the alert deletes itself once closed";
}

TEST_F(VantorelSaveViewControllerTest, CancelWritesNothingAndAsksToBeClosed) {
    auto screen = makeScreen(Value(Array::of({entry("Snapshot (a)")})));
    screen->show();
    screen->saveDescription()->setText("not saved");
    screen->cancelButton()->click();
    EXPECT_EQ(app.closeCount, 0);
    runQueuedCalls();
    EXPECT_EQ(app.closeCount, 1);
    EXPECT_TRUE(screen->lastWritePath().empty());
    EXPECT_FALSE(QFileInfo::exists(QString::fromStdString(logDir))) << "not even the directory is created";
}

TEST_F(VantorelSaveViewControllerTest, EscapeActsAsCancel) {
    auto screen = makeScreen(Value(Array::of({entry("Snapshot (a)")})));
    screen->show();
    pressKey(screen.get(), Qt::Key_Escape);
    runQueuedCalls();
    EXPECT_EQ(app.closeCount, 1);
    EXPECT_TRUE(filesWritten().isEmpty());
    screen->reject();  // the application's own dismissal coming back: no second request
    runQueuedCalls();
    EXPECT_EQ(app.closeCount, 1);
}

TEST_F(VantorelSaveViewControllerTest, ReturnInTheFieldDoesNotSaveAndOnlyDismissesTheKeyboard) {
    auto screen = makeScreen(Value(Array::of({entry("Snapshot (a)")})));
    screen->show();
    QApplication::setActiveWindow(screen.get());
    QLineEdit* field = screen->saveDescription();
    field->setFocus();
    ASSERT_EQ(screen->focusWidget(), field);
    field->setText("typed");

    pressKey(field, Qt::Key_Return);
    runQueuedCalls();
    EXPECT_TRUE(filesWritten().isEmpty());
    EXPECT_TRUE(screen->lastWritePath().empty());
    EXPECT_EQ(app.closeCount, 0);
    EXPECT_TRUE(screen->isVisible());
    EXPECT_NE(screen->focusWidget(), field) << "Return dismisses the keyboard";
    EXPECT_EQ(field->text(), "typed");
    EXPECT_FALSE(screen->saveButton()->isDefault());
    EXPECT_FALSE(screen->cancelButton()->isDefault());
}

TEST_F(VantorelSaveViewControllerTest, SelectingARowAndTouchingTheBackgroundOnlyDismissTheKeyboard) {
    auto screen = makeScreen(Value(Array::of({entry("Snapshot (a)"), entry("Snapshot (b)")})));
    screen->show();
    QApplication::setActiveWindow(screen.get());
    QLineEdit* field = screen->saveDescription();
    QListWidget* list = screen->saveContentTable();

    field->setFocus();
    ASSERT_EQ(screen->focusWidget(), field);
    click(list->viewport(), list->visualItemRect(list->item(1)).center());
    EXPECT_NE(screen->focusWidget(), field);
    EXPECT_TRUE(list->selectedItems().isEmpty());

    field->setFocus();
    ASSERT_EQ(screen->focusWidget(), field);
    click(screen.get(), QPoint(2, 2));  // the dialog's own background
    EXPECT_NE(screen->focusWidget(), field);

    runQueuedCalls();
    EXPECT_EQ(app.closeCount, 0);
    EXPECT_TRUE(filesWritten().isEmpty());
    EXPECT_EQ(list->item(1)->checkState(), Qt::Checked);
}

TEST_F(VantorelSaveViewControllerTest, TheScreenIsAModalDialogLaidOutWithTitleLabelsAndButtons) {
    auto screen = makeScreen(Value(Array::of({entry("Snapshot (a)")})));
    EXPECT_TRUE(screen->isModal());
    EXPECT_EQ(screen->windowTitle(), "Save Snapshot");
    QStringList labels;
    for (QLabel* label : screen->findChildren<QLabel*>()) labels << label->text();
    EXPECT_TRUE(labels.contains("Contents"));
    EXPECT_TRUE(labels.contains("Description"));
    EXPECT_EQ(screen->saveButton()->text(), "Save");
    EXPECT_EQ(screen->cancelButton()->text(), "Cancel");
    screen->show();
    // Buttons at the bottom right, Save last.
    EXPECT_GT(screen->saveButton()->x(), screen->cancelButton()->x());
    EXPECT_GT(screen->saveButton()->y(), screen->saveDescription()->y());
    EXPECT_GT(screen->saveDescription()->y(), screen->saveContentTable()->y());
}

TEST_F(VantorelSaveViewControllerTest, AScreenDeletedBeforeTheQueuedCallRunsIsNotClosedAgain) {
    auto screen = makeScreen(Value());
    screen->cancelPressed();
    screen.reset();
    runQueuedCalls();
    EXPECT_EQ(app.closeCount, 0);
}

TEST_F(VantorelSaveViewControllerTest, ASavedSnapshotIsListedAndItsDlfExtractedByVantorelCliSnapshot) {
    std::unique_ptr<LogGenerator> decoder = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_UTRAN2);
    ASSERT_TRUE(decoder);
    Dictionary state;
    decoder->updateState(state, RecordBuilder::ordinary(0xD0E0, 15).u8(13, 1).u8(14, 2).build());
    decoder->generateLogUsingState(state);
    decoder->generateLogUsingState(state);
    const Value contents = decoder->getSaveContentsFromState(state);
    const Bytes dlf = *contents.asArray()->at(2).asDictionary()->get("DLF").asData();

    auto screen = makeScreen(contents);
    screen->saveDescription()->setText("for the cli");
    screen->savePressed();
    const QString out = tmp.filePath("out.dlf");
    ::testing::internal::CaptureStdout();
    const int code = SnapshotCommand::run({QString::fromStdString(screen->lastWritePath()), "--dlf", out});
    const std::string listing = ::testing::internal::GetCapturedStdout();
    EXPECT_EQ(code, 0);
    EXPECT_EQ(listing.rfind("Timestamp: " + DateDescription::describe(clockNow) + "\nDescription: for the cli\n" +
                                "Data: 3 entries\n  0  Snapshot (",
                            0),
              0u)
        << listing;
    EXPECT_EQ(readFile(out.toStdString()), dlf);
}
