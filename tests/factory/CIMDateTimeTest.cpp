#include "CIMDateTime.h"

#include "SELObjectFactory.h"

#include <gtest/gtest.h>

namespace
{

using QX::DateTime;

std::string viaFreeFunction(const DateTime& value)
{
    return QX::SELComposite::convertCIMDateTime(value);
}

std::string viaFactory(const DateTime& value)
{
    QX::SELComposite::SELObjectFactory factory("NoSuchClass");
    return factory.convertCIMDateTime(value);
}

class BothConversions :
    public ::testing::TestWithParam<std::string (*)(const DateTime&)>
{
  protected:
    std::string convert(const DateTime& value) const
    {
        return GetParam()(value);
    }
};

TEST_P(BothConversions, ExamplesWithOffsets)
{
    EXPECT_EQ(convert(DateTime(2010, 3, 7, 18, 4, 9, 5, 2)),
              "20100307180409.000005+120");
    EXPECT_EQ(convert(DateTime(2010, 3, 7, 18, 4, 9, 5, 0)),
              "20100307180409.000005+000");
}

TEST_P(BothConversions, ShortYearsAreNotWidened)
{
    const std::string year999 = convert(DateTime(999, 1, 2, 3, 4, 5, 0, 0));
    EXPECT_EQ(year999, "9990102030405.000000+000");
    EXPECT_EQ(year999.size(), 24u);
    EXPECT_EQ(convert(DateTime(0, 1, 2, 3, 4, 5, 0, 0)),
              "00102030405.000000+000");
}

TEST_P(BothConversions, FieldsArePaddedToTwoDigits)
{
    EXPECT_EQ(convert(DateTime(2026, 1, 2, 0, 0, 0, 0, 0)),
              "20260102000000.000000+000");
    EXPECT_EQ(convert(DateTime(2026, 12, 31, 23, 59, 59, 0, 0)),
              "20261231235959.000000+000");
    // Out-of-range fields print in full and lengthen the text.
    EXPECT_EQ(convert(DateTime(2026, 1, 1, 100, 0, 0, 0, 0)),
              "202601011000000.000000+000");
}

TEST_P(BothConversions, MillisecondsFillTheFractionAsTheyAre)
{
    EXPECT_EQ(convert(DateTime(2026, 1, 1, 0, 0, 0, 0, 0)).substr(14, 7),
              ".000000");
    EXPECT_EQ(convert(DateTime(2026, 1, 1, 0, 0, 0, 999, 0)).substr(14, 7),
              ".000999");
    EXPECT_EQ(convert(DateTime(2026, 1, 1, 0, 0, 0, 12, 0)).substr(14, 7),
              ".000012");
}

TEST_P(BothConversions, Offsets)
{
    const std::pair<int, std::string> cases[] = {
        {0, "+000"}, {1, "+060"},  {10, "+600"},  {17, "+1020"},
        {-1, "-60"}, {-5, "-300"}, {-12, "-720"},
    };
    for (const auto& [hours, text] : cases)
    {
        const std::string value =
            convert(DateTime(2026, 1, 1, 0, 0, 0, 0, hours));
        EXPECT_EQ(value.substr(21), text) << hours;
    }
    EXPECT_EQ(convert(DateTime(2026, 1, 1, 0, 0, 0, 0, -1)).size(), 24u);
    EXPECT_EQ(convert(DateTime(2026, 1, 1, 0, 0, 0, 0, 17)).size(), 26u);
}

TEST_P(BothConversions, NeverAnInterval)
{
    EXPECT_EQ(convert(DateTime(2026, 6, 1, 12, 0, 0, 0, 0)).find(':'),
              std::string::npos);
}

INSTANTIATE_TEST_SUITE_P(FreeAndMember, BothConversions,
                         ::testing::Values(&viaFreeFunction, &viaFactory));

TEST(CIMDateTime, ScratchSizesDifferOnlyOutOfRange)
{
    const DateTime large(2026, 1, 1, 0, 0, 0, 1234567, 0);
    EXPECT_EQ(viaFreeFunction(large), "20260101000000.1234567+000");
    // The factory's five-character scratch cuts the field instead of
    // overrunning.
    EXPECT_EQ(viaFactory(large), "20260101000000.012345+000");
}

TEST(CIMDateTime, AddZero)
{
    EXPECT_EQ(QX::SELComposite::addZero(0), "");
    EXPECT_EQ(QX::SELComposite::addZero(3), "000");
    QX::SELComposite::SELObjectFactory factory("NoSuchClass");
    EXPECT_EQ(factory.addZero(6), "000000");
}

} // namespace
