// SystemLogCapture: records the system-log lines written while it lives, so tests can assert exact lines.
#pragma once

#include <mutex>
#include <string>
#include <utility>
#include <vector>

namespace vantorel {

class SystemLogCapture {
public:
    struct Line {
        int priority;
        std::string text;
    };

    SystemLogCapture();
    ~SystemLogCapture();
    SystemLogCapture(const SystemLogCapture&) = delete;
    SystemLogCapture& operator=(const SystemLogCapture&) = delete;

    std::vector<Line> lines() const;
    // How many captured lines equal text exactly at that priority.
    int count(int priority, const std::string& text) const;
    bool contains(int priority, const std::string& text) const { return count(priority, text) > 0; }
    // Any captured line at all with that text, whatever its priority.
    bool containsText(const std::string& text) const;
    void clear();

private:
    mutable std::mutex mutex_;
    std::vector<Line> lines_;
};

}  // namespace vantorel
