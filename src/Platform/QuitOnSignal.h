// QuitOnSignal: SIGINT/SIGTERM end the Qt event loop cleanly (a self-pipe read by a QSocketNotifier), for the daemon, the CLI and the application.
#pragma once

#include <QObject>

class QSocketNotifier;

namespace vantorel {

// While an instance lives, SIGINT and SIGTERM make QCoreApplication::quit() run on
// the event loop; the handler itself only writes one byte to a pipe.
class QuitOnSignal : public QObject {
    Q_OBJECT
public:
    explicit QuitOnSignal(QObject* parent = nullptr);
    ~QuitOnSignal() override;
    // The signal that ended the loop (0 if none).
    static int lastSignal();

private:
    QSocketNotifier* notifier_ = nullptr;
};

}  // namespace vantorel
