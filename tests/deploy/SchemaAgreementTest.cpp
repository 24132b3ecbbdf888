// The project's classes against the DMTF schema they derive from: the
// superclass each derives from, nothing redeclared that the schema already
// has, overrides that match what they override, and qualifiers the schema
// declares for the places they are used.
#include "DeployFiles.h"

#include <algorithm>
#include <map>

#include <gtest/gtest.h>

namespace
{

const mof::Class* superclassOf(const mof::Class& c)
{
    return deploy::projectAndSchemaClasses().find(c.superclass);
}

TEST(SchemaAgreement, ClassesDeriveFromTheSchemaClassesUsersExpect)
{
    SKIP_WITHOUT_SCHEMA();
    const std::map<std::string, std::string> expected = {
        {"ZAN_MgmtHwLog", "CIM_MessageLog"},
        {"ZAN_MgmtHwLogEntry", "CIM_LogRecord"},
        {"ZAN_MgmtHwLogEntryEvent", "CIM_AlertIndication"},
        {"ZAN_MgmtHwLogClearEvent", "CIM_AlertIndication"},
        {"ZAN_MgmtHwLogFullEvent", "CIM_AlertIndication"},
        {"ZANx_AutomaticServerRestartEvent", "CIM_AlertIndication"},
    };
    const mof::ClassRepository& classes = deploy::projectAndSchemaClasses();
    for (const mof::Class& c : deploy::projectClasses().classes())
    {
        ASSERT_EQ(expected.count(c.name), 1u) << c.name;
        EXPECT_EQ(c.superclass, expected.at(c.name));
        ASSERT_NO_THROW(classes.chain(c.name)) << c.name;
        EXPECT_EQ(classes.chain(c.name).back()->superclass, "") << c.name;
        const mof::Class* parent = superclassOf(c);
        ASSERT_NE(parent, nullptr) << c.name;
        EXPECT_FALSE(parent->source == deploy::classMofPath())
            << c.name << " must derive from a schema class";
    }
}

TEST(SchemaAgreement, OnlyWhatTheSchemaLacksIsDeclared)
{
    SKIP_WITHOUT_SCHEMA();
    const mof::ClassRepository& classes = deploy::projectAndSchemaClasses();
    for (const mof::Class& c : deploy::projectClasses().classes())
    {
        for (const mof::Feature& p : c.properties)
        {
            if (p.qualifier("Override") == nullptr)
            {
                EXPECT_EQ(classes.findProperty(c.superclass, p.name), nullptr)
                    << c.name << "." << p.name
                    << " is in the schema already: override it or drop it";
            }
        }
        for (const mof::Method& m : c.methods)
        {
            if (m.returns.qualifier("Override") == nullptr)
            {
                EXPECT_EQ(classes.findMethod(c.superclass, m.name), nullptr)
                    << c.name << "." << m.name
                    << "() is in the schema already: override it or drop it";
            }
        }
    }
}

TEST(SchemaAgreement, OverridesMatchWhatTheyOverride)
{
    SKIP_WITHOUT_SCHEMA();
    const mof::ClassRepository& classes = deploy::projectAndSchemaClasses();
    for (const mof::Class& c : deploy::projectClasses().classes())
    {
        for (const mof::Feature& p : c.properties)
        {
            const mof::Qualifier* o = p.qualifier("Override");
            if (o == nullptr)
            {
                continue;
            }
            EXPECT_TRUE(mof::sameName(o->value.text, p.name)) << c.name;
            const mof::Feature* base =
                classes.findProperty(c.superclass, o->value.text);
            ASSERT_NE(base, nullptr) << c.name << "." << p.name;
            EXPECT_EQ(p.typeText(), base->typeText())
                << c.name << "." << p.name;
            EXPECT_EQ(p.hasFlag("Key"), base->hasFlag("Key"))
                << c.name << "." << p.name;
        }
        for (const mof::Method& m : c.methods)
        {
            const mof::Qualifier* o = m.returns.qualifier("Override");
            if (o == nullptr)
            {
                continue;
            }
            EXPECT_TRUE(mof::sameName(o->value.text, m.name)) << c.name;
            const mof::Method* base =
                classes.findMethod(c.superclass, o->value.text);
            ASSERT_NE(base, nullptr) << c.name << "." << m.name;
            EXPECT_EQ(m.returns.typeText(), base->returns.typeText())
                << c.name << "." << m.name;
            ASSERT_EQ(m.parameters.size(), base->parameters.size())
                << c.name << "." << m.name;
            for (std::size_t i = 0; i < m.parameters.size(); ++i)
            {
                EXPECT_TRUE(mof::sameName(m.parameters[i].name,
                                          base->parameters[i].name));
                EXPECT_EQ(m.parameters[i].typeText(),
                          base->parameters[i].typeText());
            }
        }
    }
}

// Whether a qualifier declaration allows use on @p element ("class",
// "indication", "property", "method", "parameter").
bool allows(const mof::QualifierDeclaration& declaration,
            const std::vector<std::string>& elements)
{
    return std::any_of(declaration.scopes.begin(), declaration.scopes.end(),
                       [&](const std::string& scope)
                       {
                           if (mof::sameName(scope, "any"))
                           {
                               return true;
                           }
                           for (const std::string& e : elements)
                           {
                               if (mof::sameName(scope, e))
                               {
                                   return true;
                               }
                           }
                           return false;
                       });
}

void expectDeclared(const std::vector<mof::Qualifier>& used,
                    const std::vector<std::string>& elements,
                    const std::string& where)
{
    for (const mof::Qualifier& q : used)
    {
        const auto& declarations = deploy::schemaQualifiers();
        const auto d = std::find_if(
            declarations.begin(), declarations.end(),
            [&](const auto& decl) { return mof::sameName(decl.name, q.name); });
        if (d == declarations.end())
        {
            ADD_FAILURE() << where << ": qualifier " << q.name
                          << " is not declared by the schema";
            continue;
        }
        EXPECT_TRUE(allows(*d, elements))
            << where << ": qualifier " << q.name << " is not allowed there";
    }
}

TEST(SchemaAgreement, QualifiersAreDeclaredForWhereTheyAreUsed)
{
    SKIP_WITHOUT_SCHEMA();
    ASSERT_FALSE(deploy::schemaQualifiers().empty());
    for (const mof::Class& c : deploy::projectClasses().classes())
    {
        const std::vector<std::string> kind =
            c.hasFlag("Indication")
                ? std::vector<std::string>{"class", "indication"}
                : std::vector<std::string>{"class"};
        expectDeclared(c.qualifiers, kind, c.name);
        for (const mof::Feature& p : c.properties)
        {
            expectDeclared(p.qualifiers, {"property"}, c.name + "." + p.name);
        }
        for (const mof::Method& m : c.methods)
        {
            expectDeclared(m.returns.qualifiers, {"method"},
                           c.name + "." + m.name);
            for (const mof::Feature& p : m.parameters)
            {
                expectDeclared(p.qualifiers, {"parameter"},
                               c.name + "." + m.name + "." + p.name);
            }
        }
    }
}

TEST(ProjectMof, ValueMapsAndValuesPairUp)
{
    for (const mof::Class& c : deploy::projectClasses().classes())
    {
        std::vector<const mof::Feature*> features;
        for (const mof::Feature& p : c.properties)
        {
            features.push_back(&p);
        }
        for (const mof::Method& m : c.methods)
        {
            features.push_back(&m.returns);
        }
        for (const mof::Feature* f : features)
        {
            const mof::Qualifier* map = f->qualifier("ValueMap");
            const mof::Qualifier* values = f->qualifier("Values");
            ASSERT_EQ(map == nullptr, values == nullptr)
                << c.name << "." << f->name;
            if (map != nullptr)
            {
                EXPECT_EQ(map->value.strings().size(),
                          values->value.strings().size())
                    << c.name << "." << f->name;
            }
        }
    }
}

} // namespace
