#include "Printing.h"

#include "StatusText.h"

#include <gtest/gtest.h>

namespace hosttest
{
namespace
{

using host::Value;

host::Instance sample()
{
    host::Instance i;
    i.path = host::ObjectPath::parse(
        "root/zanqx:ZAN_MgmtHwLogEntry.CreationClassName="
        "\"ZAN_MgmtHwLogEntry\",RecordID=\"1\"");
    i.setProperty("CreationClassName", Value::string("ZAN_MgmtHwLogEntry"));
    i.setProperty("Node", Value::unsignedInt(CMPI_uint16, 1));
    i.setProperty(
        "OperationalStatus",
        Value::array(CMPI_uint16, {Value::unsignedInt(CMPI_uint16, 2),
                                   Value::unsignedInt(CMPI_uint16, 11)}));
    i.setProperty("Stamp", Value::dateTime("20080523044811.000000+000"));
    i.setProperty("Ok", Value::boolean(true));
    i.setProperty("Missing", Value::nullOf(CMPI_string));
    return i;
}

TEST(Printing, Mof)
{
    EXPECT_EQ(selprov::formatMof(sample()),
              "// root/zanqx:ZAN_MgmtHwLogEntry.CreationClassName="
              "\"ZAN_MgmtHwLogEntry\",RecordID=\"1\"\n"
              "instance of ZAN_MgmtHwLogEntry\n"
              "{\n"
              "    CreationClassName = \"ZAN_MgmtHwLogEntry\";\n"
              "    Node = 1;\n"
              "    OperationalStatus = {2, 11};\n"
              "    Stamp = \"20080523044811.000000+000\";\n"
              "    Ok = TRUE;\n"
              "    Missing = NULL;\n"
              "};\n");
}

TEST(Printing, JsonInstance)
{
    EXPECT_EQ(selprov::jsonInstance(sample()),
              "{\"path\": \"root/zanqx:ZAN_MgmtHwLogEntry.CreationClassName="
              "\\\"ZAN_MgmtHwLogEntry\\\",RecordID=\\\"1\\\"\", "
              "\"properties\": {\"CreationClassName\": "
              "\"ZAN_MgmtHwLogEntry\", \"Node\": 1, \"OperationalStatus\": "
              "[2, 11], \"Stamp\": \"20080523044811.000000+000\", \"Ok\": "
              "true, \"Missing\": null}}");
}

TEST(Printing, JsonEscaping)
{
    EXPECT_EQ(selprov::jsonString("q\" b\\ \n\r\t\b\f"),
              "\"q\\\" b\\\\ \\n\\r\\t\\b\\f\"");
    EXPECT_EQ(selprov::jsonString(std::string("\x01\x1f\x7f", 3)),
              "\"\\u0001\\u001f\\u007f\"");
    EXPECT_EQ(selprov::jsonString("caf\xc3\xa9 \xe2\x82\xac"),
              "\"caf\xc3\xa9 \xe2\x82\xac\""); // valid UTF-8 kept
    EXPECT_EQ(selprov::jsonString("bad \xff \xc3"), "\"bad \\ufffd \\ufffd\"");
    EXPECT_EQ(selprov::jsonString("\xed\xa0\x80"), // a surrogate
              "\"\\ufffd\\ufffd\\ufffd\"");
    EXPECT_EQ(selprov::jsonString(std::string("a\0b", 3)), "\"a\\u0000b\"");
}

TEST(Printing, JsonNumbers)
{
    EXPECT_EQ(selprov::jsonValue(Value::signedInt(CMPI_sint64, -5)), "-5");
    EXPECT_EQ(selprov::jsonValue(
                  Value::unsignedInt(CMPI_uint64, 18446744073709551615ull)),
              "18446744073709551615");
    EXPECT_EQ(selprov::jsonValue(Value::real(CMPI_real64, 0.25)), "0.25");
    EXPECT_EQ(selprov::jsonValue(Value::real(CMPI_real64, 1.0 / 0.0)), "null");
}

TEST(Printing, JsonLists)
{
    EXPECT_EQ(selprov::jsonInstances({}), "[]\n");
    host::ObjectPath p;
    p.nameSpace = "root";
    p.className = "C";
    EXPECT_EQ(selprov::jsonPaths({p, p}), "[\"root:C\",\n \"root:C\"]\n");
}

TEST(StatusText, Describe)
{
    EXPECT_STREQ(host::rcName(CMPI_RC_ERR_NOT_FOUND), "CMPI_RC_ERR_NOT_FOUND");
    EXPECT_STREQ(host::rcName(static_cast<CMPIrc>(999)), "CMPI_RC_UNKNOWN");
    EXPECT_EQ(host::describeStatus(CMPI_RC_ERR_FAILED, std::string("boom")),
              "CMPI rc 1 (CMPI_RC_ERR_FAILED): boom");
    EXPECT_EQ(host::describeStatus(CMPI_RC_ERR_NOT_SUPPORTED, std::nullopt),
              "CMPI rc 7 (CMPI_RC_ERR_NOT_SUPPORTED)");
}

} // namespace
} // namespace hosttest
