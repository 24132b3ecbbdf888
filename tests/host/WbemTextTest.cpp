#include "Schema.h"
#include "SelClasses.h"
#include "Values.h"

#include <stdexcept>
#include <string_view>

#include <gtest/gtest.h>

namespace hosttest
{
namespace
{

using host::ObjectPath;
using host::Value;

TEST(WbemText, FormatsKeysSortedWithoutCase)
{
    ObjectPath p;
    p.nameSpace = "root/zanqx";
    p.className = "ZAN_MgmtHwLogEntry";
    p.keys = {{"RecordID", Value::string("12")},
              {"logName", Value::string("IPMI SEL")},
              {"Node", Value::unsignedInt(CMPI_uint16, 2)},
              {"Delta", Value::signedInt(CMPI_sint32, -3)},
              {"Flag", Value::boolean(true)},
              {"At", Value::dateTime("20080523044811.000000+000")}};
    EXPECT_EQ(p.toString(),
              "root/zanqx:ZAN_MgmtHwLogEntry.At=\"20080523044811.000000+000\","
              "Delta=-3,Flag=TRUE,logName=\"IPMI SEL\",Node=2,RecordID=\"12\"");
}

TEST(WbemText, HostPartOnlyWhenSet)
{
    ObjectPath p;
    p.nameSpace = "root";
    p.className = "C";
    EXPECT_EQ(p.toString(), "root:C");
    p.host = "bmc";
    EXPECT_EQ(p.toString(), "//bmc/root:C");
}

TEST(WbemText, ParsesTypedValues)
{
    const ObjectPath p = ObjectPath::parse(
        "//h/root/zanqx:Cls.S=\"a \\\"q\\\" \\\\ b\",N=42,M=-7,B=false,T=TRUE");
    EXPECT_EQ(p.host, "h");
    EXPECT_EQ(p.nameSpace, "root/zanqx");
    EXPECT_EQ(p.className, "Cls");
    ASSERT_EQ(p.keys.size(), 5u);
    EXPECT_EQ(*p.key("s"), Value::string("a \"q\" \\ b"));
    EXPECT_EQ(*p.key("N"), Value::unsignedInt(CMPI_uint64, 42));
    EXPECT_EQ(*p.key("M"), Value::signedInt(CMPI_sint64, -7));
    EXPECT_EQ(*p.key("B"), Value::boolean(false));
    EXPECT_EQ(*p.key("T"), Value::boolean(true));
}

TEST(WbemText, RoundTrips)
{
    const char* const logPath =
        "root/zanqx:ZAN_MgmtHwLog.CreationClassName=\"ZAN_MgmtHwLog\","
        "Name=\"IPMI SEL\"";
    const char* texts[] = {
        logPath,
        "root:C",
        "C.K=1",
        "//host/ns:C.A=\"x,y=z\",B=-1,C=TRUE",
        "ns:C.Text=\"line\\nnext\\ttab\"",
    };
    for (const char* text : texts)
    {
        EXPECT_EQ(ObjectPath::parse(text).toString(), text);
    }
}

TEST(WbemText, SchemaGivesKeyTypes)
{
    const host::Schema schema = selclasses::schema();
    const ObjectPath p = ObjectPath::parse(
        "root/zanqx:ZAN_MgmtHwLogEntry.RecordID=\"3\","
        "MessageTimestamp=\"20080523044811.000000+000\",Other=\"o\"",
        &schema);
    EXPECT_EQ(p.key("RecordID")->type, CMPI_string);
    EXPECT_EQ(p.key("MessageTimestamp")->type, CMPI_dateTime);
    EXPECT_EQ(p.key("MessageTimestamp")->text(), "20080523044811.000000+000");
    EXPECT_EQ(p.key("Other")->type, CMPI_string);
    // Text that is no datetime is kept as it is, for providers to reject.
    const ObjectPath bad = ObjectPath::parse(
        "ZAN_MgmtHwLogEntry.MessageTimestamp=\"yesterday\"", &schema);
    EXPECT_EQ(bad.key("MessageTimestamp")->type, CMPI_dateTime);
    EXPECT_EQ(bad.key("MessageTimestamp")->text(), "yesterday");
    // A value of the wrong kind keeps its parsed type.
    const ObjectPath wrong =
        ObjectPath::parse("ZAN_MgmtHwLogEntry.RecordID=3", &schema);
    EXPECT_EQ(wrong.key("RecordID")->type, CMPI_uint64);
}

TEST(WbemText, SchemaNarrowsIntegers)
{
    host::Schema schema;
    schema.add({"C", {{"Small", CMPI_uint8}, {"Signed", CMPI_sint16}}});
    const ObjectPath p = ObjectPath::parse("C.Small=200,Signed=-5", &schema);
    EXPECT_EQ(*p.key("Small"), Value::unsignedInt(CMPI_uint8, 200));
    EXPECT_EQ(*p.key("Signed"), Value::signedInt(CMPI_sint16, -5));
    EXPECT_THROW(ObjectPath::parse("C.Small=256", &schema),
                 std::invalid_argument);
    EXPECT_THROW(ObjectPath::parse("C.Signed=-40000", &schema),
                 std::invalid_argument);
}

TEST(WbemText, RejectsBadText)
{
    const char* bad[] = {
        "",
        "root:",
        ":C",
        "root:C.",
        "root:C.K",
        "root:C.K=",
        "root:C.K=\"unterminated",
        "root:C.K=\"x\"junk",
        "root:C.K=abc",
        "root:C.K=1.5",
        "root:C.K=99999999999999999999",
        "root:C.K=1,K=2",
        "root:C.K=1,",
        "root:C.1K=1",
        "root:9C",
        "ro ot:C",
        "//host",
        "///root:C",
        "root:C.K=\"bad \\q escape\"",
        "root:C K=1",
    };
    for (const char* text : bad)
    {
        EXPECT_THROW(ObjectPath::parse(text), std::invalid_argument) << text;
    }
}

TEST(WbemText, ControlCharactersReadBackAsPrinted)
{
    ObjectPath path;
    path.nameSpace = "root";
    path.className = "C";
    path.setKey("K", Value::string(std::string("a\x15"
                                               "b\x01\x1f\n")));
    const std::string text = path.toString();
    EXPECT_EQ(text, "root:C.K=\"a\\x15b\\x01\\x1F\\n\"");
    EXPECT_EQ(ObjectPath::parse(text), path);
    EXPECT_EQ(*ObjectPath::parse("root:C.K=\"\\x7e\"").key("K"),
              Value::string("~"));
    for (const char* bad : {"root:C.K=\"\\x00\"", "root:C.K=\"\\x1\"",
                            "root:C.K=\"\\xg1\"", "root:C.K=\"\\x\""})
    {
        EXPECT_THROW(ObjectPath::parse(bad), std::invalid_argument) << bad;
    }
    // A NUL cannot travel in a CMPI string, written raw or escaped.
    using namespace std::string_view_literals;
    EXPECT_THROW(ObjectPath::parse("root:C.K=\"a\0b\""sv),
                 std::invalid_argument);
}

TEST(WbemText, ErrorMessageNamesTheText)
{
    try
    {
        ObjectPath::parse("root:C.K=abc");
        FAIL();
    }
    catch (const std::invalid_argument& e)
    {
        EXPECT_NE(std::string(e.what()).find("root:C.K=abc"),
                  std::string::npos);
    }
}

TEST(Values, ToString)
{
    EXPECT_EQ(Value::string("a\"b").toString(), "\"a\\\"b\"");
    EXPECT_EQ(Value::boolean(false).toString(), "FALSE");
    EXPECT_EQ(Value::nullOf(CMPI_uint8).toString(), "NULL");
    EXPECT_EQ(Value::real(CMPI_real64, 1.5).toString(), "1.5");
    EXPECT_EQ(Value::array(CMPI_uint16, {Value::unsignedInt(CMPI_uint16, 2),
                                         Value::unsignedInt(CMPI_uint16, 11)})
                  .toString(),
              "{2, 11}");
    EXPECT_EQ(Value::array(CMPI_chars, {}).type, CMPI_stringA);
}

TEST(Schema, FindsClassesWithoutCase)
{
    const host::Schema schema = selclasses::schema();
    const host::ClassKeys* log = schema.find("zan_mgmthwlog");
    ASSERT_NE(log, nullptr);
    EXPECT_EQ(log->keys.size(), 2u);
    EXPECT_TRUE(log->isKey("name"));
    const host::ClassKeys* entry = schema.find("ZAN_MgmtHwLogEntry");
    ASSERT_NE(entry, nullptr);
    EXPECT_EQ(entry->keys.size(), 5u);
    EXPECT_EQ(entry->keys.back().second, CMPI_dateTime);
    EXPECT_EQ(schema.find("CIM_Nothing"), nullptr);
}

} // namespace
} // namespace hosttest
