// TerminalView: the status line and the display tree as text, reprinted on every refresh.
#include "Monitor/TerminalView.h"

#include "Model/VantorelModel.h"
#include "Platform/QuitOnSignal.h"
#include "Monitor/TreeFormatter.h"

#include <QCoreApplication>
#include <QDateTime>
#include <QTimer>

#include <sys/ioctl.h>
#include <unistd.h>

namespace vantorel {

TerminalView::TerminalView(std::FILE* out) : out_(out), interactive_(isatty(fileno(out)) == 1) {}

TerminalView::~TerminalView() = default;

void TerminalView::setModel(VantorelModel* model) {
    model_ = model;
    if (!connectionTimer_) {
        // "Connecting..." while the channel is down, said once per loss.
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
        status_ = StatusText::kConnecting;
        std::fprintf(out_, "%s\n", status_.c_str());
        std::fflush(out_);
    }
    wasConnected_ = connected;
}

std::string TerminalView::screen() const {
    std::string text = "Vantorel";
    if (model_ && model_->logGenerator()) {
        text += " - ";
        text += model_->isConnected() ? status_ : StatusText::kConnecting;
        text += " - " + std::to_string(model_->messagesDecoded()) + " messages decoded";
    }
    text += "\n\n";
    if (model_) text += TreeFormatter::compactTree(model_->topLevelNodes());
    return text;
}

void TerminalView::updateViewControllerFromModel() {
    ++refreshes_;
    status_ = StatusText::updated(QDateTime::currentDateTime());
    std::string text = screen();
    if (interactive_) {
        // Keep the top of the display in view: cut to the window's height.
        winsize size{};
        if (::ioctl(fileno(out_), TIOCGWINSZ, &size) == 0 && size.ws_row > 2) {
            size_t rows = 0, pos = 0;
            while (pos != std::string::npos && rows + 1 < size.ws_row) {
                pos = text.find('\n', pos);
                if (pos != std::string::npos) ++pos, ++rows;
            }
            if (pos != std::string::npos && pos < text.size()) {
                size_t hidden = 0;
                for (size_t i = pos; i < text.size(); ++i) hidden += text[i] == '\n';
                text = text.substr(0, pos) + "... " + std::to_string(hidden) + " more rows (a taller window shows them)";
            }
        }
        std::fprintf(out_, "\x1b[H\x1b[2J%s", text.c_str());  // home, clear, then the screen
    } else
        std::fprintf(out_, "----\n%s", text.c_str());
    std::fflush(out_);
}

int TerminalView::run(const MonitorLauncher::Source& source, const char* program) {
    std::string error;
    TerminalView view;
    MonitorLauncher launcher;
    if (!launcher.start(source, &view, &error)) {
        std::fprintf(stderr, "%s: %s\n", program, error.c_str());
        return 1;
    }
    view.setModel(launcher.model());
    std::fprintf(stderr, "%s: %s; Ctrl-C ends\n", program, launcher.description().c_str());
    QuitOnSignal quit;
    return QCoreApplication::exec();
}

}  // namespace vantorel
