#pragma once

// The provider library loaded through its exported factories, as an
// object manager loads it, on a platform whose source is the IPMI source
// reading a simulated BMC that behaves as a chosen profile of real BMCs.

#include "EventClasses.h"
#include "Host.h"
#include "IndicationInbox.h"
#include "ProfileBmc.h"
#include "ipmi/IpmiSource.h"

#include <chrono>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace profiles
{

using namespace testevents;

/** How long a test waits for something that normally takes milliseconds. */
constexpr std::chrono::seconds patience{10};

/** A ring buffer of @p size records whose Get SEL Info times never move. */
inline QX::test::BmcProfile frozenRing(std::size_t size)
{
    QX::test::BmcProfile profile;
    profile.capacity = size;
    profile.ringBuffer = true;
    profile.frozenTimestamps = true;
    return profile;
}

class ProfileTest : public ::testing::Test
{
  protected:
    void SetUp() override;
    void TearDown() override;

    /** Makes the BMC, the IPMI source and loads the provider. */
    void start(const QX::test::BmcProfile& profile, unsigned timeoutMs = 2000);
    /** Ends the source and the provider as a process exit does, and loads
     *  them again over the same BMC and the same state files, as a new
     *  process does. */
    void restart();
    /** Puts another BMC of @p profile at the same address (empty SEL). */
    void replaceBmc(const QX::test::BmcProfile& profile);
    /** Adds @p count records of distinct bodies; returns their ids. */
    std::vector<std::uint16_t> addRecords(unsigned count);

    /** Subscribes to every indication class as an object manager does and
     *  waits until the poller has looked at the BMC. */
    void subscribeAll();
    void waitForPolls(unsigned count);
    /** What arrives once the next polls have run and every alert was
     *  delivered. */
    std::vector<host::DeliveredIndication> settle();

    host::Outcome enumerate(const std::string& className);
    host::Outcome clearLog();
    /** The entry enumeration equals the BMC's SEL: ids, bytes, order. */
    void expectEnumerationIsTheSel();

    /** The records in @p after that are not in @p before (equal bytes
     *  counted), in SEL order. */
    static std::vector<QX::Ipmi::SelRecordBytes>
    added(const std::vector<QX::Ipmi::SelRecordBytes>& before,
          const std::vector<QX::Ipmi::SelRecordBytes>& after);
    /** Exactly one entry event per record of @p records, in that order,
     *  in @p events, and no more. */
    static void
    expectEntryEvents(const std::vector<host::DeliveredIndication>& events,
                      const std::vector<QX::Ipmi::SelRecordBytes>& records);
    /** Events of @p className in @p events. */
    static std::vector<host::DeliveredIndication>
    ofClass(const std::vector<host::DeliveredIndication>& events,
            const std::string& className);

    QX::Ipmi::IpmiSource& ipmi()
    {
        return *source;
    }

    void load();
    void unload();

    std::shared_ptr<QX::test::ProfileBmc> bmcOwner;  // outlives sources
    QX::test::ProfileBmc* bmc = nullptr;             // bmcOwner
    QX::test::ProfileDescriber* describer = nullptr; // owned by the source
    std::shared_ptr<QX::Ipmi::IpmiSource> source;
    std::unique_ptr<host::Host> host_;
    std::unique_ptr<host::IndicationInbox> inbox;
    unsigned pollMs = 50;
    unsigned clearWaitMs = 5000;
    unsigned nextBody = 1;
    unsigned timeoutMs_ = 2000;
    /** State files kept across restart(); empty: none. */
    std::string alertStateFile;
    QX::Ipmi::SelCopyPlace selCopy;
    /** The describer's texts key in the next load. */
    std::string textsKey;
};

/** Text property of an instance, "" when absent. */
std::string text(const host::Instance& instance, const std::string& name);

} // namespace profiles
