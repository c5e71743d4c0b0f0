// SystemLogCapture: the observer that keeps the system-log lines written while it lives.
#include "Platform/SystemLogCapture.h"

#include "Platform/SystemLog.h"

namespace vantorel {

SystemLogCapture::SystemLogCapture() {
    SystemLog::setObserver([this](int priority, const std::string& line) {
        std::lock_guard<std::mutex> lock(mutex_);
        lines_.push_back({priority, line});
    });
}

SystemLogCapture::~SystemLogCapture() { SystemLog::setObserver(nullptr); }

std::vector<SystemLogCapture::Line> SystemLogCapture::lines() const {
    std::lock_guard<std::mutex> lock(mutex_);
    return lines_;
}

int SystemLogCapture::count(int priority, const std::string& text) const {
    std::lock_guard<std::mutex> lock(mutex_);
    int n = 0;
    for (const auto& l : lines_)
        if (l.priority == priority && l.text == text) ++n;
    return n;
}

bool SystemLogCapture::containsText(const std::string& text) const {
    std::lock_guard<std::mutex> lock(mutex_);
    for (const auto& l : lines_)
        if (l.text == text) return true;
    return false;
}

void SystemLogCapture::clear() {
    std::lock_guard<std::mutex> lock(mutex_);
    lines_.clear();
}

}  // namespace vantorel
