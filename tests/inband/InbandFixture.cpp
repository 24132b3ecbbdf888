#include "InbandFixture.h"

#include "CVLogger.h"
#include "Configuration.h"
#include "Platform.h"
#include "SelClasses.h"
#include "SelRequests.h"
#include "SystemEventRecord.h"
#include "ipmi/ExchangeWorker.h"
#include "ipmi/FreeIpmiHandles.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <thread>

namespace inbandtest
{

void InbandTest::SetUp()
{
    CVLog::CVLogger::setSink(nullptr);
    std::string pattern =
        (std::filesystem::temp_directory_path() / "selprov-inband-XXXXXX")
            .string();
    ASSERT_NE(::mkdtemp(pattern.data()), nullptr);
    directory = pattern;
    // No such file exists: only the simulated device answers at this path.
    devicePath = directory + "/ipmi0";
    device_ = std::make_unique<inbandsim::IpmiDevice>(devicePath);
}

void InbandTest::TearDown()
{
    unload();
    device_.reset();
    ::unsetenv(QX::Platform::configurationPathVariable);
    std::error_code ignored;
    std::filesystem::remove_all(directory, ignored);
}

void InbandTest::load(unsigned timeoutMs, unsigned pollMs)
{
    loadWith("ipmi.driver = openipmi\n"
             "ipmi.driver-device = " +
             devicePath + "\nipmi.timeout = " + std::to_string(timeoutMs) +
             "\nipmi.poll-interval = " + std::to_string(pollMs) + "\n");
}

void InbandTest::loadProbing()
{
    loadWith("ipmi.driver = auto\n");
}

void InbandTest::loadWith(const std::string& settings)
{
    const std::string file = directory + "/platform.conf";
    {
        std::ofstream out(file);
        out << "source = ipmi\n"
            << "ipmi.interface = inband\n"
            << settings << "ipmi.state-directory = " << directory << "/state\n"
            << "log.sink = none\n";
    }
    ASSERT_EQ(
        ::setenv(QX::Platform::configurationPathVariable, file.c_str(), 1), 0);
    // The platform makes its source from the file at first use.
    QX::Platform::overrideSource(nullptr);
    host_ =
        std::make_unique<host::Host>(selclasses::hostOptions(SELPROV_LIBRARY));
}

void InbandTest::unload()
{
    host_.reset();
    QX::Platform::overrideSource(nullptr);
}

std::uint16_t InbandTest::addRecords(unsigned count)
{
    return device_->withBmc(
        [count](inbandsim::RawBmc& bmc)
        {
            std::uint16_t id = 0;
            for (unsigned i = 0; i < count; ++i)
            {
                id = bmc.add(temperatureRecord(
                    static_cast<std::uint8_t>(0x40 + i % 16)));
            }
            return id;
        });
}

std::uint16_t InbandTest::addThroughDriver(const inbandsim::Record& record)
{
    QX::Ipmi::SessionParameters parameters;
    parameters.driver = IPMI_DEVICE_OPENIPMI;
    parameters.driverDevice = devicePath;
    const QX::Ipmi::IpmiContext context(parameters);
    std::array<std::uint8_t, 17> request{0x44};
    std::copy(record.begin(), record.end(), request.begin() + 1);
    std::array<std::uint8_t, 16> response{};
    const int length = ipmi_cmd_raw(
        context.get(), IPMI_BMC_IPMB_LUN_BMC, IPMI_NET_FN_STORAGE_RQ,
        request.data(), static_cast<unsigned>(request.size()), response.data(),
        static_cast<unsigned>(response.size()));
    if (length < 0)
    {
        context.fail("ipmi_cmd_raw");
    }
    // Command, completion code, record id.
    if (length != 4 || response[1] != 0)
    {
        throw std::runtime_error("Add SEL Entry failed");
    }
    return static_cast<std::uint16_t>(response[2] | response[3] << 8);
}

host::Outcome InbandTest::enumerate(const std::string& className)
{
    return testrequests::enumerate(*host_, className);
}

host::Outcome InbandTest::loadAndEnumerate(unsigned records,
                                           const std::string& className)
{
    addRecords(records);
    load();
    host::Outcome outcome = enumerate(className);
    EXPECT_EQ(outcome.rc, CMPI_RC_OK) << outcome.message.value_or("");
    return outcome;
}

host::Outcome InbandTest::clearLog()
{
    return testrequests::clearLog(*host_);
}

inbandsim::Record temperatureRecord(std::uint8_t reading)
{
    return bmcsim::systemEventRecord(0, 0x65e58300,
                                     {0x01, 0x30, 0x01, 0x57, reading, 0x50});
}

std::set<std::string> exchangeWorkerIds()
{
    std::set<std::string> ids;
    std::error_code error;
    for (const auto& task :
         std::filesystem::directory_iterator("/proc/self/task", error))
    {
        std::ifstream comm(task.path() / "comm");
        std::string name;
        std::getline(comm, name);
        if (name == QX::Ipmi::ExchangeWorker::threadName)
        {
            ids.insert(task.path().filename().string());
        }
    }
    return ids;
}

std::size_t exchangeWorkers()
{
    return exchangeWorkerIds().size();
}

std::size_t exchangeWorkersAfterGrace()
{
    const auto deadline =
        std::chrono::steady_clock::now() + std::chrono::milliseconds(500);
    std::size_t count = exchangeWorkers();
    while (count != 0 && std::chrono::steady_clock::now() < deadline)
    {
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
        count = exchangeWorkers();
    }
    return count;
}

std::string text(const host::Instance& instance, const std::string& name)
{
    const host::Value* value = instance.property(name);
    return value != nullptr ? std::string(value->text()) : std::string();
}

} // namespace inbandtest
