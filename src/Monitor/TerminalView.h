// TerminalView: the monitor in a terminal: plays the application object and prints the status line and the display tree on every refresh.
#pragma once

#include "Model/ApplicationObject.h"
#include "Monitor/StatusText.h"
#include "Monitor/MonitorLauncher.h"

#include <QObject>

#include <cstdio>
#include <string>

class QTimer;

namespace vantorel {

class VantorelModel;

class TerminalView : public QObject, public ApplicationObject {
    Q_OBJECT
public:
    // Writes to `out`; clears the screen before each display when `out` is a terminal.
    explicit TerminalView(std::FILE* out = stdout);
    ~TerminalView() override;

    void setModel(VantorelModel* model);
    void updateViewControllerFromModel() override;
    int refreshes() const { return refreshes_; }

    // The text of one screen: the status line, then the tree.
    std::string screen() const;

    // The terminal view on `source` until Ctrl-C (SIGINT, SIGTERM); `program` prefixes
    // messages. Needs a running QCoreApplication. Returns the exit code.
    static int run(const MonitorLauncher::Source& source, const char* program);

private:
    void watchConnection();

    std::FILE* out_;
    bool interactive_;
    VantorelModel* model_ = nullptr;
    QTimer* connectionTimer_ = nullptr;
    bool wasConnected_ = true;
    int refreshes_ = 0;
    std::string status_ = StatusText::kConnecting;
};

}  // namespace vantorel
