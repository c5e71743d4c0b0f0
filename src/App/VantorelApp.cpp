// VantorelApp: the application object: launch and exit, the status line, the pane refresh walk, the save screen.
#include "App/VantorelApp.h"

#include "App/NavigationController.h"
#include "App/SignalPlotWindow.h"
#include "App/VantorelPaneController.h"
#include "App/VantorelSaveViewController.h"
#include "Model/DisplayPath.h"
#include "Model/VantorelModel.h"
#include "Monitor/StatusText.h"
#include "Platform/Preferences.h"

#include <QDateTime>
#include <QTimer>
#include <QGuiApplication>
#include <QMainWindow>
#include <QScreen>

namespace vantorel {

VantorelApp::VantorelApp(Options options) : options_(std::move(options)) {}

VantorelApp::~VantorelApp() {
    if (launcher_) applicationWillTerminate();
}

bool VantorelApp::applicationDidFinishLaunching(std::string* error) {
    getRSSIPref();
    getSaveButtonPref();

    // The window takes the main screen's bounds (a zero rectangle without a screen).
    _window = std::make_unique<QMainWindow>();
    _window->setWindowTitle("Vantorel");
    QScreen* screen = QGuiApplication::primaryScreen();
    const QRect bounds = screen ? screen->availableGeometry() : QRect();
    // A desktop window: the screen's height, a phone-like width.
    _window->resize(bounds.isEmpty() ? QSize(480, 800) : QSize(std::min(bounds.width(), 560), bounds.height() * 9 / 10));

    launcher_ = std::make_unique<MonitorLauncher>();
    _updateMessage = StatusText::kConnecting;

    auto root = std::make_unique<VantorelPaneController>(nullptr, "/", this);
    root->setStatus(std::string(StatusText::kFirstConnecting), true);
    auto* navigation = new NavigationController(std::move(root));
    _navController = navigation;
    _window->setCentralWidget(navigation);
    _window->show();
    _window->raise();
    _window->activateWindow();
    // The delegate is set once the root is on screen: the first pane keeps reading
    // "Connecting" until the first update (deliberate: the root is not told
    // "Connecting..." when it first appears, so the first screen reads without dots).
    navigation->setDelegate(this);

    // Creates the model and queues restartMonitor on the main queue: connecting
    // starts after launch returns.
    if (!launcher_->start(options_.source, this, error)) {
        // A source that cannot start (a replay the service refuses): the window says why
        // instead of standing empty.
        launchError_ = error && !error->empty() ? *error : "the source could not start";
        updateStatusForViewController(_navController->topPane());
        return false;
    }
    connect(model(), &VantorelModel::displayTicked, this, &VantorelApp::sampleSignals);
    return true;
}

void VantorelApp::applicationWillTerminate() {
    if (_unsetRSSI) _setGSMRSSI(false);
    _unsetRSSI = false;
    _updateMessage.clear();
    if (_saveViewController) {
        _saveViewController->deleteLater();
        _saveViewController = nullptr;
    }
    plotWindow_ = nullptr;  // deleted with the window
    if (_window) _window->hide();
    _window.reset();
    _navController = nullptr;
    launcher_.reset();  // the model closes its ports, then the in-process service stops
}

void VantorelApp::getRSSIPref() {
    const std::optional<bool> shown = Preferences::ownBool(Preferences::kShowGSMRSSI);
    if (!shown.value_or(false)) {
        _unsetRSSI = true;
        _setGSMRSSI(true);
    }
}

void VantorelApp::getSaveButtonPref() {
    // The internal-install marker file; our own setting and
    // --allow-save also enable it, since desktop installs have no such marker.
    _allowSaveButton = Preferences::internalInstallMarkerExists() ||
                       Preferences::ownBool(Preferences::kAllowSaveButton).value_or(false) || options_.allowSave;
}

void VantorelApp::_setGSMRSSI(bool value) { Preferences::writeShellBool(Preferences::kShowGSMRSSI, value); }

void VantorelApp::updateViewControllerFromModel() {
    VantorelModel* m = model();
    if (!_navController || !m) return;
    const std::vector<VantorelPaneController*> panes = _navController->panes();
    for (size_t i = 0; i < panes.size(); ++i) {
        NodeRef node = i == 0 ? m->topLevelNodes() : m->nodeAtPath(panes[i]->path());
        if (i > 0 && !node) {
            // Its branch vanished: back to the pane below it; the ones above are not reloaded.
            _navController->popToViewController(panes[i - 1], true);
            break;
        }
        panes[i]->reloadWithNode(node);
    }
    // "Updated" moves only with new data, not with a change of the stream's state.
    if (m->isConnected() && (m->messagesDecoded() != messagesShown_ || !updatedAt_.isValid())) {
        messagesShown_ = m->messagesDecoded();
        updatedAt_ = QDateTime::currentDateTime();
    }
    updateStatusForViewController(_navController->topPane());
}

void VantorelApp::updateStatusForViewController(VantorelPaneController* pane) {
    if (!pane) return;
    if (!launchError_.empty()) {
        pane->setStatus(launchError_, false);
        pane->setPlaceholder(launchError_);
        return;
    }
    VantorelModel* m = model();
    SourceStatus status = m ? m->sourceStatus() : SourceStatus();
    status.firstConnect = false;
    status.updatedAt = updatedAt_;
    // Closed on purpose or not yet open: connecting; lost: stale until it is back.
    if (!(m && m->isConnected()) && status.phase != SourceStatus::Phase::Disconnected)
        status.phase = SourceStatus::Phase::Connecting;
    _updateMessage = savedPath_.empty() ? StatusText::line(status) : "Saved " + savedPath_;
    pane->setStatus(_updateMessage, status.phase == SourceStatus::Phase::Connecting ||
                                        status.phase == SourceStatus::Phase::Disconnected);
    // Every pane of the stack, so that going back shows greyed values too.
    const bool stale = StatusText::isStale(status);
    pane->setStale(stale);
    if (_navController)
        for (VantorelPaneController* each : _navController->panes()) each->setStale(stale);
    // A pane with nothing to show says why in its middle: no service, a source that failed.
    pane->setPlaceholder(!status.connectProblem.empty() || !status.backendProblem.empty() ? StatusText::line(status)
                                                                                          : std::string());
}

void VantorelApp::navigationControllerWillShow(NavigationController&, VantorelPaneController& pane) {
    updateStatusForViewController(&pane);
}

void VantorelApp::showSaveView() {
    if (_saveViewController || !model()) return;
    _saveViewController = new VantorelSaveViewController(model()->getSaveContents(), this, _window.get());
    _saveViewController->open();  // modal over the window
}

void VantorelApp::closeSaveView() {
    if (!_saveViewController) return;
    if (!_saveViewController->lastWritePath().empty() && !_saveViewController->errorAlert()) {
        savedPath_ = _saveViewController->lastWritePath();
        const int notice = ++saveNotices_;
        QTimer::singleShot(kSavedPathMilliseconds, this, [this, notice] {
            if (notice != saveNotices_) return;
            savedPath_.clear();
            if (_navController) updateStatusForViewController(_navController->topPane());
        });
        if (_navController) updateStatusForViewController(_navController->topPane());
    }
    _saveViewController->hide();
    _saveViewController->deleteLater();
    _saveViewController = nullptr;
}

}  // namespace vantorel

namespace vantorel {

void VantorelApp::sampleSignals() {
    VantorelModel* m = model();
    if (!m) return;
    sampler_.sample(m->tickTimeMs(), m->sourceStatus().decoderTechnology, m->pathIndex());
    if (plotWindow_ && plotWindow_->isVisible()) plotWindow_->refresh();
}

void VantorelApp::showSignalPlot() {
    if (!_window) return;
    if (!plotWindow_) {
        plotWindow_ = new SignalPlotWindow(sampler_, _window.get());
    }
    plotWindow_->refresh();
    plotWindow_->show();
    plotWindow_->raise();
    plotWindow_->activateWindow();
}

void VantorelApp::plotValue(const std::string& path) {
    // A value of a list entry follows its cell, not its position in the list.
    sampler_.addKey(model() ? DisplayPath::following(path, model()->pathIndex()) : path);
    showSignalPlot();
}

}  // namespace vantorel
