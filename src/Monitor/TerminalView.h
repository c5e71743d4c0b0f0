// TerminalView: the monitor in a terminal: plays the application object and shows the status line and the display tree on every refresh, navigable with keys on a terminal.
#pragma once

#include "Model/ApplicationObject.h"
#include "Monitor/MonitorLauncher.h"
#include "Monitor/Sparkline.h"
#include "Monitor/StatusText.h"
#include "Monitor/TerminalNavigator.h"

#include <QObject>

#include <cstdio>
#include <functional>
#include <memory>
#include <string>
#include <vector>

class QSocketNotifier;
class QTimer;

namespace vantorel {

class TerminalRawMode;
class VantorelModel;

class TerminalView : public QObject, public ApplicationObject {
    Q_OBJECT
public:
    // Writes to `out`. When `out` and standard input are both a terminal, the view
    // takes the keys (arrows, Enter, Backspace, PgUp/PgDn, Home/End, q) and draws
    // one level of the tree in the window; otherwise it prints plain screens one
    // after another.
    explicit TerminalView(std::FILE* out = stdout);
    ~TerminalView() override;

    void setModel(VantorelModel* model);
    // One sparkline per key (a display-tree path), drawn under the status line and
    // sampled at every display tick that brought new data.
    void setPlots(const std::vector<std::string>& keys);
    void updateViewControllerFromModel() override;
    int refreshes() const { return refreshes_; }

    // The status line: "Vantorel - Updated ... - 12 messages decoded".
    std::string statusLine() const;
    // The text of one plain screen: the status line, the sparklines, then the tree.
    std::string screen() const;

    // The terminal view on `source` until q (on a terminal) or SIGINT/SIGTERM;
    // `program` prefixes messages. `plots`: setPlots; `started`: called with the model
    // once it exists (observers such as an export attach there). Needs a running
    // QCoreApplication. Returns the exit code.
    static int run(const MonitorLauncher::Source& source, const char* program,
                   const std::vector<std::string>& plots = {},
                   const std::function<void(VantorelModel&)>& started = {});

private:
    // The model's status as this view shows it (its own "Updated" time).
    SourceStatus sourceStatus() const;
    void watchConnection();
    void readKeys();
    void draw();

    std::FILE* out_;
    bool interactive_;
    VantorelModel* model_ = nullptr;
    QTimer* connectionTimer_ = nullptr;
    bool wasConnected_ = true;
    int refreshes_ = 0;
    std::string status_ = StatusText::kConnecting;  // the plain output's "Connecting..." line
    QDateTime updatedAt_;      // when new data was last shown
    uint64_t messagesShown_ = 0;
    TerminalNavigator navigator_;
    std::unique_ptr<TerminalRawMode> rawMode_;
    QSocketNotifier* keys_ = nullptr;
    std::string pendingKeys_;
    int width_ = 0, height_ = 0;
    std::vector<Sparkline> sparklines_;
};

}  // namespace vantorel
