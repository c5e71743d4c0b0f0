// VantorelSaveViewController: the snapshot save screen as a modal QDialog; the file goes through libplist (XML) into the diagnostic-log directory.
#include "App/VantorelSaveViewController.h"

#include "App/PaneApplication.h"
#include "Model/MonitorClock.h"
#include "Platform/DateDescription.h"
#include "Platform/DiagnosticLogDirectory.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <QCoreApplication>
#include <QFile>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QMessageBox>
#include <QMouseEvent>
#include <QPushButton>
#include <QVBoxLayout>

#include <algorithm>

namespace vantorel {

namespace {

std::chrono::system_clock::time_point now() { return MonitorClock::current().now(); }

// Each row's label font.
const char* const kRowFontFamily = "Helvetica";
constexpr int kRowFontPoints = 13;
// The list grows with its rows up to this many (the model's contents are at most
// 5 history entries and the DLF entry); beyond it the list scrolls.
constexpr int kMaximumVisibleRows = 10;

// The element's "Description", or an empty text when it has none.
QString descriptionOf(const Value& element) {
    if (DictionaryRef entry = element.asDictionary())
        if (const std::string* text = entry->get("Description").asString()) return QString::fromStdString(*text);
    return QString();
}

// Writes the snapshot in place (not atomically: a failed write may leave a partial
// file, which the "File Error" alert then reports). False when anything failed.
bool writeSnapshot(const Value& snapshot, const std::string& path) {
    const std::optional<Bytes> bytes = PropertyListSerialization::write(snapshot, PropertyListSerialization::Format::XML);
    if (!bytes || !DiagnosticLogDirectory::ensureExists(nullptr)) return false;
    QFile file(QString::fromStdString(path));
    if (!file.open(QIODevice::WriteOnly | QIODevice::Truncate)) return false;
    const auto size = static_cast<qint64>(bytes->size());
    return file.write(reinterpret_cast<const char*>(bytes->data()), size) == size && file.flush();
}

}  // namespace

VantorelSaveViewController::VantorelSaveViewController(const Value& saveHistory, PaneApplication* application,
                                                       QWidget* parent)
    : QDialog(parent), _timeStamp(now()), application_(application) {
    const ArrayRef contents = saveHistory.asArray();
    _saveHistory = contents ? contents->deepCopy() : Array::create();

    setWindowTitle(QStringLiteral("Save Snapshot"));
    setModal(true);

    auto* contentsLabel = new QLabel(QStringLiteral("Contents"), this);
    saveContentTable_ = new QListWidget(this);
    saveContentTable_->setObjectName(QStringLiteral("saveContentTable"));
    // Rows are shown as all included: nothing to select, edit or uncheck, and a click
    // on the list must not take the focus itself (it only dismisses the keyboard).
    saveContentTable_->setSelectionMode(QAbstractItemView::NoSelection);
    saveContentTable_->setEditTriggers(QAbstractItemView::NoEditTriggers);
    saveContentTable_->setFocusPolicy(Qt::NoFocus);
    saveContentTable_->setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
    saveContentTable_->setTextElideMode(Qt::ElideRight);
    saveContentTable_->viewport()->installEventFilter(this);

    saveDescription_ = new QLineEdit(this);
    saveDescription_->setObjectName(QStringLiteral("saveDescription"));
    saveDescription_->setPlaceholderText(QStringLiteral("What was happening (optional)"));
    auto* descriptionLabel = new QLabel(QStringLiteral("Description"), this);
    descriptionLabel->setBuddy(saveDescription_);

    cancelButton_ = new QPushButton(QStringLiteral("Cancel"), this);
    cancelButton_->setObjectName(QStringLiteral("cancelButton"));
    saveButton_ = new QPushButton(QStringLiteral("Save"), this);
    saveButton_->setObjectName(QStringLiteral("saveButton"));
    // QDialog makes the first auto-default button the default one when shown and
    // clicks it on Return; Return in the field must only dismiss the keyboard.
    for (QPushButton* button : {cancelButton_, saveButton_}) {
        button->setAutoDefault(false);
        button->setDefault(false);
    }

    auto* buttons = new QHBoxLayout;
    buttons->addStretch(1);
    buttons->addWidget(cancelButton_);
    buttons->addWidget(saveButton_);

    auto* layout = new QVBoxLayout(this);
    layout->addWidget(contentsLabel);
    layout->addWidget(saveContentTable_);
    layout->addSpacing(8);
    layout->addWidget(descriptionLabel);
    layout->addWidget(saveDescription_);
    layout->addStretch(1);
    layout->addSpacing(8);
    layout->addLayout(buttons);
    layout->setSizeConstraint(QLayout::SetMinimumSize);
    setMinimumWidth(400);

    connect(saveButton_, &QPushButton::clicked, this, &VantorelSaveViewController::savePressed);
    connect(cancelButton_, &QPushButton::clicked, this, &VantorelSaveViewController::cancelPressed);
    connect(saveDescription_, &QLineEdit::returnPressed, this, &VantorelSaveViewController::dismissKeyboard);

    // "on load": the list, then its size to fit its rows.
    fillContentTable();
    sizeContentTableToFit();
    saveDescription_->setFocus();
}

VantorelSaveViewController::~VantorelSaveViewController() = default;

void VantorelSaveViewController::fillContentTable() {
    const QFont font(QString::fromLatin1(kRowFontFamily), kRowFontPoints);
    for (const Value& element : *_saveHistory) {
        auto* item = new QListWidgetItem(descriptionOf(element), saveContentTable_);
        item->setFont(font);
        // The check mark is data, not a user-checkable box: it cannot be unchecked.
        item->setFlags(Qt::ItemIsEnabled);
        item->setCheckState(Qt::Checked);
    }
}

void VantorelSaveViewController::sizeContentTableToFit() {
    const int frame = 2 * saveContentTable_->frameWidth();
    const int rows = saveContentTable_->count();
    int height = frame;
    for (int row = 0; row < std::min(rows, kMaximumVisibleRows); ++row)
        height += saveContentTable_->sizeHintForRow(row) + 2 * saveContentTable_->spacing();
    saveContentTable_->setFixedHeight(height);
    saveContentTable_->setMinimumWidth(std::max(saveContentTable_->sizeHintForColumn(0), 0) + frame);
    saveContentTable_->setVerticalScrollBarPolicy(rows > kMaximumVisibleRows ? Qt::ScrollBarAsNeeded
                                                                             : Qt::ScrollBarAlwaysOff);
}

void VantorelSaveViewController::dismissKeyboard() {
    saveDescription_->clearFocus();
}

void VantorelSaveViewController::backgroundTouched() {
    dismissKeyboard();
}

void VantorelSaveViewController::mousePressEvent(QMouseEvent* event) {
    backgroundTouched();
    QDialog::mousePressEvent(event);
}

bool VantorelSaveViewController::eventFilter(QObject* watched, QEvent* event) {
    // A press on the list (a row or its empty part) is "selecting a row": keyboard away.
    if (watched == saveContentTable_->viewport() && event->type() == QEvent::MouseButtonPress) dismissKeyboard();
    return QDialog::eventFilter(watched, event);
}

void VantorelSaveViewController::savePressed() {
    const auto pressed = now();
    auto snapshot = Dictionary::create();
    snapshot->set("Timestamp", DateDescription::describe(_timeStamp));
    snapshot->set("Data", Value(_saveHistory));
    snapshot->set("Description", saveDescription_->text().toStdString());

    const long seconds =
        static_cast<long>(std::chrono::duration_cast<std::chrono::seconds>(pressed.time_since_epoch()).count());
    const std::string directory = DiagnosticLogDirectory::path();
    lastWritePath_ = StringFormat::format("%s/VantorelSnapshot-%ld.vantorel", directory.c_str(), seconds);
    if (!writeSnapshot(Value(snapshot), lastWritePath_)) {
        SystemLog::log(SystemLog::kError, "Unable to write snapshot to %s", lastWritePath_.c_str());
        showWriteError();
    }
    askToClose();
}

void VantorelSaveViewController::cancelPressed() {
    askToClose();
}

void VantorelSaveViewController::reject() {
    // Escape or the close button: hide now, and let the application release the
    // screen as after Cancel (once: its own dismissal may come back through here).
    const bool alreadyAsked = closeRequested_;
    QDialog::reject();
    if (!alreadyAsked) askToClose();
}

void VantorelSaveViewController::showWriteError() {
    // Owned by the screen's parent, not the screen: the alert stays up after the
    // application has closed the screen.
    auto* alert = new QMessageBox(parentWidget());
    alert->setObjectName(QStringLiteral("fileErrorAlert"));
    alert->setAttribute(Qt::WA_DeleteOnClose);
    alert->setIcon(QMessageBox::Warning);
    alert->setWindowTitle(QStringLiteral("File Error"));
    alert->setText(QStringLiteral("Unable to write file to disk"));
    alert->addButton(QStringLiteral("Close"), QMessageBox::AcceptRole);
    alert->open();  // does not block: the screen goes on to ask to be closed
    errorAlert_ = alert;
}

void VantorelSaveViewController::askToClose() {
    closeRequested_ = true;
    // Queued on the application object rather than on this screen: closeSaveView may
    // delete the screen. A screen deleted before the call runs has nothing to close.
    QPointer<VantorelSaveViewController> self(this);
    PaneApplication* application = application_;
    QMetaObject::invokeMethod(
        QCoreApplication::instance(),
        [self, application] {
            if (self && application) application->closeSaveView();
        },
        Qt::QueuedConnection);
}

}  // namespace vantorel
