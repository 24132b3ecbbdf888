// The example platform configuration that the package installs is valid
// and shows the values that apply without a configuration file.
#include "Platform.h"

#include <fstream>
#include <sstream>

#include <gtest/gtest.h>

namespace
{

TEST(ExampleConfiguration, ParsesAndShowsTheDefaults)
{
    const std::string path =
        std::string(SELPROV_SOURCE_DIR) + "/platform/platform.conf.example";
    std::ifstream in(path);
    ASSERT_TRUE(in) << path;
    std::ostringstream text;
    text << in.rdbuf();
    QX::Platform::Configuration example;
    ASSERT_NO_THROW(example =
                        QX::Platform::parseConfiguration(text.str(), path));
    const QX::Platform::Configuration defaults;
    EXPECT_EQ(example.source, defaults.source);
    EXPECT_EQ(example.fixtureFile, defaults.fixtureFile);
    EXPECT_EQ(example.logSink, defaults.logSink);
    EXPECT_EQ(example.logLevel, defaults.logLevel);
    EXPECT_EQ(example.traceLevel, defaults.traceLevel);
    EXPECT_EQ(example.logComponents, defaults.logComponents);
}

} // namespace
