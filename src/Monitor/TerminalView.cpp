// TerminalView: the status line and the display tree as text, redrawn on every refresh; on a terminal, one level at a time with a cursor moved by keys.
#include "Monitor/TerminalView.h"

#include "Model/VantorelModel.h"
#include "Monitor/TerminalRawMode.h"
#include "Monitor/TreeFormatter.h"
#include "Platform/QuitOnSignal.h"

#include <QCoreApplication>
#include <QDateTime>
#include <QSocketNotifier>
#include <QTimer>

#include <sys/ioctl.h>
#include <unistd.h>

namespace vantorel {

TerminalView::TerminalView(std::FILE* out)
    : out_(out), interactive_(isatty(fileno(out)) == 1 && isatty(STDIN_FILENO) == 1) {}

TerminalView::~TerminalView() = default;

void TerminalView::setPlots(const std::vector<std::string>& keys) {
    sparklines_.clear();
    for (const std::string& key : keys) sparklines_.emplace_back(key);
}

void TerminalView::setModel(VantorelModel* model) {
    if (model && model != model_)
        connect(model, &VantorelModel::displayTicked, this, [this, model] {
            if (sparklines_.empty()) return;
            const PathDictionary& nodes = model->pathIndex();
            const std::string technology = model->sourceStatus().decoderTechnology;
            for (Sparkline& s : sparklines_) s.sample(nodes, technology);
        });
    model_ = model;
    if (!connectionTimer_) {
        // "Connecting..." while the channel is down, said once per loss; on a
        // terminal, the same tick notices a resized window.
        connectionTimer_ = new QTimer(this);
        connectionTimer_->setInterval(500);
        connect(connectionTimer_, &QTimer::timeout, this, [this] { watchConnection(); });
        connectionTimer_->start();
    }
    if (interactive_ && !rawMode_) {
        rawMode_ = std::make_unique<TerminalRawMode>(STDIN_FILENO);
        keys_ = new QSocketNotifier(STDIN_FILENO, QSocketNotifier::Read, this);
        connect(keys_, &QSocketNotifier::activated, this, [this] { readKeys(); });
        navigator_.setRoot(model_ ? model_->topLevelNodes() : nullptr);
        draw();
    }
}

void TerminalView::watchConnection() {
    if (!model_) return;
    const bool connected = model_->isConnected();
    if (interactive_) {
        winsize size{};
        const bool resized = ::ioctl(fileno(out_), TIOCGWINSZ, &size) == 0 && (size.ws_col != width_ || size.ws_row != height_);
        if (resized || connected != wasConnected_) draw();
    } else if (!connected && wasConnected_) {
        status_ = StatusText::kConnecting;
        std::fprintf(out_, "%s\n", status_.c_str());
        std::fflush(out_);
    }
    wasConnected_ = connected;
}

SourceStatus TerminalView::sourceStatus() const {
    SourceStatus status = model_ ? model_->sourceStatus() : SourceStatus();
    status.firstConnect = false;
    status.updatedAt = updatedAt_;
    if (model_ && !model_->isConnected() && status.phase != SourceStatus::Phase::Disconnected)
        status.phase = SourceStatus::Phase::Connecting;
    return status;
}

std::string TerminalView::statusLine() const {
    std::string text = "Vantorel";
    if (!model_) return text;
    // The window's status line: source, state, replay position, a lost, stale or finished
    // stream, and before any channel why there is none yet.
    const SourceStatus status = sourceStatus();
    if (!model_->logGenerator() && status.connectProblem.empty()) return text;
    text += " - " + StatusText::line(status);
    if (model_->logGenerator()) text += " - " + std::to_string(model_->messagesDecoded()) + " messages decoded";
    return text;
}

std::string TerminalView::screen() const {
    std::string text = statusLine() + "\n";
    for (const Sparkline& s : sparklines_) text += s.line(1 << 16) + "\n";
    text += "\n";
    if (model_) text += TreeFormatter::compactTree(model_->topLevelNodes());
    return text;
}

void TerminalView::readKeys() {
    char buffer[256];
    const ssize_t n = ::read(STDIN_FILENO, buffer, sizeof buffer);
    if (n <= 0) {  // the terminal is gone: keys end, the display goes on until a signal
        keys_->setEnabled(false);
        return;
    }
    pendingKeys_.append(buffer, static_cast<size_t>(n));
    const int rows = std::max(1, height_ - static_cast<int>(sparklines_.size()) - TerminalNavigator::kHeaderLines -
                                     TerminalNavigator::kFooterLines);
    for (TerminalKeys::Key key : TerminalKeys::take(pendingKeys_)) {
        if (!navigator_.handle(key, rows)) {
            QCoreApplication::exit(0);
            return;
        }
    }
    draw();
}

void TerminalView::draw() {
    winsize size{};
    const bool known = ::ioctl(fileno(out_), TIOCGWINSZ, &size) == 0 && size.ws_col > 0 && size.ws_row > 0;
    width_ = known ? size.ws_col : 80;
    height_ = known ? size.ws_row : 24;
    // Home, then every line cleared to its end; the last line without a newline so
    // that the window never scrolls; the rest of the screen cleared.
    std::string text = "\x1b[H";
    // The sparklines go under the status line; the tree gets the lines left.
    const int plots = std::min(static_cast<int>(sparklines_.size()), std::max(0, height_ - 1));
    auto lines = navigator_.render(statusLine(), width_, height_ - plots);
    for (int i = 0; i < plots && !lines.empty(); ++i)
        lines.insert(lines.begin() + 1 + i, sparklines_[static_cast<size_t>(i)].line(width_));
    // Values that no longer follow the stream are dimmed, as the window greys them.
    const bool stale = model_ && StatusText::isStale(sourceStatus());
    const size_t firstRow = TerminalNavigator::kHeaderLines + static_cast<size_t>(plots);
    for (size_t i = 0; i < lines.size(); ++i) {
        const bool cursor = lines[i].starts_with("> ") && i >= firstRow;
        if (cursor) text += (stale ? "\x1b[2;7m" : "\x1b[7m") + lines[i] + "\x1b[0m";
        else if (stale && i >= firstRow && i + TerminalNavigator::kFooterLines < lines.size() && !lines[i].empty()) text += "\x1b[2m" + lines[i] + "\x1b[0m";
        else text += lines[i];
        text += i + 1 < lines.size() ? "\x1b[K\n" : "\x1b[K";
    }
    text += "\x1b[J";
    std::fwrite(text.data(), 1, text.size(), out_);
    std::fflush(out_);
}

void TerminalView::updateViewControllerFromModel() {
    ++refreshes_;
    if (model_ && model_->isConnected() && (model_->messagesDecoded() != messagesShown_ || !updatedAt_.isValid())) {
        messagesShown_ = model_->messagesDecoded();
        updatedAt_ = QDateTime::currentDateTime();
    }
    if (interactive_) {
        navigator_.setRoot(model_ ? model_->topLevelNodes() : nullptr);
        draw();
        return;
    }
    std::fprintf(out_, "----\n%s", screen().c_str());
    std::fflush(out_);
}

int TerminalView::run(const MonitorLauncher::Source& source, const char* program,
                      const std::vector<std::string>& plots, const std::function<void(VantorelModel&)>& started) {
    std::string error;
    TerminalView view;
    view.setPlots(plots);
    MonitorLauncher launcher;
    if (!launcher.start(source, &view, &error)) {
        std::fprintf(stderr, "%s: %s\n", program, error.c_str());
        return 1;
    }
    std::fprintf(stderr, "%s: %s; %s ends\n", program, launcher.description().c_str(),
                 view.interactive_ ? "q or Ctrl-C" : "Ctrl-C");
    QuitOnSignal quit;
    view.setModel(launcher.model());
    if (started) started(*launcher.model());
    return QCoreApplication::exec();
}

}  // namespace vantorel
