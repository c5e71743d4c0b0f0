// TerminalView: the terminal view: plays the application object (Part 1.1's updateViewControllerFromModel) and prints the display tree on every refresh.
#pragma once

#include "Model/ApplicationObject.h"

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

    // The text of one screen: the status line, then the tree (exposed for tests).
    std::string screen() const;

private:
    void watchConnection();

    std::FILE* out_;
    bool interactive_;
    VantorelModel* model_ = nullptr;
    QTimer* connectionTimer_ = nullptr;
    bool wasConnected_ = true;
    int refreshes_ = 0;
    std::string status_ = "Connecting...";
};

}  // namespace vantorel
