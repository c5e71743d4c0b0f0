// Tests why a local message port cannot be created: a name that can be no port at all against a name a live port holds, and that a file under the name which is no socket survives.
#include "Platform/LocalMessagePort.h"
#include "Platform/PortDirectory.h"
#include "support/EventLoopWait.h"

#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace vantorel {
namespace {

TEST(PortName, NamesThatCanBeNoPortAreToldApartFromANameInUse) {
    QTemporaryDir dir;
    const std::string plainFile = dir.filePath("notes.txt").toStdString();
    QFile file(QString::fromStdString(plainFile));
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write("keep me");
    file.close();
    const std::string live = testing::uniquePortName("live");
    const auto holder = LocalMessagePort::create(live, {});
    ASSERT_TRUE(holder);

    const std::vector<std::pair<std::string, bool>> rows = {  // name, in use
        {"/proc/vantorel-port", false},
        {"/nonexistent-dir-of-vantorel/port", false},
        {"sub/port", false},
        {"", false},
        {std::string("a\0b", 3), false},
        {"/tmp/" + std::string(120, 'x'), false},
        {plainFile, false},
        {live, true},
        {PortDirectory::socketPathFor(live, nullptr), true},
    };
    for (const auto& [name, inUse] : rows) {
        SCOPED_TRACE(name);
        LocalMessagePort::CreateFailure failure;
        EXPECT_FALSE(LocalMessagePort::create(name, {}, &failure));
        EXPECT_EQ(failure.nameInUse, inUse);
        EXPECT_EQ(failure.reason.rfind(inUse ? "the name is in use" : "not a valid port name: ", 0), 0u) << failure.reason;
    }
    EXPECT_TRUE(file.open(QIODevice::ReadOnly));
    EXPECT_EQ(file.readAll(), "keep me");
}

}  // namespace
}  // namespace vantorel
