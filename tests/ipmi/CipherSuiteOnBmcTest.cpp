// Cipher suite choice against the simulated BMC, which refuses suite 17
// and speaks 3: the first session falls back to 3, later ones (a new
// session object, as after a new provider load) go straight to 3.

#include "BmcFixture.h"
#include "SessionFixture.h"

#include <filesystem>
#include <fstream>
#include <string>

#include <gtest/gtest.h>

namespace
{

using bmctest::BmcTest;
using namespace QX::Ipmi;

std::string firstLine(const std::string& path)
{
    std::ifstream in(path);
    std::string line;
    std::getline(in, line);
    return line;
}

class CipherSuiteTest : public bmctest::SessionTest
{
  protected:
    void SetUp() override
    {
        SessionTest::SetUp();
        if (bmc)
        {
            stateDirectory = bmc->directory() + "/cipher-state";
        }
    }

    SessionParameters parameters() const
    {
        SessionParameters p = SessionTest::parameters();
        p.cipherSuite = 0; // must not be what decides
        return p;
    }

    std::string stateDirectory;
};

TEST_F(CipherSuiteTest, RefusedSuite17FallsBackTo3Once)
{
    {
        IpmiSession first(parameters(),
                          CipherSuiteChoice::automatic(stateDirectory));
        EXPECT_EQ(first.getSelInfo().entries, 0u);
        EXPECT_EQ(first.cipherSuites().attempts(), 2u); // 17, then 3
        EXPECT_EQ(first.cipherSuites().current(), 3u);
        EXPECT_EQ(first.sessionGeneration(), 1u);
        EXPECT_EQ(
            firstLine(stateDirectory + "/cipher-suite-" + first.peerKey()),
            "3");
    }
    IpmiSession second(parameters(),
                       CipherSuiteChoice::automatic(stateDirectory));
    EXPECT_EQ(second.getSelInfo().entries, 0u);
    EXPECT_EQ(second.cipherSuites().attempts(), 1u); // straight to 3
    EXPECT_EQ(second.cipherSuites().current(), 3u);
}

TEST_F(CipherSuiteTest, WithoutStateDirectoryEveryStartFallsBack)
{
    for (int start = 0; start < 2; ++start)
    {
        IpmiSession session(parameters(), CipherSuiteChoice::automatic(""));
        EXPECT_EQ(session.getSelInfo().entries, 0u);
        EXPECT_EQ(session.cipherSuites().attempts(), 2u);
    }
}

TEST_F(CipherSuiteTest, ConfiguredSuiteIsTheOnlyOneTried)
{
    IpmiSession refused(parameters(), CipherSuiteChoice::fixed(17));
    EXPECT_THROW(refused.getSelInfo(), IpmiError);
    EXPECT_EQ(refused.cipherSuites().attempts(), 1u);
    EXPECT_FALSE(std::filesystem::exists(stateDirectory));

    IpmiSession accepted(parameters(), CipherSuiteChoice::fixed(3));
    EXPECT_EQ(accepted.getSelInfo().entries, 0u);
    EXPECT_EQ(accepted.cipherSuites().attempts(), 1u);
}

TEST_F(CipherSuiteTest, RememberedSuiteTheBmcNoLongerTakesIsReplaced)
{
    const std::string file = stateDirectory + "/cipher-suite-lan-" +
                             std::string("127.0.0.1_") +
                             std::to_string(bmc->lanPort());
    std::filesystem::create_directories(stateDirectory);
    std::ofstream(file) << "17\n";
    IpmiSession session(parameters(),
                        CipherSuiteChoice::automatic(stateDirectory));
    EXPECT_EQ(session.getSelInfo().entries, 0u);
    EXPECT_EQ(session.cipherSuites().attempts(), 2u);
    EXPECT_EQ(firstLine(file), "3");
}

// Through the exported instance MI, with no cipher suite configured.
TEST_F(BmcTest, ProviderWorksWithoutConfiguredCipherSuite)
{
    start(bmcsim::Options{});
    EXPECT_FALSE(settings(2000).cipherSuite.has_value());
    EXPECT_EQ(enumerate("ZAN_MgmtHwLog").instances.size(), 1u);
    const std::string remembered = settings(2000).stateDirectory +
                                   "/cipher-suite-lan-127.0.0.1_" +
                                   std::to_string(bmc().lanPort());
    EXPECT_EQ(firstLine(remembered), "3");

    stopProvider();
    startProvider();
    EXPECT_EQ(enumerate("ZAN_MgmtHwLog").instances.size(), 1u);
    EXPECT_EQ(firstLine(remembered), "3");
}

} // namespace
