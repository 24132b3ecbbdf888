// The broker's plain values: each kind reads only its own member, and
// lists of named values are shared by copies until one of them changes.
#include "Values.h"

#include <thread>
#include <vector>

#include <gtest/gtest.h>

namespace
{

using host::NamedValues;
using host::ObjectPath;
using host::SharedNamedValues;
using host::Value;

TEST(Value, EachKindAnswersItsOwnMemberAndDefaultsForTheOthers)
{
    const Value number = Value::unsignedInt(CMPI_uint32, 7);
    EXPECT_EQ(number.unsignedValue(), 7u);
    EXPECT_EQ(number.signedValue(), 0);
    EXPECT_EQ(number.realValue(), 0.0);
    EXPECT_EQ(number.text(), "");
    EXPECT_TRUE(number.elements().empty());
    EXPECT_EQ(number.ref(), nullptr);

    const Value negative = Value::signedInt(CMPI_sint16, -3);
    EXPECT_EQ(negative.signedValue(), -3);
    EXPECT_EQ(negative.unsignedValue(), 0u);

    const Value real = Value::real(CMPI_real64, 2.5);
    EXPECT_EQ(real.realValue(), 2.5);
    EXPECT_EQ(real.unsignedValue(), 0u);

    const Value text = Value::string("abc");
    EXPECT_EQ(text.text(), "abc");
    EXPECT_EQ(text.unsignedValue(), 0u);

    const Value list =
        Value::array(CMPI_uint8, {Value::unsignedInt(CMPI_uint8, 1)});
    ASSERT_EQ(list.elements().size(), 1u);
    EXPECT_EQ(list.elements()[0].unsignedValue(), 1u);
    EXPECT_EQ(list.text(), "");

    ObjectPath target;
    target.className = "Target";
    const Value reference = Value::reference(target);
    ASSERT_NE(reference.ref(), nullptr);
    EXPECT_EQ(reference.ref()->className, "Target");
}

TEST(Value, SettingAnotherKindReplacesTheMember)
{
    Value v = Value::unsignedInt(CMPI_uint64, 5);
    v.type = CMPI_sint64;
    v.setSigned(-5);
    EXPECT_EQ(v.signedValue(), -5);
    EXPECT_EQ(v.unsignedValue(), 0u);
    EXPECT_EQ(v, Value::signedInt(CMPI_sint64, -5));
}

TEST(Value, HoldsOneMemberAtATime)
{
    // Instances hold many values until their request ends.
    EXPECT_LE(sizeof(Value), 48u);
}

TEST(SharedNamedValues, ACopySeesTheListAsItWasWhenCopied)
{
    SharedNamedValues original(NamedValues{{"A", Value::string("a")}});
    const SharedNamedValues copy = original;
    EXPECT_EQ(&copy.list(), &original.list()); // one list, not two

    host::setNamed(original.edit(), "A", Value::string("changed"));
    host::setNamed(original.edit(), "B", Value::string("b"));
    ASSERT_EQ(copy.size(), 1u);
    EXPECT_EQ(copy[0].second.text(), "a");
    ASSERT_EQ(original.size(), 2u);
    EXPECT_EQ(original[0].second.text(), "changed");
}

TEST(SharedNamedValues, TheCopyMayChangeWithoutTouchingTheOriginal)
{
    const SharedNamedValues original(NamedValues{{"A", Value::string("a")}});
    SharedNamedValues copy = original;
    copy.edit().clear();
    EXPECT_TRUE(copy.empty());
    ASSERT_EQ(original.size(), 1u);
    EXPECT_EQ(original[0].second.text(), "a");
}

TEST(SharedNamedValues, AnUnsharedListChangesInPlace)
{
    SharedNamedValues values(NamedValues{{"A", Value::string("a")}});
    const NamedValues* before = &values.list();
    values.edit().emplace_back("B", Value::string("b"));
    EXPECT_EQ(&values.list(), before);

    SharedNamedValues moved = std::move(values);
    EXPECT_EQ(&moved.list(), before);
    moved.edit().emplace_back("C", Value::string("c"));
    EXPECT_EQ(&moved.list(), before);
    EXPECT_EQ(moved.size(), 3u);
}

TEST(SharedNamedValues, AnEmptyListReadsEmptyAndCompares)
{
    const SharedNamedValues none;
    EXPECT_TRUE(none.empty());
    EXPECT_EQ(none.begin(), none.end());
    EXPECT_EQ(none, SharedNamedValues(NamedValues{}));
    EXPECT_FALSE(none == SharedNamedValues({{"A", Value::boolean(true)}}));
}

TEST(SharedNamedValues, ObjectPathKeysAreSharedByCopiesToo)
{
    ObjectPath path;
    path.className = "C";
    path.setKey("Id", Value::string("1"));
    const ObjectPath copy = path;
    path.setKey("Id", Value::string("2"));
    EXPECT_EQ(copy.key("Id")->text(), "1");
    EXPECT_EQ(path.key("Id")->text(), "2");
}

// Copies are read on other threads while the original keeps changing: the
// readers see the list of their copy and nothing else (run under TSan).
TEST(SharedNamedValues, CopiesMayBeReadOnOtherThreadsWhileTheOriginalChanges)
{
    SharedNamedValues original(NamedValues{{"N", Value::string("0")}});
    std::vector<std::thread> readers;
    for (int round = 1; round <= 8; ++round)
    {
        const SharedNamedValues copy = original;
        const std::string expected = std::to_string(round - 1);
        readers.emplace_back(
            [copy, expected]
            {
                for (int i = 0; i < 200; ++i)
                {
                    ASSERT_EQ(copy[0].second.text(), expected);
                }
            });
        host::setNamed(original.edit(), "N",
                       Value::string(std::to_string(round)));
    }
    for (std::thread& reader : readers)
    {
        reader.join();
    }
    EXPECT_EQ(original[0].second.text(), "8");
}

} // namespace
