#include "CVLogger.h"
#include "Configuration.h"
#include "Platform.h"
#include "ipmi/IpmiSourceFactory.h"
#include "platform/CapturedLog.h"
#include "platform/ConfigurationFiles.h"

#include <cstdio>
#include <fstream>
#include <sys/stat.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace QX;
using QX::test::configurationError;
using QX::test::TempFile;
using ::testing::HasSubstr;
using ::testing::Not;

namespace
{

constexpr const char* secret = "s3cr3t-pw";

std::string refusal(const std::string& configurationText,
                    const std::string& file)
{
    try
    {
        const Platform::Configuration configuration =
            Platform::parseConfiguration(configurationText, file);
        Ipmi::makeIpmiSource(configuration.ipmi, file);
    }
    catch (const std::exception& error)
    {
        return error.what();
    }
    return "";
}

class IpmiSettingsTest : public ::testing::Test
{
  protected:
    /** Every logged line, for checks that the password is not among them. */
    std::string logged() const
    {
        std::string all;
        for (const auto& record : captured.records())
        {
            all += record.message + "\n";
        }
        return all;
    }

    QX::test::CapturedLog captured;
};

TEST_F(IpmiSettingsTest, EveryKeyIsParsed)
{
    const auto configuration = Platform::parseConfiguration(
        "source = ipmi\n"
        "ipmi.interface = lan\n"
        "ipmi.host = 10.0.0.5:6623\n"
        "ipmi.user = monitor\n"
        "ipmi.password-file = /etc/qx/bmc.pw\n"
        "ipmi.privilege = admin\n"
        "ipmi.cipher-suite = 17\n"
        "ipmi.workarounds = opensesspriv, authcap\n"
        "ipmi.timeout = 3000\n"
        "ipmi.retransmission-timeout = 300\n"
        "ipmi.sel-warning-fill = 80\n"
        "ipmi.poll-interval = 250\n"
        "ipmi.sel-clock = local\n"
        "ipmi.sel-capacity = 8192\n"
        "ipmi.sel-wraps = yes\n"
        "ipmi.state-directory = /var/lib/qx\n",
        "platform.conf");
    const Ipmi::Settings& ipmi = configuration.ipmi;
    EXPECT_EQ(configuration.source, "ipmi");
    EXPECT_EQ(ipmi.interface, Ipmi::Interface::Lan);
    EXPECT_EQ(ipmi.host, "10.0.0.5:6623");
    EXPECT_EQ(ipmi.user, "monitor");
    EXPECT_EQ(ipmi.passwordFile, "/etc/qx/bmc.pw");
    EXPECT_EQ(ipmi.privilege, "admin");
    EXPECT_EQ(ipmi.cipherSuite, 17u);
    EXPECT_EQ(ipmi.workarounds,
              (std::vector<std::string>{"opensesspriv", "authcap"}));
    EXPECT_EQ(ipmi.timeoutMs, 3000u);
    EXPECT_EQ(ipmi.retransmissionTimeoutMs, 300u);
    EXPECT_EQ(ipmi.warningFillPercent, 80u);
    EXPECT_EQ(ipmi.pollIntervalMs, 250u);
    EXPECT_EQ(ipmi.selClock, Ipmi::SelClock::Local);
    EXPECT_EQ(ipmi.selCapacity, 8192u);
    EXPECT_TRUE(ipmi.selWraps);
    EXPECT_EQ(ipmi.stateDirectory, "/var/lib/qx");
}

TEST_F(IpmiSettingsTest, CipherSuiteIsAutomaticUnlessConfigured)
{
    EXPECT_FALSE(Ipmi::Settings{}.cipherSuite.has_value());
    const auto fixed =
        Platform::parseConfiguration("ipmi.cipher-suite = 0\n", "a.conf");
    EXPECT_EQ(fixed.ipmi.cipherSuite, 0u);
    const auto automatic = Platform::parseConfiguration(
        "ipmi.cipher-suite = 3\nipmi.cipher-suite = auto\n", "b.conf");
    EXPECT_FALSE(automatic.ipmi.cipherSuite.has_value());
    EXPECT_THAT(configurationError("ipmi.cipher-suite = 18\n"),
                HasSubstr("ipmi.cipher-suite must be auto or a whole number "
                          "from 0 to 17, not \"18\""));
}

TEST_F(IpmiSettingsTest, BadValuesNameTheKey)
{
    EXPECT_EQ(configurationError("ipmi.interface = serial\n"),
              "platform.conf:1: ipmi.interface must be inband or lan, not "
              "\"serial\"");
    EXPECT_THAT(configurationError("ipmi.timeout = 5s\n"),
                HasSubstr("ipmi.timeout must be a whole number"));
    EXPECT_THAT(configurationError("ipmi.poll-interval = 10\n"),
                HasSubstr("ipmi.poll-interval must be a whole number from 50"));
    EXPECT_EQ(configurationError("ipmi.workarounds = nosuch\n"),
              "platform.conf:1: ipmi.workarounds: unknown workaround "
              "\"nosuch\"");
    EXPECT_EQ(configurationError("ipmi.colour = blue\n"),
              "platform.conf:1: unknown key \"ipmi.colour\"");
}

TEST_F(IpmiSettingsTest, PasswordNeverAppearsInErrors)
{
    EXPECT_EQ(configurationError("ipmi.password = 123456789012345678901\n"),
              "platform.conf:1: ipmi.password is longer than 20 bytes");
    EXPECT_EQ(configurationError(std::string("ipmi.password ") + secret + "\n"),
              "platform.conf:1: expected key = value");
}

TEST_F(IpmiSettingsTest, ConfigurationWithAPasswordMustBePrivate)
{
    const std::string text = std::string("source = ipmi\n"
                                         "ipmi.interface = lan\n"
                                         "ipmi.host = 127.0.0.1:1\n"
                                         "ipmi.password = ") +
                             secret + "\n";
    const TempFile readable(text, 0644);
    const std::string why = refusal(text, readable.path());
    EXPECT_THAT(why, HasSubstr("holds an IPMI password but group or others "
                               "may read it (mode 0644): refused"));
    EXPECT_THAT(why, Not(HasSubstr(secret)));
    EXPECT_THAT(logged(), HasSubstr("IPMI instrumentation refused"));
    EXPECT_THAT(logged(), Not(HasSubstr(secret)));

    const TempFile private_(text, 0600);
    EXPECT_EQ(refusal(text, private_.path()), "");
    EXPECT_THAT(logged(), Not(HasSubstr(secret)));
}

TEST_F(IpmiSettingsTest, PasswordFileMustBePrivate)
{
    const TempFile password(std::string(secret) + "\n", 0640);
    const std::string text = "source = ipmi\n"
                             "ipmi.interface = lan\n"
                             "ipmi.host = 127.0.0.1:1\n"
                             "ipmi.password-file = " +
                             password.path() + "\n";
    EXPECT_THAT(refusal(text, ""),
                HasSubstr("password file " + password.path() +
                          " holds an IPMI password"));
    chmod(password.path().c_str(), 0400);
    EXPECT_EQ(refusal(text, ""), "");
    EXPECT_THAT(logged(), Not(HasSubstr(secret)));
}

TEST_F(IpmiSettingsTest, InterfaceAndHostMustAgree)
{
    EXPECT_EQ(refusal("ipmi.interface = lan\n", ""),
              "ipmi.interface is lan but ipmi.host is not set");
    EXPECT_THAT(refusal("ipmi.host = bmc\n", ""),
                HasSubstr("ipmi.host is set but ipmi.interface is inband"));
    EXPECT_THAT(refusal("ipmi.interface = lan\nipmi.host = h\n"
                        "ipmi.workarounds = spinpoll\n",
                        ""),
                HasSubstr("spinpoll does not apply to the LAN interface"));
    EXPECT_THAT(refusal("ipmi.interface = lan\nipmi.host = h\n"
                        "ipmi.timeout = 500\n"
                        "ipmi.retransmission-timeout = 500\n",
                        ""),
                HasSubstr("ipmi.retransmission-timeout must be below"));
}

TEST_F(IpmiSettingsTest, ClearWaitAndVerifyInterval)
{
    const Ipmi::Settings defaults;
    EXPECT_EQ(defaults.clearWaitMs, 30000u);
    EXPECT_EQ(defaults.selVerifySeconds, 3600u);
    const auto configuration =
        Platform::parseConfiguration("ipmi.clear-wait = 90000\n"
                                     "ipmi.sel-verify-interval = 0\n",
                                     "platform.conf");
    EXPECT_EQ(configuration.ipmi.clearWaitMs, 90000u);
    EXPECT_EQ(configuration.ipmi.selVerifySeconds, 0u);
    EXPECT_THAT(configurationError("ipmi.clear-wait = 10\n"),
                HasSubstr("ipmi.clear-wait must be a whole number from 1000"));
    EXPECT_THAT(configurationError("ipmi.sel-verify-interval = hourly\n"),
                HasSubstr("ipmi.sel-verify-interval must be a whole number"));
}

} // namespace
