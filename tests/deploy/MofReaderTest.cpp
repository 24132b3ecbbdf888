#include "Mof.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using ::testing::ElementsAre;
using ::testing::HasSubstr;

std::string errorOf(const std::string& text)
{
    try
    {
        mof::parse(text, "t.mof");
    }
    catch (const mof::MofError& e)
    {
        return e.what();
    }
    return "no error";
}

TEST(MofReader, ClassWithQualifiersPropertiesReferencesAndMethods)
{
    const auto doc = mof::parse(R"(
// A line comment.
/* A block
   comment. */
   [Abstract, Version ( "2.1" ), Description ( "Two " "parts." )]
class X_Thing : CIM_Base {
      [Key, MaxLen ( 256 )]
   string Name;
   uint16 Codes[] = { 1, 2 };
   uint8 Fixed[4];
   CIM_Other REF Peer;
      [Override ( "Go" ), ValueMap { "0", "1" }]
   uint32 Go(
         [IN, OUT ( false )]
      string Target,
      CIM_Job REF Job,
      uint8 Data[]);
   datetime Stamp;
};
)",
                                "t.mof");
    ASSERT_EQ(doc.classes.size(), 1u);
    const mof::Class& c = doc.classes[0];
    EXPECT_EQ(c.name, "X_Thing");
    EXPECT_EQ(c.superclass, "CIM_Base");
    EXPECT_EQ(c.line, 5);
    EXPECT_TRUE(c.hasFlag("abstract"));
    ASSERT_NE(c.qualifier("Description"), nullptr);
    EXPECT_EQ(c.qualifier("Description")->value.text, "Two parts.");
    EXPECT_EQ(c.qualifier("Version")->value.text, "2.1");

    ASSERT_EQ(c.properties.size(), 5u);
    EXPECT_EQ(c.properties[0].typeText(), "string");
    EXPECT_TRUE(c.properties[0].hasFlag("KEY"));
    EXPECT_EQ(c.properties[0].qualifier("MaxLen")->value.integer, 256);
    EXPECT_EQ(c.properties[1].typeText(), "uint16[]");
    ASSERT_TRUE(c.properties[1].defaultValue.has_value());
    EXPECT_THAT(c.properties[1].defaultValue->integers(), ElementsAre(1, 2));
    EXPECT_EQ(c.properties[2].typeText(), "uint8[]");
    EXPECT_EQ(c.properties[3].typeText(), "ref CIM_Other");
    EXPECT_EQ(c.property("stamp")->type, "datetime");
    EXPECT_FALSE(c.property("Stamp")->hasFlag("Key"));

    ASSERT_EQ(c.methods.size(), 1u);
    const mof::Method& go = c.methods[0];
    EXPECT_EQ(go.name, "Go");
    EXPECT_EQ(go.returns.type, "uint32");
    EXPECT_EQ(go.returns.qualifier("Override")->value.text, "Go");
    EXPECT_THAT(go.returns.qualifier("ValueMap")->value.strings(),
                ElementsAre("0", "1"));
    ASSERT_EQ(go.parameters.size(), 3u);
    EXPECT_EQ(go.parameters[0].name, "Target");
    EXPECT_TRUE(go.parameters[0].hasFlag("In"));
    EXPECT_FALSE(go.parameters[0].hasFlag("Out")) << "OUT ( false )";
    EXPECT_EQ(go.parameters[1].typeText(), "ref CIM_Job");
    EXPECT_EQ(go.parameters[2].typeText(), "uint8[]");
}

TEST(MofReader, KeywordsAndTypesIgnoreCase)
{
    const auto doc =
        mof::parse("CLASS a_B { UINT16 x; String Y; DateTime z; };", "t.mof");
    ASSERT_EQ(doc.classes.size(), 1u);
    EXPECT_EQ(doc.classes[0].superclass, "");
    EXPECT_EQ(doc.classes[0].properties[0].type, "uint16");
    EXPECT_EQ(doc.classes[0].properties[1].type, "string");
    EXPECT_EQ(doc.classes[0].properties[2].type, "datetime");
}

TEST(MofReader, InstancesWithLiteralValues)
{
    const auto doc = mof::parse(R"(
instance of PG_Thing
{
    Name = "a \"quoted\" \\ name\n";
    Types = {2, 5};
    Spaces = {"root/x"};
    Empty = {};
    Nothing = NULL;
    Flag = TRUE;
    Letter = 'q';
    Ratio = -1.5e3;
    Mask = 0x1F;
    Bits = 101b;
    Octal = 017;
    Negative = -42;
    Wide = "\x41\x00e9";
};
)",
                                "r.mof");
    ASSERT_EQ(doc.instances.size(), 1u);
    const mof::Instance& i = doc.instances[0];
    EXPECT_EQ(i.className, "PG_Thing");
    EXPECT_EQ(i.property("name")->text, "a \"quoted\" \\ name\n");
    EXPECT_THAT(i.property("Types")->integers(), ElementsAre(2, 5));
    EXPECT_THAT(i.property("Spaces")->strings(), ElementsAre("root/x"));
    EXPECT_TRUE(i.property("Empty")->integers().empty());
    EXPECT_TRUE(i.property("Nothing")->isNull());
    EXPECT_TRUE(i.property("Flag")->boolean);
    EXPECT_EQ(i.property("Letter")->text, "q");
    EXPECT_EQ(i.property("Ratio")->kind, mof::Value::Kind::Real);
    EXPECT_EQ(i.property("Ratio")->text, "-1.5e3");
    EXPECT_EQ(i.property("Mask")->integer, 31);
    EXPECT_EQ(i.property("Bits")->integer, 5);
    EXPECT_EQ(i.property("Octal")->integer, 15);
    EXPECT_EQ(i.property("Negative")->integer, -42);
    EXPECT_EQ(i.property("Wide")->text, "A\xc3\xa9");
    EXPECT_EQ(i.property("Missing"), nullptr);
    EXPECT_THROW(i.property("Name")->integers(), std::invalid_argument);
    EXPECT_THROW(i.property("Types")->strings(), std::invalid_argument);
}

TEST(MofReader, QualifierDeclarationsAndPragmas)
{
    const auto doc = mof::parse(R"(
#pragma locale ("en_US")
Qualifier Key : boolean = false, Scope(property, reference),
    Flavor(DisableOverride, ToSubclass);
Qualifier ValueMap : string[], Scope(property, method, parameter);
Qualifier MaxLen : uint32 = null, Scope(property);
)",
                                "q.mof");
    ASSERT_EQ(doc.pragmas.size(), 1u);
    EXPECT_EQ(doc.pragmas[0].name, "locale");
    EXPECT_EQ(doc.pragmas[0].value, "en_US");
    ASSERT_EQ(doc.qualifiers.size(), 3u);
    EXPECT_EQ(doc.qualifiers[0].name, "Key");
    EXPECT_EQ(doc.qualifiers[0].type.type, "boolean");
    EXPECT_THAT(doc.qualifiers[0].scopes, ElementsAre("property", "reference"));
    EXPECT_THAT(doc.qualifiers[0].flavors,
                ElementsAre("DisableOverride", "ToSubclass"));
    EXPECT_TRUE(doc.qualifiers[1].type.isArray);
    EXPECT_FALSE(doc.qualifiers[1].defaultValue.has_value());
    EXPECT_TRUE(doc.qualifiers[2].defaultValue->isNull());
}

TEST(MofReader, QualifierFlavorsAfterAValueAreAccepted)
{
    const auto doc = mof::parse(
        "[Description(\"d\") : ToSubclass Translatable] class A { };", "t.mof");
    EXPECT_EQ(doc.classes[0].qualifier("Description")->value.text, "d");
}

TEST(MofReader, EmptyTextIsAnEmptyDocument)
{
    const auto doc = mof::parse("  // nothing\n/* here */\n", "t.mof");
    EXPECT_TRUE(doc.classes.empty());
    EXPECT_TRUE(doc.instances.empty());
}

TEST(MofReader, ErrorsNameTheSourceAndLine)
{
    EXPECT_EQ(errorOf("class A {\n  uint16 x;\n  string \"y\";\n};"),
              "t.mof:3: expected a name, found string \"y\"");
    EXPECT_EQ(errorOf("class A {\n  bogus x;\n};"),
              "t.mof:2: unknown data type \"bogus\"");
    EXPECT_EQ(errorOf("class A {\n  uint16 x\n};"),
              "t.mof:3: expected ';', found '}'");
    EXPECT_EQ(errorOf("class A { string x = \"open\n\"; };"),
              "t.mof:1: string literal not closed");
    EXPECT_EQ(errorOf("\n/* never closed"), "t.mof:2: comment not closed");
    EXPECT_EQ(errorOf("class A { uint16 x; uint16 X; };"),
              "t.mof:1: property \"X\" declared twice");
    EXPECT_EQ(errorOf("[Key, key] class A { };"),
              "t.mof:1: qualifier \"key\" given twice");
    EXPECT_EQ(errorOf("class A { uint8 x = 0x; };"),
              "t.mof:1: bad number \"0x\"");
    EXPECT_EQ(errorOf("class A { uint8 x = 12a; };"),
              "t.mof:1: bad number \"12a\"");
    EXPECT_EQ(errorOf("class A { uint8 x = 1.5e; };"),
              "t.mof:1: bad number \"1.5e\"");
    EXPECT_EQ(errorOf("class A { uint64 x = 18446744073709551616; };"),
              "t.mof:1: number out of range \"18446744073709551616\"");
    EXPECT_EQ(errorOf("class A { string x = \"\\q\"; };"),
              "t.mof:1: unknown escape \"\\q\"");
    EXPECT_EQ(errorOf("class A { uint8 x; } @"),
              "t.mof:1: unexpected character '@'");
    EXPECT_EQ(errorOf("instance of A as $a { };"),
              "t.mof:1: instance aliases are not supported");
    EXPECT_EQ(errorOf("instance of A { x = 1; X = 2; };"),
              "t.mof:1: property \"X\" given twice");
    EXPECT_EQ(errorOf("uint16 x;"),
              "t.mof:1: expected a class, an instance, a qualifier "
              "declaration or a pragma, found \"uint16\"");
}

TEST(MofReader, TruncatedInputEndsInAnErrorAtEveryCut)
{
    const std::string text = "[Description (\"d\")] class A : B {\n"
                             "  [Key] string K;\n"
                             "  uint32 M([IN] string p, B REF r);\n"
                             "};\n"
                             "instance of A { K = {\"x\", \"y\"}; };\n";
    ASSERT_NO_THROW(mof::parse(text, "t.mof"));
    // The class alone, with or without what follows it, is valid.
    const std::size_t classEnd = text.find("};\n") + 2;
    for (std::size_t cut = 1; cut + 1 < text.size(); ++cut)
    {
        const std::string prefix = text.substr(0, cut);
        if (cut == classEnd || cut == classEnd + 1)
        {
            continue;
        }
        EXPECT_THROW(mof::parse(prefix, "t.mof"), mof::MofError)
            << "cut at " << cut << ": " << prefix;
    }
}

TEST(MofReader, LargestAndSmallestIntegers)
{
    const auto doc = mof::parse("instance of A { Max = 18446744073709551615; "
                                "Min = -9223372036854775808; };",
                                "t.mof");
    EXPECT_EQ(
        static_cast<std::uint64_t>(doc.instances[0].property("Max")->integer),
        18446744073709551615u);
    EXPECT_EQ(doc.instances[0].property("Min")->integer,
              std::numeric_limits<std::int64_t>::min());
    EXPECT_THAT(errorOf("instance of A { x = -9223372036854775809; };"),
                HasSubstr("number out of range"));
}

TEST(MofReader, UnreadableFileIsAnError)
{
    EXPECT_THROW(mof::parseFile("/nonexistent/dir/x.mof"), mof::MofError);
}

} // namespace
