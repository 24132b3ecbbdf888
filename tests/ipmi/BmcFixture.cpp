#include "BmcFixture.h"

#include "CVLogger.h"
#include "ChildProcess.h"
#include "Platform.h"
#include "SelClasses.h"
#include "SelRequests.h"
#include "ipmi/IpmiSourceFactory.h"

#include <cstdio>
#include <sstream>
#include <stdexcept>

namespace bmctest
{

void BmcTest::SetUp()
{
    if (!bmcsim::SimulatedBmc::available())
    {
        GTEST_SKIP() << "ipmi_sim is not installed (Debian package openipmi): "
                        "the BMC simulator tests are skipped";
    }
    CVLog::CVLogger::setSink(nullptr);
}

void BmcTest::TearDown()
{
    stopProvider();
    bmc_.reset();
}

QX::Ipmi::Settings BmcTest::settings(unsigned timeoutMs) const
{
    QX::Ipmi::Settings settings;
    settings.interface = QX::Ipmi::Interface::Lan;
    settings.host = bmc_->host();
    settings.user = bmc_->options().user;
    settings.password = bmc_->options().password;
    settings.privilege = "admin";
    settings.workarounds = {"opensesspriv"};
    settings.timeoutMs = timeoutMs;
    settings.retransmissionTimeoutMs = 250;
    settings.stateDirectory = bmc_->directory() + "/platform-state";
    settings.pollIntervalMs = pollIntervalMs;
    return settings;
}

void BmcTest::start(bmcsim::Options options, unsigned timeoutMs)
{
    bmc_ = std::make_unique<bmcsim::SimulatedBmc>(std::move(options));
    bmc_->start();
    startProvider(timeoutMs);
}

void BmcTest::stopProvider()
{
    // The host disables indications before it unloads the provider, which
    // ends the monitoring; then the source goes, as the platform library
    // does after the provider's.
    host_.reset();
    QX::Platform::overrideSource(nullptr);
    source.reset();
}

void BmcTest::startProvider(unsigned timeoutMs)
{
    source = QX::Ipmi::makeIpmiSource(settings(timeoutMs), "");
    QX::Platform::overrideSource(source);
    host_ =
        std::make_unique<host::Host>(selclasses::hostOptions(SELPROV_LIBRARY));
}

host::Outcome BmcTest::enumerate(const std::string& className)
{
    return testrequests::enumerate(*host_, className);
}

host::Outcome BmcTest::clearLog()
{
    return testrequests::clearLog(*host_);
}

std::string BmcTest::ipmitool(const std::string& arguments) const
{
    const std::string command =
        "TZ=UTC " + bmc_->ipmitool() + " " + arguments + " 2>&1";
    const testsupport::CommandRun run = testsupport::runCommand(command);
    if (!run.started)
    {
        throw std::runtime_error("cannot run ipmitool");
    }
    return run.output;
}

std::vector<IpmitoolRecord> BmcTest::ipmitoolRecords() const
{
    std::vector<IpmitoolRecord> records;
    unsigned next = 0;
    while (next != 0xFFFF && records.size() < 1000)
    {
        char arguments[64];
        std::snprintf(arguments, sizeof arguments,
                      "raw 0x0a 0x43 0 0 0x%02x 0x%02x 0 0xff", next & 0xFF,
                      next >> 8);
        std::istringstream words(ipmitool(arguments));
        std::vector<unsigned> bytes;
        std::string word;
        while (words >> word)
        {
            bytes.push_back(
                static_cast<unsigned>(std::stoul(word, nullptr, 16)));
        }
        if (bytes.size() != 18)
        {
            break; // an empty SEL answers CBh
        }
        IpmitoolRecord record;
        record.id = bytes[2] | bytes[3] << 8;
        for (std::size_t i = 2; i < bytes.size(); ++i)
        {
            char pair[4];
            std::snprintf(pair, sizeof pair,
                          i + 1 < bytes.size() ? "%02x " : "%02x", bytes[i]);
            record.bytes += pair;
        }
        records.push_back(record);
        next = bytes[0] | bytes[1] << 8;
    }
    return records;
}

unsigned BmcTest::ipmitoolEntries() const
{
    std::istringstream lines(ipmitool("sel info"));
    std::string line;
    while (std::getline(lines, line))
    {
        if (line.starts_with("Entries"))
        {
            return static_cast<unsigned>(
                std::stoul(line.substr(line.find(':') + 1)));
        }
    }
    throw std::runtime_error("ipmitool sel info gave no entry count");
}

std::string text(const host::Instance& instance, const std::string& name)
{
    const host::Value* value = instance.property(name);
    return value != nullptr ? std::string(value->text()) : std::string();
}

std::uint64_t number(const host::Instance& instance, const std::string& name)
{
    const host::Value* value = instance.property(name);
    EXPECT_NE(value, nullptr) << name;
    return value != nullptr ? value->unsignedValue() : 0;
}

} // namespace bmctest
