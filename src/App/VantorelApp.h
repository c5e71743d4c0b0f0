// VantorelApp: the application object and its own delegate: launch and exit, the preferences, the status line, refreshing the panes, the save screen and the signal plot.
#pragma once

#include "App/NavigationControllerDelegate.h"
#include "App/PaneApplication.h"
#include "Model/ApplicationObject.h"
#include "Model/SignalSampler.h"
#include "Monitor/MonitorLauncher.h"

#include <QDateTime>
#include <QObject>

#include <memory>
#include <string>

class QMainWindow;

namespace vantorel {

class NavigationController;
class SignalPlotWindow;
class VantorelModel;
class VantorelPaneController;
class VantorelSaveViewController;

class VantorelApp : public QObject,
                    public ApplicationObject,
                    public PaneApplication,
                    public NavigationControllerDelegate {
    Q_OBJECT
public:
    struct Options {
        MonitorLauncher::Source source;  // where the monitor's data comes from
        bool allowSave = false;          // --allow-save
    };

    explicit VantorelApp(Options options);
    ~VantorelApp() override;

    // Reads the preferences, opens the window on the root pane and starts the
    // monitor (connecting begins once the event loop runs); false (with *error) when the in-process service
    // cannot start: the window then shows *error in its status line and in the root pane.
    bool applicationDidFinishLaunching(std::string* error);
    void applicationWillTerminate();

    void getRSSIPref();
    void getSaveButtonPref();
    void _setGSMRSSI(bool value);

    void updateViewControllerFromModel() override;
    void updateStatusForViewController(VantorelPaneController* pane);
    // How long the saved file's path stays on the status line.
    static constexpr int kSavedPathMilliseconds = 5000;
    void navigationControllerWillShow(NavigationController& navigationController,
                                      VantorelPaneController& pane) override;
    void showSaveView() override;
    void closeSaveView() override;
    bool allowSaveButton() const override { return _allowSaveButton; }
    void showSignalPlot() override;
    void plotValue(const std::string& path) override;
    // Takes the plotted values from the display tree; run at every display tick.
    void sampleSignals();

    // Properties and observers.
    QMainWindow* window() const { return _window.get(); }
    NavigationController* navigationController() const { return _navController; }
    VantorelSaveViewController* saveViewController() const { return _saveViewController; }
    VantorelModel* model() const { return launcher_ ? launcher_->model() : nullptr; }
    const SignalSampler& signalSampler() const { return sampler_; }
    SignalPlotWindow* signalPlotWindow() const { return plotWindow_; }

private:
    std::unique_ptr<QMainWindow> _window;
    NavigationController* _navController = nullptr;  // owned by the window
    VantorelSaveViewController* _saveViewController = nullptr;
    std::unique_ptr<MonitorLauncher> launcher_;      // `_model`, with the service it talks to
    bool _unsetRSSI = false;
    bool _allowSaveButton = false;
    std::string _updateMessage;
    Options options_;
    uint64_t messagesShown_ = 0;   // the model's count when "Updated" was last set
    QDateTime updatedAt_;
    std::string launchError_;      // why the source could not start; shown instead of any status
    std::string savedPath_;        // shown instead of the status for a few seconds after a save
    int saveNotices_ = 0;          // the newest notice's number, so an older timer leaves it alone
    SignalSampler sampler_;        // sampled for the whole session, whether the plot is open or not
    // A window of its own owned by the main window: closing the main window still quits.
    SignalPlotWindow* plotWindow_ = nullptr;
};

}  // namespace vantorel
