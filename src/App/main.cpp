// vantorel: the program a user starts: the window with drill-down panes on the embedded emulator, a replay or a running service; the terminal view when there is no display.
#include "App/VantorelApp.h"
#include "Platform/QuitOnSignal.h"
#include "Platform/SystemLog.h"
#include "Monitor/MonitorLauncher.h"
#include "Monitor/TerminalFallback.h"
#include "Monitor/TerminalView.h"
#include "Platform/TerminalText.h"

#include <QApplication>
#include <QCommandLineParser>
#include <QCoreApplication>
#include <QGuiApplication>

#include <cstdio>
#include <cstdlib>

namespace {

// Reads the options with `app` (a QCoreApplication or QApplication); prints the
// problem and gives nothing on bad use (exit code 2), or the help and exit code 0.
std::optional<vantorel::MonitorLauncher::Source> parseOptions(QCoreApplication& app, QCommandLineParser& parser,
                                                              int* exitCode) {
    QCoreApplication::setApplicationName("vantorel");
    parser.setApplicationDescription(
        "Vantorel: watch, live, what a cellular modem reports, as drill-down panes.\n"
        "Without a source, the built-in modem emulator runs in-process (UTRAN).\n"
        "Keys: arrows move, Enter drills down, Backspace or Alt+Left goes back\n"
        "(in the terminal view also PgUp/PgDn to scroll and q to quit).");
    const QCommandLineOption helpOption = parser.addHelpOption();
    vantorel::MonitorLauncher::addOptions(parser);
    parser.addOption({"allow-save", "Offer the snapshot save button (also: AllowSaveButton in the settings)."});
    parser.addOption({"verbose", "Mirror the system log to stderr."});
    // parse(), not process(): a usage error is exit code 2, as in vantorel-cli.
    *exitCode = 2;
    if (!parser.parse(app.arguments())) {
        std::fprintf(stderr, "vantorel: %s (see --help)\n", qPrintable(parser.errorText()));
        return std::nullopt;
    }
    if (parser.isSet(helpOption) || parser.isSet("help-all")) {
        std::fputs(qPrintable(parser.helpText()), stdout);
        *exitCode = 0;
        return std::nullopt;
    }
    vantorel::SystemLog::setMirrorToStderr(parser.isSet("verbose"));
    std::string error;
    auto source = vantorel::MonitorLauncher::sourceFrom(parser, &error);
    if (!source) std::fprintf(stderr, "vantorel: %s\n", error.c_str());
    return source;
}

}  // namespace

int main(int argc, char** argv) {
    using namespace vantorel;
    QCommandLineParser parser;
    // Asked before QApplication exists: Qt aborts the process on a display that does not answer.
    TerminalFallback display;
    if (const auto why = display.check()) {
        QCoreApplication app(argc, argv);
        int exitCode = 0;
        auto source = parseOptions(app, parser, &exitCode);
        if (!source) return exitCode;
        std::fprintf(stderr, "vantorel: %s: showing the terminal view\n", why->c_str());
        return TerminalView::run(*source, "vantorel");
    }

    // The X server answered the probe, but may still refuse Qt's own connection (it went
    // away, or reset when another client left): Qt then takes the offscreen platform
    // rather than abort, and the terminal view is shown. The probe's connection is held
    // until Qt's is open, so that its close cannot be what resets the server.
    const bool fallbackPlatform = display.holdsDisplay();
    if (fallbackPlatform) qputenv("QT_QPA_PLATFORM", TerminalFallback::kPlatforms);
    QApplication app(argc, argv);
    if (fallbackPlatform) qunsetenv("QT_QPA_PLATFORM");
    display.release();
    int exitCode = 0;
    auto source = parseOptions(app, parser, &exitCode);
    if (!source) return exitCode;
    if (fallbackPlatform && QGuiApplication::platformName() != QStringLiteral("xcb")) {
        std::fprintf(stderr, "vantorel: display %s refused the window's connection: showing the terminal view\n",
                     TerminalText::visible(qgetenv("DISPLAY").toStdString()).c_str());
        return TerminalView::run(*source, "vantorel");
    }
    VantorelApp::Options options;
    options.source = *source;
    options.allowSave = parser.isSet("allow-save");
    VantorelApp vantorelApp(options);
    std::string error;
    const bool launched = vantorelApp.applicationDidFinishLaunching(&error);
    if (!launched) std::fprintf(stderr, "vantorel: %s\n", error.c_str());  // and in the window, until it is closed
    QuitOnSignal quit;
    int code = QApplication::exec();
    if (!launched) code = 1;
    vantorelApp.applicationWillTerminate();
    return code;
}
