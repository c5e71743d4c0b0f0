// Tests for DiagnosticLogDirectory: the default from XDG_STATE_HOME or HOME, the overrides and creation on demand (DESIGN.md "Diagnostic-log directory").
#include "Platform/DiagnosticLogDirectory.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <cstdlib>
#include <optional>
#include <string>

using namespace vantorel;

namespace {

// Sets (or, with nullopt, unsets) one environment variable for a scope and restores it.
class ScopedEnvironment {
public:
    ScopedEnvironment(const char* name, std::optional<std::string> value) : name_(name) {
        if (const char* old = std::getenv(name)) old_ = old;
        if (value)
            setenv(name, value->c_str(), 1);
        else
            unsetenv(name);
    }
    ~ScopedEnvironment() {
        if (old_)
            setenv(name_, old_->c_str(), 1);
        else
            unsetenv(name_);
    }

private:
    const char* name_;
    std::optional<std::string> old_;
};

// Every test starts with neither the variable nor an override.
class DiagnosticLogDirectoryTest : public ::testing::Test {
protected:
    void TearDown() override { DiagnosticLogDirectory::setOverride(""); }
    ScopedEnvironment noVariable{DiagnosticLogDirectory::kEnvironmentVariable, std::nullopt};
};

}  // namespace

TEST_F(DiagnosticLogDirectoryTest, DefaultIsUnderXdgStateHome) {
    ScopedEnvironment state("XDG_STATE_HOME", "/srv/state");
    EXPECT_EQ(DiagnosticLogDirectory::path(), "/srv/state/vantorel/DiagnosticLogs");
    EXPECT_EQ(DiagnosticLogDirectory::defaultPath(), "/srv/state/vantorel/DiagnosticLogs");
}

TEST_F(DiagnosticLogDirectoryTest, TrailingSlashOfXdgStateHomeIsNotDoubled) {
    ScopedEnvironment state("XDG_STATE_HOME", "/srv/state/");
    EXPECT_EQ(DiagnosticLogDirectory::path(), "/srv/state/vantorel/DiagnosticLogs");
}

TEST_F(DiagnosticLogDirectoryTest, WithoutXdgStateHomeTheDefaultIsUnderHomeLocalState) {
    ScopedEnvironment state("XDG_STATE_HOME", std::nullopt);
    ScopedEnvironment home("HOME", "/home/tester");
    EXPECT_EQ(DiagnosticLogDirectory::path(), "/home/tester/.local/state/vantorel/DiagnosticLogs");
}

TEST_F(DiagnosticLogDirectoryTest, EmptyOrRelativeXdgStateHomeIsIgnoredAsTheXdgRulesSay) {
    ScopedEnvironment home("HOME", "/home/tester");
    {
        ScopedEnvironment state("XDG_STATE_HOME", "");
        EXPECT_EQ(DiagnosticLogDirectory::path(), "/home/tester/.local/state/vantorel/DiagnosticLogs");
    }
    {
        ScopedEnvironment state("XDG_STATE_HOME", "relative/state");
        EXPECT_EQ(DiagnosticLogDirectory::path(), "/home/tester/.local/state/vantorel/DiagnosticLogs");
    }
}

TEST_F(DiagnosticLogDirectoryTest, OverrideReplacesTheDefaultAndAnEmptyTextRestoresIt) {
    ScopedEnvironment state("XDG_STATE_HOME", "/srv/state");
    DiagnosticLogDirectory::setOverride("/tmp/logs/");
    EXPECT_EQ(DiagnosticLogDirectory::path(), "/tmp/logs");
    DiagnosticLogDirectory::setOverride("");
    EXPECT_EQ(DiagnosticLogDirectory::path(), "/srv/state/vantorel/DiagnosticLogs");
}

TEST_F(DiagnosticLogDirectoryTest, EnvironmentVariableWinsOverTheOverrideAndTheDefault) {
    ScopedEnvironment state("XDG_STATE_HOME", "/srv/state");
    DiagnosticLogDirectory::setOverride("/tmp/logs");
    {
        ScopedEnvironment variable(DiagnosticLogDirectory::kEnvironmentVariable, "/var/diag");
        EXPECT_EQ(DiagnosticLogDirectory::path(), "/var/diag");
    }
    {
        ScopedEnvironment empty(DiagnosticLogDirectory::kEnvironmentVariable, "");  // set but empty: ignored
        EXPECT_EQ(DiagnosticLogDirectory::path(), "/tmp/logs");
    }
}

TEST_F(DiagnosticLogDirectoryTest, EnsureExistsCreatesTheDirectoryWithItsParents) {
    QTemporaryDir tmp;
    ScopedEnvironment state("XDG_STATE_HOME", tmp.path().toStdString());
    const QString expected = tmp.path() + "/vantorel/DiagnosticLogs";
    ASSERT_FALSE(QFileInfo::exists(expected));
    std::string error = "untouched";
    EXPECT_TRUE(DiagnosticLogDirectory::ensureExists(&error));
    EXPECT_TRUE(QFileInfo(expected).isDir());
    EXPECT_EQ(error, "untouched");
    EXPECT_TRUE(DiagnosticLogDirectory::ensureExists(nullptr));  // an existing directory is fine
}

TEST_F(DiagnosticLogDirectoryTest, EnsureExistsFailsWithAReasonUnderARegularFile) {
    QTemporaryDir tmp;
    QFile file(tmp.filePath("plain"));
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.close();
    DiagnosticLogDirectory::setOverride(tmp.filePath("plain/logs").toStdString());
    std::string error;
    EXPECT_FALSE(DiagnosticLogDirectory::ensureExists(&error));
    EXPECT_NE(error.find(tmp.filePath("plain/logs").toStdString()), std::string::npos) << error;
    EXPECT_FALSE(DiagnosticLogDirectory::ensureExists(nullptr));

    DiagnosticLogDirectory::setOverride(tmp.filePath("plain").toStdString());  // the file itself
    EXPECT_FALSE(DiagnosticLogDirectory::ensureExists(&error));
    EXPECT_EQ(error, "not a directory: " + tmp.filePath("plain").toStdString());
}
