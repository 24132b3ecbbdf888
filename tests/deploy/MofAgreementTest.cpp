// The MOF agrees with the provider: every property the provider sets is
// declared, with the CIM type it is set with; object paths carry exactly
// the keys of their class; ClearLog returns the declared type; and what the
// MOF declares for itself, the provider sets.
#include "CimTypes.h"
#include "DeployFiles.h"
#include "ExpectedIndications.h"
#include "ProvidedInstances.h"

#include <algorithm>
#include <set>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using deploy::ProvidedInstances;
using ::testing::IsEmpty;
using ::testing::UnorderedElementsAreArray;

using MofAgreement = ProvidedInstances;

// Every property that the project's MOF declares in @p className itself
// (not inherited) must be among @p instances' properties with that type.
std::vector<std::string>
unsetDeclarations(const std::string& className,
                  const std::vector<host::Instance>& instances)
{
    std::vector<std::string> problems;
    const mof::Class* c = deploy::projectClasses().find(className);
    for (const mof::Feature& declared : c->properties)
    {
        const bool set = std::any_of(
            instances.begin(), instances.end(),
            [&](const host::Instance& i)
            {
                const host::Value* v = i.property(declared.name);
                return v != nullptr && deploy::mofTypeOf(v->type) ==
                                           deploy::mofTypeOf(declared);
            });
        if (!set)
        {
            problems.push_back(className + "." + declared.name + " (" +
                               declared.typeText() +
                               ") is declared but the provider never sets it "
                               "with that type");
        }
    }
    return problems;
}

std::vector<host::Instance> indicationsOf(const std::string& className)
{
    std::vector<host::Instance> out;
    for (const host::Instance& i : deploy::expectedIndications())
    {
        if (mof::sameName(i.path.className, className))
        {
            out.push_back(i);
        }
    }
    return out;
}

TEST(ProjectMof, DeclaresTheInstanceAndIndicationClasses)
{
    EXPECT_THAT(
        deploy::instanceClassNames(),
        UnorderedElementsAreArray({"ZAN_MgmtHwLog", "ZAN_MgmtHwLogEntry"}));
    EXPECT_THAT(
        deploy::indicationClassNames(),
        UnorderedElementsAreArray(
            {"ZAN_MgmtHwLogEntryEvent", "ZAN_MgmtHwLogClearEvent",
             "ZAN_MgmtHwLogFullEvent", "ZANx_AutomaticServerRestartEvent"}));
}

TEST(ProjectMof, EveryClassAndPropertyItDeclaresIsDescribed)
{
    for (const mof::Class& c : deploy::projectClasses().classes())
    {
        const mof::Qualifier* d = c.qualifier("Description");
        EXPECT_TRUE(d != nullptr && !d->value.text.empty()) << c.name;
        for (const mof::Feature& p : c.properties)
        {
            const mof::Qualifier* pd = p.qualifier("Description");
            EXPECT_TRUE(pd != nullptr && !pd->value.text.empty())
                << c.name << "." << p.name;
        }
        for (const mof::Method& m : c.methods)
        {
            const mof::Qualifier* md = m.returns.qualifier("Description");
            EXPECT_TRUE(md != nullptr && !md->value.text.empty())
                << c.name << "." << m.name;
        }
    }
}

TEST_F(MofAgreement, EveryPropertyTheProviderSetsIsDeclaredWithItsType)
{
    SKIP_WITHOUT_SCHEMA();
    const mof::ClassRepository& classes = deploy::projectAndSchemaClasses();
    for (const std::string& className : deploy::instanceClassNames())
    {
        for (const host::Instance& instance : instancesOf(className))
        {
            EXPECT_EQ(instance.path.className, className);
            EXPECT_THAT(deploy::propertyMismatches(classes, instance),
                        IsEmpty());
        }
    }
}

TEST_F(MofAgreement, ObjectPathsCarryExactlyTheKeysOfTheirClass)
{
    SKIP_WITHOUT_SCHEMA();
    const mof::ClassRepository& classes = deploy::projectAndSchemaClasses();
    for (const std::string& className : deploy::instanceClassNames())
    {
        for (const host::Instance& instance : instancesOf(className))
        {
            EXPECT_THAT(deploy::keyMismatches(classes, instance.path),
                        IsEmpty());
        }
        for (const host::ObjectPath& path : namesOf(className))
        {
            EXPECT_THAT(deploy::keyMismatches(classes, path), IsEmpty());
        }
    }
}

TEST_F(MofAgreement, WhatTheMofDeclaresItselfTheProviderSets)
{
    for (const std::string& className : deploy::instanceClassNames())
    {
        EXPECT_THAT(unsetDeclarations(className, instancesOf(className)),
                    IsEmpty());
    }
}

TEST_F(MofAgreement, MethodsReturnTheDeclaredType)
{
    for (const std::string& className : deploy::instanceClassNames())
    {
        const mof::Class* c = deploy::projectClasses().find(className);
        for (const mof::Method& method : c->methods)
        {
            const auto names = namesOf(className);
            ASSERT_FALSE(names.empty());
            const host::Outcome out =
                host().invokeMethod(names.front(), method.name);
            ASSERT_EQ(out.rc, CMPI_RC_OK) << className << "." << method.name;
            ASSERT_EQ(out.data.size(), 1u) << className << "." << method.name;
            EXPECT_EQ(deploy::mofTypeOf(out.data.front().type),
                      deploy::mofTypeOf(method.returns))
                << className << "." << method.name;
            EXPECT_TRUE(method.parameters.empty())
                << "the provider reads no method arguments";
        }
    }
}

TEST(IndicationAgreement, EveryIndicationClassHasItsIndication)
{
    // The warning and the critical fill both deliver the full event.
    std::set<std::string> classes;
    for (const host::Instance& i : deploy::expectedIndications())
    {
        classes.insert(i.path.className.str());
    }
    const std::vector<std::string> delivered(classes.begin(), classes.end());
    EXPECT_THAT(delivered,
                UnorderedElementsAreArray(deploy::indicationClassNames()));
}

TEST(IndicationAgreement, EveryIndicationPropertyIsDeclaredWithItsType)
{
    SKIP_WITHOUT_SCHEMA();
    const mof::ClassRepository& classes = deploy::projectAndSchemaClasses();
    for (const host::Instance& indication : deploy::expectedIndications())
    {
        EXPECT_TRUE(
            classes.hasInheritedFlag(indication.path.className, "Indication"))
            << indication.path.className;
        EXPECT_THAT(deploy::propertyMismatches(classes, indication), IsEmpty());
        EXPECT_THAT(deploy::keyMismatches(classes, indication.path), IsEmpty())
            << "indications have no keys";
    }
}

TEST(IndicationAgreement, AlertingElementsNameInstancesByTheirClassKeys)
{
    SKIP_WITHOUT_SCHEMA();
    const mof::ClassRepository& classes = deploy::projectAndSchemaClasses();
    for (const host::Instance& indication : deploy::expectedIndications())
    {
        const host::Value* element =
            indication.property("AlertingManagedElement");
        ASSERT_NE(element, nullptr) << indication.path.className;
        host::ObjectPath path = host::ObjectPath::parse(element->text());
        ASSERT_NE(classes.find(path.className), nullptr) << element->text();
        // Path text carries no types: compare the key names only.
        for (auto& key : path.keys.edit())
        {
            key.second.type = CMPI_null;
        }
        EXPECT_THAT(deploy::keyMismatches(classes, path), IsEmpty())
            << indication.path.className;
    }
}

TEST(IndicationAgreement, WhatTheMofDeclaresItselfTheBuildersSet)
{
    for (const std::string& className : deploy::indicationClassNames())
    {
        EXPECT_THAT(unsetDeclarations(className, indicationsOf(className)),
                    IsEmpty());
    }
}

} // namespace
