// Tests DiagnosticLogDirectory: which of the variable, the override, XDG_STATE_HOME and HOME wins, and creation on demand.
#include "Platform/DiagnosticLogDirectory.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <optional>
#include <string>
#include <vector>

namespace vantorel {
namespace {

using Env = std::optional<std::string>;

// Sets (or, with nullopt, unsets) one environment variable for a scope and restores it.
class ScopedEnvironment {
public:
    ScopedEnvironment(const char* name, Env value) : name_(name) {
        if (const char* old = std::getenv(name)) old_ = old;
        value ? setenv(name, value->c_str(), 1) : unsetenv(name);
    }
    ~ScopedEnvironment() { old_ ? setenv(name_, old_->c_str(), 1) : unsetenv(name_); }

private:
    const char* name_;
    Env old_;
};

TEST(DiagnosticLogDirectory, TheFirstUsableSourceWins) {
    struct Row { Env variable, override_, stateHome, home; std::string path; };
    const std::vector<Row> rows = {
        {{}, {}, "/srv/state", "/home/u", "/srv/state/vantorel/DiagnosticLogs"},
        {{}, {}, {}, "/home/u/", "/home/u/.local/state/vantorel/DiagnosticLogs"},
        {{}, {}, "", "/home/u", "/home/u/.local/state/vantorel/DiagnosticLogs"},
        {{}, {}, "relative/state", "/home/u", "/home/u/.local/state/vantorel/DiagnosticLogs"},
        {{}, "/tmp/logs/", "/srv/state", "/home/u", "/tmp/logs"},
        {"/var/logs/", "/tmp/logs", "/srv/state", "/home/u", "/var/logs"},
        {"", {}, "/srv/state", "/home/u", "/srv/state/vantorel/DiagnosticLogs"},
    };
    for (const Row& row : rows) {
        ScopedEnvironment variable(DiagnosticLogDirectory::kEnvironmentVariable, row.variable);
        ScopedEnvironment state("XDG_STATE_HOME", row.stateHome);
        ScopedEnvironment home("HOME", row.home);
        DiagnosticLogDirectory::setOverride(row.override_.value_or(""));
        EXPECT_EQ(DiagnosticLogDirectory::path(), row.path);
    }
    DiagnosticLogDirectory::setOverride("");
}

}  // namespace
}  // namespace vantorel
