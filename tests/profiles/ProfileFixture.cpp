#include "ProfileFixture.h"

#include "CVLogger.h"
#include "Platform.h"
#include "SelClasses.h"
#include "SelRequests.h"
#include "ipmi/SelRecord.h"

#include <algorithm>
#include <iterator>
#include <set>
#include <thread>

namespace profiles
{

using QX::Ipmi::SelRecordBytes;

void ProfileTest::SetUp()
{
    CVLog::CVLogger::setSink(nullptr);
}

void ProfileTest::TearDown()
{
    unload();
}

void ProfileTest::unload()
{
    // The host disables indications before it unloads the provider, which
    // ends the monitoring; then the source goes.
    inbox.reset();
    host_.reset();
    QX::Platform::overrideSource(nullptr);
    source.reset();
}

void ProfileTest::start(const QX::test::BmcProfile& profile, unsigned timeoutMs)
{
    bmcOwner = std::make_shared<QX::test::ProfileBmc>(profile);
    bmc = bmcOwner.get();
    timeoutMs_ = timeoutMs;
    load();
}

void ProfileTest::load()
{
    auto ownedDescriber = std::make_unique<QX::test::ProfileDescriber>();
    describer = ownedDescriber.get();
    describer->key = textsKey;
    QX::Ipmi::Settings settings;
    settings.timeoutMs = timeoutMs_;
    settings.pollIntervalMs = pollMs;
    settings.clearWaitMs = clearWaitMs;
    source = std::make_shared<QX::Ipmi::IpmiSource>(
        std::make_unique<QX::test::SharedProfileBmc>(bmcOwner),
        std::move(ownedDescriber), settings, "Simulated BMC", alertStateFile,
        selCopy);
    QX::Platform::overrideSource(source);
    host_ =
        std::make_unique<host::Host>(selclasses::hostOptions(SELPROV_LIBRARY));
    inbox =
        std::make_unique<host::IndicationInbox>(host_->listen("root/zanqx"));
}

void ProfileTest::restart()
{
    unload();
    describer = nullptr;
    load();
}

void ProfileTest::replaceBmc(const QX::test::BmcProfile& profile)
{
    bmcOwner = std::make_shared<QX::test::ProfileBmc>(profile);
    bmc = bmcOwner.get();
}

std::vector<std::uint16_t> ProfileTest::addRecords(unsigned count)
{
    std::vector<std::uint16_t> ids;
    for (unsigned i = 0; i < count; ++i)
    {
        ids.push_back(bmc->add(QX::test::eventBody(nextBody++)));
    }
    return ids;
}

void ProfileTest::subscribeAll()
{
    for (const char* className : {entryEvent, clearEvent, fullEvent})
    {
        const auto filter = selclasses::filterFor(className);
        ASSERT_EQ(host_->authorizeFilter(filter, "root").rc, CMPI_RC_OK);
        ASSERT_EQ(host_->mustPoll(filter).rc, CMPI_RC_OK);
        ASSERT_EQ(host_->activateFilter(filter, true).rc, CMPI_RC_OK);
    }
    ASSERT_EQ(host_->enableIndications().rc, CMPI_RC_OK);
    ASSERT_TRUE(source->polling());
    waitForPolls(1);
}

void ProfileTest::waitForPolls(unsigned count)
{
    const std::uint64_t target = source->pollCount() + count;
    const auto deadline = std::chrono::steady_clock::now() + patience;
    while (source->pollCount() < target &&
           std::chrono::steady_clock::now() < deadline)
    {
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    ASSERT_GE(source->pollCount(), target) << "the poller did not poll";
}

std::vector<host::DeliveredIndication> ProfileTest::settle()
{
    waitForPolls(3);
    EXPECT_TRUE(source->waitForAlerts(patience));
    EXPECT_TRUE(host_->broker().waitForThreads(patience));
    return inbox->takeAll();
}

host::Outcome ProfileTest::enumerate(const std::string& className)
{
    return testrequests::enumerate(*host_, className);
}

host::Outcome ProfileTest::clearLog()
{
    return testrequests::clearLog(*host_);
}

void ProfileTest::expectEnumerationIsTheSel()
{
    const host::Outcome outcome = enumerate("ZAN_MgmtHwLogEntry");
    ASSERT_EQ(outcome.rc, CMPI_RC_OK);
    const std::vector<SelRecordBytes> sel = bmc->truth();
    ASSERT_EQ(outcome.instances.size(), sel.size());
    for (std::size_t i = 0; i < sel.size(); ++i)
    {
        const host::Instance& entry = outcome.instances[i];
        EXPECT_EQ(text(entry, "RecordID"),
                  std::to_string(QX::Ipmi::SelRecord::parse(sel[i]).recordId))
            << "record " << i;
        EXPECT_EQ(text(entry, "RecordData"), QX::Ipmi::SelRecord::hexOf(sel[i]))
            << "record " << i;
    }
}

std::vector<SelRecordBytes>
ProfileTest::added(const std::vector<SelRecordBytes>& before,
                   const std::vector<SelRecordBytes>& after)
{
    std::multiset<SelRecordBytes> old(before.begin(), before.end());
    std::vector<SelRecordBytes> fresh;
    for (const SelRecordBytes& record : after)
    {
        const auto seen = old.find(record);
        if (seen != old.end())
        {
            old.erase(seen);
        }
        else
        {
            fresh.push_back(record);
        }
    }
    return fresh;
}

void ProfileTest::expectEntryEvents(
    const std::vector<host::DeliveredIndication>& events,
    const std::vector<SelRecordBytes>& records)
{
    const auto entries = ofClass(events, entryEvent);
    ASSERT_EQ(entries.size(), records.size());
    for (std::size_t i = 0; i < records.size(); ++i)
    {
        const std::string key =
            "RecordID=\"" +
            std::to_string(QX::Ipmi::SelRecord::parse(records[i]).recordId) +
            "\"";
        EXPECT_NE(text(entries[i].instance, "AlertingManagedElement").find(key),
                  std::string::npos)
            << "event " << i << " is not for record "
            << QX::Ipmi::SelRecord::parse(records[i]).recordId;
    }
}

std::vector<host::DeliveredIndication>
ProfileTest::ofClass(const std::vector<host::DeliveredIndication>& events,
                     const std::string& className)
{
    std::vector<host::DeliveredIndication> found;
    std::copy_if(events.begin(), events.end(), std::back_inserter(found),
                 [&](const host::DeliveredIndication& event)
                 { return event.instance.path.className == className; });
    return found;
}

std::string text(const host::Instance& instance, const std::string& name)
{
    const host::Value* value = instance.property(name);
    return value != nullptr ? std::string(value->text()) : std::string();
}

} // namespace profiles
