#pragma once

#include "CVLogger.h"
#include "CaptureSink.h"
#include "DateTime.h"
#include "EntryFixture.h"
#include "EventClasses.h"
#include "IndicationInbox.h"

#include <chrono>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace entry
{

using namespace testevents;

/** How long a test waits for something that normally takes milliseconds. */
constexpr std::chrono::seconds patience{10};

/** The time the tests raise their alerts with. */
inline const QX::DateTime alertTime(2024, 5, 6, 7, 8, 9, 0, 0);

/** selTree(entries) with a watchdog /bmc0/wdt whose RestartCause is
 *  @p restartCause (none when negative). */
QX::NodeTreeBuilder selTreeWithWatchdog(unsigned entries, int restartCause = 4);

/**
 * The provider loaded into a host whose subscriber listens on root/zanqx,
 * on a tree with a controller, its log and a watchdog; every diagnostic
 * line is captured.
 */
class IndicationTest : public ProviderTest
{
  protected:
    void SetUp() override;
    void TearDown() override;

    /** What SFCB does for a new subscription: authorizeFilter, mustPoll,
     *  activateFilter with the first-activation flag. */
    void subscribe(const std::string& className, bool firstActivation = true);
    /** What SFCB does when a subscription is deleted: disable, then
     *  deactivate with a class path whose class name is empty. */
    void unsubscribeLikeSfcb(const std::string& className);
    void enable();

    /** The next delivered indication, waiting up to patience. */
    std::optional<host::DeliveredIndication> next();
    /** Waits until the source handed out every alert and every thread the
     *  provider started has ended. */
    void settle();
    /** Diagnostic lines whose message contains @p text. */
    std::vector<CVLog::LogRecord> linesWith(const std::string& text) const;

    std::unique_ptr<host::IndicationInbox> inbox;
    std::shared_ptr<testsupport::CaptureSink> capture;
};

/**
 * The in-memory source on selTreeWithWatchdog(3), diagnostics silenced, for
 * tests that load the provider in hosts of their own: the one in host_,
 * when they make it, is unloaded after every alert was handed out.
 */
class WatchdogSourceTest : public ::testing::Test
{
  protected:
    void SetUp() override;
    void TearDown() override;

    std::shared_ptr<QX::MemorySource> source;
    std::unique_ptr<host::Host> host_;
};

} // namespace entry
