#include "BrokerFixture.h"
#include "DateTimeText.h"

namespace hosttest
{
namespace
{

using DateTimeTest = BrokerTest;

TEST_F(DateTimeTest, AcceptsPointInTime)
{
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    CMPIDateTime* d =
        eft()->newDateTimeFromChars(mb(), "20080523044811.000000+000", &rc);
    ASSERT_NE(d, nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_FALSE(d->ft->isInterval(d, nullptr));
    EXPECT_EQ(text(d->ft->getStringFormat(d, nullptr)),
              "20080523044811.000000+000");
    EXPECT_EQ(d->ft->getBinaryFormat(d, nullptr), 1211518091000000ull);
}

TEST_F(DateTimeTest, OffsetIsAppliedToBinary)
{
    CMPIDateTime* d =
        eft()->newDateTimeFromChars(mb(), "19700101010000.000001+060", nullptr);
    ASSERT_NE(d, nullptr);
    EXPECT_EQ(d->ft->getBinaryFormat(d, nullptr), 1u);
    d = eft()->newDateTimeFromChars(mb(), "19700101000000.000000-001", nullptr);
    ASSERT_NE(d, nullptr);
    EXPECT_EQ(d->ft->getBinaryFormat(d, nullptr), 60'000'000u);
}

TEST_F(DateTimeTest, AcceptsInterval)
{
    CMPIDateTime* d =
        eft()->newDateTimeFromChars(mb(), "00000001020304.000005:000", nullptr);
    ASSERT_NE(d, nullptr);
    EXPECT_TRUE(d->ft->isInterval(d, nullptr));
    EXPECT_EQ(d->ft->getBinaryFormat(d, nullptr),
              ((86400ull + 2ull * 3600 + 3ull * 60 + 4) * 1000000ull) + 5);
}

TEST_F(DateTimeTest, RejectsMalformedText)
{
    const char* bad[] = {
        "2008052304481.000000+000",   // 24 characters
        "200805230448111.000000+000", // 26
        "2008052304481a.000000+000",  // letter
        "20080523044811,000000+000",  // wrong separator
        "20080523044811.000000*000",  // wrong sign
        "20080523044811.000000:001",  // interval must end :000
        "2008052304481 .000000+000",  // space
        "********044811.000000+000",  // wildcards
        "",
    };
    for (const char* text : bad)
    {
        CMPIStatus rc{CMPI_RC_OK, nullptr};
        EXPECT_EQ(eft()->newDateTimeFromChars(mb(), text, &rc), nullptr)
            << text;
        EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_PARAMETER) << text;
    }
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(eft()->newDateTimeFromChars(mb(), nullptr, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST_F(DateTimeTest, FromBinaryRoundTrips)
{
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    CMPIDateTime* d =
        eft()->newDateTimeFromBinary(mb(), 1211518091000123ull, 0, &rc);
    ASSERT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(text(d->ft->getStringFormat(d, nullptr)),
              "20080523044811.000123+000");
    d = eft()->newDateTimeFromBinary(mb(), 93784000005ull, 1, nullptr);
    EXPECT_EQ(text(d->ft->getStringFormat(d, nullptr)),
              "00000001020304.000005:000");
    EXPECT_TRUE(d->ft->isInterval(d, nullptr));
}

TEST_F(DateTimeTest, FromBinaryBeyondYear9999Fails)
{
    CMPIStatus rc{CMPI_RC_OK, nullptr};
    EXPECT_EQ(eft()->newDateTimeFromBinary(mb(), ~0ull, 0, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST_F(DateTimeTest, NowIsAValidPointInTime)
{
    CMPIDateTime* d = eft()->newDateTime(mb(), nullptr);
    ASSERT_NE(d, nullptr);
    const std::string t = text(d->ft->getStringFormat(d, nullptr));
    EXPECT_TRUE(host::isCimDateTime(t)) << t;
    EXPECT_FALSE(d->ft->isInterval(d, nullptr));
    EXPECT_GT(d->ft->getBinaryFormat(d, nullptr), 1'600'000'000'000'000ull);
}

TEST_F(DateTimeTest, CloneKeepsText)
{
    CMPIDateTime* d =
        eft()->newDateTimeFromChars(mb(), "20240131235959.123456+060", nullptr);
    CMPIDateTime* c = d->ft->clone(d, nullptr);
    EXPECT_EQ(text(c->ft->getStringFormat(c, nullptr)),
              "20240131235959.123456+060");
    EXPECT_EQ(c->ft->release(c).rc, CMPI_RC_OK);
}

} // namespace
} // namespace hosttest
