// Tests for ResourceBundle: listing and loading the application's property-list resources (Parts 3.2, 7.1).
#include "Platform/ResourceBundle.h"

#include "PropertyList/Dictionary.h"

#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

using namespace vantorel;

TEST(ResourceBundle, CompiledInTemplatesAreListedAndLoad) {
    auto paths = ResourceBundle::pathsForResourcesOfType("plist");
    ASSERT_FALSE(paths.empty());
    EXPECT_NE(std::find(paths.begin(), paths.end(), ":/templates/UTRAN.plist"), paths.end());
    auto utran = ResourceBundle::loadPropertyList("UTRAN", "plist");
    ASSERT_TRUE(utran);
    EXPECT_TRUE(utran->asDictionary());
}

TEST(ResourceBundle, MissingOrMalformedResourcesLoadNothing) {
    EXPECT_FALSE(ResourceBundle::loadPropertyList("NoSuchTemplate", "plist"));
    QTemporaryDir dir;
    QFile f(dir.filePath("Broken.plist"));
    ASSERT_TRUE(f.open(QIODevice::WriteOnly));
    f.write("<plist><dict><key>cut");
    f.close();
    ResourceBundle::setDirectory(dir.path().toStdString());
    EXPECT_FALSE(ResourceBundle::loadPropertyList("Broken", "plist"));
    EXPECT_EQ(ResourceBundle::pathsForResourcesOfType("plist").size(), 1u);
    EXPECT_TRUE(ResourceBundle::pathsForResourcesOfType("json").empty());
    ResourceBundle::setDirectory("");
    EXPECT_EQ(ResourceBundle::directory(), ":/templates");
}
