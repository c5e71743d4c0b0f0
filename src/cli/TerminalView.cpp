// TerminalView: the terminal view of the monitor (Parts 1.1 status line and 2.3 tree, as text).
#include "cli/TerminalView.h"

#include "Model/VantorelModel.h"
#include "Platform/TechnologyNames.h"
#include "cli/TreeFormatter.h"

#include <QDateTime>
#include <QTimer>

#include <unistd.h>

namespace vantorel {

TerminalView::TerminalView(std::FILE* out) : out_(out), interactive_(isatty(fileno(out)) == 1) {}

TerminalView::~TerminalView() = default;

void TerminalView::setModel(VantorelModel* model) {
    model_ = model;
    if (!connectionTimer_) {
        // "Connecting..." while the channel is down (Part 1.1's status), said once per loss.
        connectionTimer_ = new QTimer(this);
        connectionTimer_->setInterval(500);
        connect(connectionTimer_, &QTimer::timeout, this, [this] { watchConnection(); });
        connectionTimer_->start();
    }
}

void TerminalView::watchConnection() {
    if (!model_) return;
    const bool connected = model_->isConnected();
    if (!connected && wasConnected_) {
        status_ = "Connecting...";
        std::fprintf(out_, "%s\n", status_.c_str());
        std::fflush(out_);
    }
    wasConnected_ = connected;
}

std::string TerminalView::screen() const {
    std::string text = "Vantorel";
    if (model_ && model_->logGenerator()) {
        text += " - ";
        text += model_->isConnected() ? status_ : "Connecting...";
        text += " - " + std::to_string(model_->messagesDecoded()) + " messages decoded";
    }
    text += "\n\n";
    if (model_) text += TreeFormatter::tree(model_->topLevelNodes());
    return text;
}

void TerminalView::updateViewControllerFromModel() {
    ++refreshes_;
    status_ = QDateTime::currentDateTime().toString(QStringLiteral("'Updated' yyyy-MM-dd 'at' HH:mm:ss")).toStdString();
    const std::string text = screen();
    if (interactive_)
        std::fprintf(out_, "\x1b[H\x1b[2J%s", text.c_str());  // home, clear, then the screen
    else
        std::fprintf(out_, "----\n%s", text.c_str());
    std::fflush(out_);
}

}  // namespace vantorel
