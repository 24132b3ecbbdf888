// Behaviour of the few convenience macros in cmpimacs.h.
#include <cmpimacs.h>

#include <gtest/gtest.h>

namespace
{

CMPIStatus returnsNotFound()
{
    CMReturn(CMPI_RC_ERR_NOT_FOUND);
}

void setIfRequested(CMPIStatus* status)
{
    CMSetStatus(status, CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST(CmpiMacros, ReturnBuildsStatusWithoutMessage)
{
    const CMPIStatus st = returnsNotFound();
    EXPECT_EQ(st.rc, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(st.msg, nullptr);
}

TEST(CmpiMacros, SetStatusWritesOnlyWhenAStatusIsGiven)
{
    CMPIString dummy{};
    CMPIStatus st{CMPI_RC_OK, &dummy};
    setIfRequested(&st);
    EXPECT_EQ(st.rc, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(st.msg, nullptr);

    // A NULL status pointer is legal and must simply be skipped.
    setIfRequested(nullptr);
}

TEST(CmpiMacros, NullObjectChecksPointerAndHandle)
{
    const CMPIInstance* missing = nullptr;
    const CMPIInstance empty{nullptr, nullptr};
    int backing = 0;
    const CMPIInstance live{&backing, nullptr};
    EXPECT_TRUE(CMIsNullObject(missing));
    EXPECT_TRUE(CMIsNullObject(&empty));
    EXPECT_FALSE(CMIsNullObject(&live));
}

TEST(CmpiMacros, DataStateAndArrayTests)
{
    CMPIData data{};
    data.type = CMPI_stringA;
    data.state = CMPI_nullValue | CMPI_keyValue;
    EXPECT_TRUE(CMIsNullValue(data));
    EXPECT_TRUE(CMIsKeyValue(data));
    EXPECT_TRUE(CMIsArray(data));

    data.type = CMPI_string;
    data.state = CMPI_goodValue;
    EXPECT_FALSE(CMIsNullValue(data));
    EXPECT_FALSE(CMIsKeyValue(data));
    EXPECT_FALSE(CMIsArray(data));
}

} // namespace
