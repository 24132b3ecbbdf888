// The FreeIPMI session on the simulated BMC: reuse, reopening after idle
// time, and the error categories of real failures.

#include "SessionFixture.h"

#include <chrono>
#include <thread>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using namespace QX::Ipmi;
using ::testing::HasSubstr;

/** Asks @p session for the SEL info once, expecting an error of
 *  @p category; gives how long the attempt took. */
std::chrono::steady_clock::duration failedSelInfo(IpmiSession& session,
                                                  ErrorCategory category)
{
    const auto began = std::chrono::steady_clock::now();
    try
    {
        session.getSelInfo();
        ADD_FAILURE() << "no error";
    }
    catch (const IpmiError& error)
    {
        EXPECT_EQ(error.category(), category) << error.what();
    }
    return std::chrono::steady_clock::now() - began;
}

using bmctest::SessionTest;

TEST_F(SessionTest, OneSessionServesBackToBackExchanges)
{
    IpmiSession session(parameters());
    EXPECT_EQ(session.getSelInfo().entries, 0u);
    EXPECT_EQ(session.getSelInfo().entries, 0u);
    EXPECT_EQ(session.sessionGeneration(), 1u);
}

TEST_F(SessionTest, IdleSessionIsReplacedBeforeTheNextExchange)
{
    // Reopened after half the timeout without an exchange.
    IpmiSession session(parameters(1000));
    session.getSelInfo();
    std::this_thread::sleep_for(std::chrono::milliseconds(700));
    EXPECT_EQ(session.getSelInfo().entries, 0u);
    EXPECT_EQ(session.sessionGeneration(), 2u);
}

TEST_F(SessionTest, BmcWithoutTheCommandGivesNoRestartCause)
{
    bmcsim::Options plain;
    plain.restartModule = false; // the simulator as OpenIPMI ships it
    bmc.reset();
    bmc = std::make_unique<bmcsim::SimulatedBmc>(plain);
    bmc->start();
    IpmiSession session(parameters());
    EXPECT_EQ(session.getSystemRestartCause(), std::nullopt);
}

TEST_F(SessionTest, RestartCauseIsWatchdogAfterTheWatchdogReset)
{
    if (!bmcsim::SimulatedBmc::moduleAvailable())
    {
        GTEST_SKIP() << "the simulator module was not built";
    }
    IpmiSession session(parameters());
    EXPECT_EQ(session.getSystemRestartCause(), std::optional<std::uint8_t>(0));
    bmc->startWatchdog(bmcsim::WatchdogAction::HardReset, 1);
    const auto deadline =
        std::chrono::steady_clock::now() + std::chrono::seconds(10);
    while (session.getSystemRestartCause() != std::optional<std::uint8_t>(4) &&
           std::chrono::steady_clock::now() < deadline)
    {
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
    }
    EXPECT_EQ(session.getSystemRestartCause(), std::optional<std::uint8_t>(4));
}

TEST_F(SessionTest, CancelledReservationIsCompletionCodeC5)
{
    bmc->addRecords(bmcsim::generatedRecords(2, 1, 0x60000000));
    IpmiSession session(parameters());
    const std::uint16_t first = session.reserveSel();
    session.reserveSel(); // cancels the first
    try
    {
        session.getSelEntry(first, firstRecordId);
        FAIL() << "no error";
    }
    catch (const IpmiError& error)
    {
        EXPECT_EQ(error.category(), ErrorCategory::CompletionCode);
        EXPECT_EQ(error.completionCode(), completionReservationCancelled);
        EXPECT_THAT(error.what(), HasSubstr("ipmi_cmd_get_sel_entry: "
                                            "completion code C5h"));
    }
    // A completion code leaves the session usable.
    EXPECT_EQ(session.getSelInfo().entries, 2u);
    EXPECT_EQ(session.sessionGeneration(), 1u);
}

TEST_F(SessionTest, WrongPasswordIsASessionError)
{
    SessionParameters wrong = parameters();
    wrong.password = "not-the-password";
    IpmiSession session(wrong);
    try
    {
        session.getSelInfo();
        FAIL() << "no error";
    }
    catch (const IpmiError& error)
    {
        EXPECT_EQ(error.category(), ErrorCategory::Session) << error.what();
        EXPECT_THAT(error.what(),
                    ::testing::Not(HasSubstr("not-the-password")));
    }
}

TEST_F(SessionTest, FrozenBmcIsATimeoutWithinTheTimeoutAndThenRecovers)
{
    IpmiSession session(parameters(1000));
    session.getSelInfo();
    bmc->freeze();
    EXPECT_LT(failedSelInfo(session, ErrorCategory::Timeout),
              std::chrono::milliseconds(2000));
    bmc->thaw();
    EXPECT_EQ(session.getSelInfo().entries, 0u);
    EXPECT_EQ(session.sessionGeneration(), 2u);
}

TEST_F(SessionTest, GuardedExchangeGivesUpAtItsOwnTimeout)
{
    // As in-band: the helper thread may wait on far longer than the caller.
    SessionParameters guarded = parameters(5000);
    guarded.guardExchanges = true;
    guarded.guardTimeoutMs = 400;
    IpmiSession session(guarded);
    EXPECT_EQ(session.getSelInfo().entries, 0u);

    bmc->freeze();
    EXPECT_LT(failedSelInfo(session, ErrorCategory::Timeout),
              std::chrono::milliseconds(1500));
    // The helper is still inside FreeIPMI: no second exchange meanwhile.
    failedSelInfo(session, ErrorCategory::Busy);

    bmc->thaw();
    bool served = false;
    for (int attempt = 0; attempt < 200 && !served; ++attempt)
    {
        try
        {
            served = session.getSelInfo().entries == 0;
        }
        catch (const IpmiError& error)
        {
            ASSERT_EQ(error.category(), ErrorCategory::Busy) << error.what();
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
        }
    }
    EXPECT_TRUE(served);
    EXPECT_EQ(session.sessionGeneration(), 2u);
}

} // namespace
