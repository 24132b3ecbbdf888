#pragma once

// The provider's indication MI on the IPMI source polling the simulated
// BMC: subscribing as an object manager does, waiting for polls, and
// collecting what is delivered.

#include "BmcFixture.h"
#include "EventClasses.h"
#include "IndicationInbox.h"
#include "SelClasses.h"
#include "SystemEventRecord.h"
#include "ipmi/IpmiSource.h"

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace bmctest
{

// Short enough to keep the suite quick, long enough for the sanitizer
// builds to keep up.
inline constexpr unsigned pollMs = 150;
// What a test waits for something the next polls should bring.
inline constexpr std::chrono::seconds patience{10};
// How long a test waits to see that nothing more arrives.
inline constexpr std::chrono::milliseconds quietSpell{6 * pollMs};

// A temperature event with id @p id and time @p time (the BMC sets both).
inline bmcsim::Record temperatureRecord(std::uint16_t id, std::uint32_t time)
{
    return bmcsim::systemEventRecord(
        id, time,
        {0x01, 0x30, 0x01, 0x57, static_cast<std::uint8_t>(0x40 + (id & 0x0F)),
         0x50});
}

inline std::vector<bmcsim::Record> temperatureRecords(unsigned count)
{
    std::vector<bmcsim::Record> records;
    for (unsigned i = 0; i < count; ++i)
    {
        records.push_back(temperatureRecord(static_cast<std::uint16_t>(i + 1),
                                            0x65e58300 + i));
    }
    return records;
}

/** "RecordID=\"<id>\"", as an alerting element names a record. */
inline std::string recordIdKey(unsigned id)
{
    return "RecordID=\"" + std::to_string(id) + "\"";
}

class AlertTest : public BmcTest
{
  protected:
    void launch(bmcsim::Options options, unsigned timeoutMs = 2000)
    {
        pollIntervalMs = pollMs;
        start(std::move(options), timeoutMs);
        listen();
    }
    /** Starts the simulator with @p count temperature records, then
     *  subscribes to @p className. */
    void launchSubscribed(unsigned count, const std::string& className)
    {
        bmcsim::Options options;
        options.records = temperatureRecords(count);
        launch(options);
        subscribe(className);
    }
    void reload(unsigned timeoutMs = 2000)
    {
        inbox.reset();
        stopProvider();
        startProvider(timeoutMs);
        listen();
    }
    void listen()
    {
        inbox = std::make_unique<host::IndicationInbox>(
            host().listen("root/zanqx"));
    }

    QX::Ipmi::IpmiSource& ipmi()
    {
        auto* found = dynamic_cast<QX::Ipmi::IpmiSource*>(source.get());
        if (found == nullptr)
        {
            throw std::logic_error("the source is not the IPMI source");
        }
        return *found;
    }

    /** Subscribes to @p className as an object manager does, enables
     *  indications, and waits until the poller has looked at the BMC. */
    void subscribe(const std::string& className)
    {
        const auto filter = selclasses::filterFor(className);
        ASSERT_EQ(host().authorizeFilter(filter, "root").rc, CMPI_RC_OK);
        ASSERT_EQ(host().mustPoll(filter).rc, CMPI_RC_OK);
        ASSERT_EQ(host().activateFilter(filter, true).rc, CMPI_RC_OK);
        ASSERT_EQ(host().enableIndications().rc, CMPI_RC_OK);
        ASSERT_TRUE(ipmi().polling());
        waitForPolls(1);
    }

    /** Waits until @p count more polls have been completed. */
    void waitForPolls(unsigned count)
    {
        const std::uint64_t target = ipmi().pollCount() + count;
        const auto deadline = std::chrono::steady_clock::now() + patience;
        while (ipmi().pollCount() < target &&
               std::chrono::steady_clock::now() < deadline)
        {
            std::this_thread::sleep_for(std::chrono::milliseconds(10));
        }
        ASSERT_GE(ipmi().pollCount(), target) << "the poller did not poll";
    }

    std::optional<host::DeliveredIndication> next()
    {
        return inbox->next(patience);
    }
    /** Whatever arrives within a few poll intervals. */
    std::vector<host::DeliveredIndication> more()
    {
        std::this_thread::sleep_for(quietSpell);
        ipmi().waitForAlerts(patience);
        EXPECT_TRUE(host().broker().waitForThreads(patience));
        return inbox->takeAll();
    }

    /** One entry event for each of @p ids, in that order, then nothing. */
    void expectEntryEventsFor(const std::vector<std::uint16_t>& ids)
    {
        for (const std::uint16_t id : ids)
        {
            const auto indication = next();
            ASSERT_TRUE(indication.has_value()) << "no event for record " << id;
            EXPECT_EQ(indication->instance.path.className,
                      testevents::entryEvent);
            EXPECT_THAT(text(indication->instance, "AlertingManagedElement"),
                        ::testing::HasSubstr(recordIdKey(id)));
        }
        EXPECT_TRUE(more().empty());
    }

    /** A restart of the object manager announces nothing old. */
    void expectNothingAfterRestart(const std::string& className)
    {
        reload();
        subscribe(className);
        EXPECT_TRUE(more().empty());
    }

    std::unique_ptr<host::IndicationInbox> inbox;
};

} // namespace bmctest
