#include "EntryFixture.h"

#include <gtest/gtest.h>

namespace
{

using entry::classPath;
using entry::ProviderTest;
using entry::selTree;

class ClearLog : public ProviderTest
{
  protected:
    host::ObjectPath logPath(const std::string& className = "ZAN_MgmtHwLog")
    {
        host::ObjectPath path = classPath(className);
        path.keys.edit().push_back(
            {"Name", host::Value::string("IPMI SEL Log")});
        path.keys.edit().push_back(
            {"CreationClassName", host::Value::string("ZAN_MgmtHwLog")});
        return path;
    }

    std::size_t entryCount()
    {
        return host()
            .enumerateInstanceNames(classPath("ZAN_MgmtHwLogEntry"))
            .paths.size();
    }
};

void expectReturnValue(const host::Outcome& outcome, std::uint64_t value)
{
    ASSERT_EQ(outcome.data.size(), 1u);
    EXPECT_EQ(outcome.data[0].type, CMPI_uint32);
    EXPECT_EQ(outcome.data[0].unsignedValue(), value);
    EXPECT_TRUE(outcome.done);
}

TEST_F(ClearLog, ClearsTheLog)
{
    install(selTree(6));
    ASSERT_EQ(entryCount(), 6u);
    const auto outcome = host().invokeMethod(logPath(), "ClearLog");
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    EXPECT_FALSE(outcome.message.has_value());
    expectReturnValue(outcome, 0);
    EXPECT_EQ(source->acceptedWrites(), 1u);
    EXPECT_EQ(entryCount(), 0u);
}

/** A method call the provider answers with 0: how many writes reach the
 *  instrumentation and how many of the two entries are left. */
struct AnsweredCall
{
    const char* name;
    const char* className;
    const char* method;
    std::uint64_t writes;
    std::size_t entriesLeft;
};

class AnsweredMethod :
    public ClearLog,
    public ::testing::WithParamInterface<AnsweredCall>
{
};

TEST_P(AnsweredMethod, ReturnsZero)
{
    const AnsweredCall& call = GetParam();
    install(selTree(2));
    const auto outcome =
        host().invokeMethod(logPath(call.className), call.method);
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    expectReturnValue(outcome, 0);
    EXPECT_EQ(source->acceptedWrites(), call.writes);
    EXPECT_EQ(entryCount(), call.entriesLeft);
}

INSTANTIATE_TEST_SUITE_P(
    ClearLog, AnsweredMethod,
    ::testing::Values(AnsweredCall{"NamesAreMatchedIgnoringCase",
                                   "zan_mgmthwlog", "CLEARLOG", 1, 0},
                      AnsweredCall{"OtherMethodsAreAcceptedSilently",
                                   "ZAN_MgmtHwLog", "ResetLog", 0, 2},
                      AnsweredCall{"OnOtherClassesNothingIsCleared",
                                   "ZAN_MgmtHwLogEntry", "ClearLog", 0, 2}),
    [](const auto& info) { return info.param.name; });

TEST_F(ClearLog, RefusedClearFails)
{
    install(selTree(2));
    source->refuseWrites(true);
    const auto outcome = host().invokeMethod(logPath(), "ClearLog");
    EXPECT_EQ(outcome.rc, CMPI_RC_ERR_FAILED);
    ASSERT_TRUE(outcome.message.has_value());
    EXPECT_EQ(*outcome.message, "Execute Method Failed");
    expectReturnValue(outcome, 1);
    EXPECT_EQ(entryCount(), 2u);
}

TEST_F(ClearLog, InstrumentationExceptionBecomesAFailedStatus)
{
    install(selTree(2));
    source->armFault(
        {QX::CursorOperation::SetProperty, 0, false, "BMC unreachable"});
    ::testing::internal::CaptureStderr();
    const auto outcome = host().invokeMethod(logPath(), "ClearLog");
    EXPECT_EQ(::testing::internal::GetCapturedStderr(), "BMC unreachable\n");
    EXPECT_EQ(outcome.rc, CMPI_RC_ERR_FAILED);
    ASSERT_TRUE(outcome.message.has_value());
    EXPECT_NE(outcome.message->find("BMC unreachable"), std::string::npos);
    EXPECT_EQ(entryCount(), 2u);
}

} // namespace
