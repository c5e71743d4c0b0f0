// EventLoopWait: shared test helpers for code driven by the Qt event loop: wait for a condition, run the loop a while, unique port names.
#pragma once

#include <functional>
#include <string>

namespace vantorel::testing {

// Runs this thread's event loop in short slices until done() holds or timeoutMs
// passed; returns done().
bool waitUntil(const std::function<bool()>& done, int timeoutMs = 2000);
// Runs this thread's event loop for ms milliseconds.
void spin(int ms);
// "vantorel.test.<tag>.<pid>.<n>": unique per process and per call.
std::string uniquePortName(const std::string& tag);

}  // namespace vantorel::testing
