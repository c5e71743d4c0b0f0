// VantorelSaveViewController: the modal snapshot save screen; lists the contents, takes a description, writes one XML property-list snapshot.
#pragma once

#include "PropertyList/Value.h"

#include <QDialog>
#include <QMessageBox>
#include <QPointer>

#include <chrono>
#include <string>

class QLineEdit;
class QListWidget;
class QPushButton;

namespace vantorel {

class PaneApplication;

// The snapshot file is written as an XML property list (readers take either format;
// XML keeps it readable by a person and by any plist tool). Times come from MonitorClock. Return in the text field,
// a click on a row and a click on the background only take the keyboard focus away
// from the field: neither button is a default button, so Return never saves. Escape
// and the window's close button act as Cancel (the application closes the screen).
class VantorelSaveViewController : public QDialog {
    Q_OBJECT

public:
    // `initWithSaveHistory:`: `_timeStamp` = now; `_saveHistory` = a deep copy of the
    // array (an empty array when saveHistory is null or not an array).
    VantorelSaveViewController(const Value& saveHistory, PaneApplication* application, QWidget* parent = nullptr);
    ~VantorelSaveViewController() override;

    // The outlets (properties `saveContentTable` and `saveDescription`) and the buttons.
    QListWidget* saveContentTable() const { return saveContentTable_; }
    QLineEdit* saveDescription() const { return saveDescription_; }
    QPushButton* saveButton() const { return saveButton_; }
    QPushButton* cancelButton() const { return cancelButton_; }

    // The path of the last Save (written or not), empty before the first.
    const std::string& lastWritePath() const { return lastWritePath_; }
    // The "File Error" alert of the last failed Save while it is open, else null.
    QMessageBox* errorAlert() const { return errorAlert_; }

public slots:
    // Writes the snapshot, reports a failure, then asks the
    // application (queued) to close the screen.
    void savePressed();
    // Asks the application (queued) to close the screen; writes nothing.
    void cancelPressed();
    // A click on the background: dismisses the keyboard and does nothing else.
    void backgroundTouched();

public:
    // Escape and the close button: the same as Cancel; the application dismisses.
    void reject() override;

protected:
    void mousePressEvent(QMouseEvent* event) override;
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void dismissKeyboard();
    void fillContentTable();
    void sizeContentTableToFit();
    void showWriteError();
    void askToClose();

    std::chrono::system_clock::time_point _timeStamp;
    ArrayRef _saveHistory;
    QListWidget* saveContentTable_ = nullptr;
    QLineEdit* saveDescription_ = nullptr;
    QPushButton* saveButton_ = nullptr;
    QPushButton* cancelButton_ = nullptr;
    PaneApplication* application_ = nullptr;
    std::string lastWritePath_;
    QPointer<QMessageBox> errorAlert_;
    bool closeRequested_ = false;
};

}  // namespace vantorel
