// main: Google Benchmark entry point with a QCoreApplication around the benchmarks (the UTRAN template is a Qt resource); the stderr mirror of the system log stays off.
#include "Platform/SystemLog.h"

#include <QCoreApplication>
#include <benchmark/benchmark.h>

int main(int argc, char** argv) {
    // Benchmark flags first: Initialize removes the ones it knows from argv.
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
    QCoreApplication app(argc, argv);
    // Sections log a line per record; with the mirror on, the figures would measure the terminal.
    vantorel::SystemLog::setMirrorToStderr(false);
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
