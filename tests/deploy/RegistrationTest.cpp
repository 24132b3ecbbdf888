// The SFCB and OpenPegasus registrations register every class of the MOF,
// each for the MI types its class needs, under a provider name and library
// location the built library answers to.
#include "DeployFiles.h"
#include "ProviderLibrary.h"
#include "SfcbRegistration.h"

#include <algorithm>
#include <filesystem>
#include <map>
#include <set>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using ::testing::ElementsAreArray;
using ::testing::UnorderedElementsAreArray;

constexpr const char* nameSpace = "root/zanqx";

// The MI types a class needs: "indication" for an indication class, else
// "instance", and "method" when it declares methods of its own.
std::vector<std::string> neededTypes(const mof::Class& c)
{
    if (c.hasFlag("Indication"))
    {
        return {"indication"};
    }
    std::vector<std::string> types = {"instance"};
    if (!c.methods.empty())
    {
        types.push_back("method");
    }
    return types;
}

std::vector<std::string> projectClassNames()
{
    std::vector<std::string> names;
    for (const mof::Class& c : deploy::projectClasses().classes())
    {
        names.push_back(c.name);
    }
    return names;
}

// The library file name an object manager loads for a location.
std::string libraryFor(const std::string& location)
{
    return "lib" + location + ".so";
}

std::string builtLibraryName()
{
    return std::filesystem::path(SELPROV_LIBRARY).filename().string();
}

// Whether the built library exports the factory an object manager looks
// for: "<provider>_Create_<Type>MI".
bool exportsFactory(const std::string& provider, const std::string& type)
{
    static const std::map<std::string, std::string> miNames = {
        {"instance", "Instance"},
        {"method", "Method"},
        {"indication", "Indication"},
    };
    const auto mi = miNames.find(type);
    if (mi == miNames.end())
    {
        return false;
    }
    const host::ProviderLibrary library(SELPROV_LIBRARY, provider);
    const std::string symbol = provider + "_Create_" + mi->second + "MI";
    return library.symbol(symbol.c_str()) != nullptr;
}

TEST(SfcbRegistration, RegistersEveryClassForTheTypesItNeeds)
{
    const auto stanzas =
        mof::parseSfcbRegistrationFile(deploy::sfcbRegistrationPath());
    std::vector<std::string> registered;
    for (const mof::SfcbStanza& s : stanzas)
    {
        registered.push_back(s.className);
        const mof::Class* c = deploy::projectClasses().find(s.className);
        ASSERT_NE(c, nullptr) << s.className << " is not in the MOF";
        EXPECT_EQ(c->name, s.className) << "spelling";
        ASSERT_NE(s.value("type"), nullptr) << s.className;
        EXPECT_THAT(mof::words(*s.value("type")),
                    ElementsAreArray(neededTypes(*c)))
            << s.className;
        ASSERT_NE(s.value("namespace"), nullptr) << s.className;
        EXPECT_EQ(mof::words(*s.value("namespace")),
                  std::vector<std::string>{nameSpace})
            << s.className;
        ASSERT_NE(s.value("unload"), nullptr) << s.className;
        EXPECT_EQ(*s.value("unload"), "never") << s.className;
    }
    EXPECT_THAT(registered, UnorderedElementsAreArray(projectClassNames()));
}

TEST(SfcbRegistration, NamesAProviderTheLibraryServes)
{
    const auto stanzas =
        mof::parseSfcbRegistrationFile(deploy::sfcbRegistrationPath());
    ASSERT_FALSE(stanzas.empty());
    for (const mof::SfcbStanza& s : stanzas)
    {
        ASSERT_NE(s.value("provider"), nullptr) << s.className;
        ASSERT_NE(s.value("location"), nullptr) << s.className;
        // One provider in one library for all classes, so that one process
        // serves them and the indication MI shares the instance MI's state.
        EXPECT_EQ(*s.value("provider"), *stanzas.front().value("provider"));
        EXPECT_EQ(libraryFor(*s.value("location")), builtLibraryName())
            << s.className;
        for (const std::string& type : mof::words(*s.value("type")))
        {
            EXPECT_TRUE(exportsFactory(*s.value("provider"), type))
                << s.className << ": no " << type << " MI factory for "
                << *s.value("provider");
        }
    }
}

std::vector<const mof::Instance*> instancesOf(const mof::Document& doc,
                                              const std::string& className)
{
    std::vector<const mof::Instance*> out;
    for (const mof::Instance& i : doc.instances)
    {
        if (mof::sameName(i.className, className))
        {
            out.push_back(&i);
        }
    }
    return out;
}

std::string textOf(const mof::Instance& i, const std::string& property)
{
    const mof::Value* v = i.property(property);
    return v != nullptr && v->kind == mof::Value::Kind::String ? v->text
                                                               : "<absent>";
}

class PegasusRegistration : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        doc = mof::parseFile(deploy::pegasusRegistrationPath());
    }
    mof::Document doc;
};

TEST_F(PegasusRegistration, ModuleIsTheCmpiLibrary)
{
    EXPECT_TRUE(doc.classes.empty());
    const auto modules = instancesOf(doc, "PG_ProviderModule");
    ASSERT_EQ(modules.size(), 1u);
    const mof::Instance& m = *modules.front();
    EXPECT_FALSE(textOf(m, "Name").empty());
    EXPECT_FALSE(textOf(m, "Vendor").empty());
    EXPECT_EQ(textOf(m, "Version"), SELPROV_VERSION);
    EXPECT_EQ(textOf(m, "InterfaceType"), "CMPI");
    EXPECT_EQ(textOf(m, "InterfaceVersion"), "2.0.0");
    EXPECT_EQ(libraryFor(textOf(m, "Location")), builtLibraryName());
}

TEST_F(PegasusRegistration, ProviderBelongsToTheModule)
{
    const auto modules = instancesOf(doc, "PG_ProviderModule");
    const auto providers = instancesOf(doc, "PG_Provider");
    ASSERT_EQ(modules.size(), 1u);
    ASSERT_EQ(providers.size(), 1u);
    EXPECT_EQ(textOf(*providers.front(), "ProviderModuleName"),
              textOf(*modules.front(), "Name"));
    const auto sfcb =
        mof::parseSfcbRegistrationFile(deploy::sfcbRegistrationPath());
    ASSERT_FALSE(sfcb.empty());
    EXPECT_EQ(textOf(*providers.front(), "Name"),
              *sfcb.front().value("provider"))
        << "both object managers must find the same factories";
    EXPECT_EQ(textOf(*modules.front(), "Location"),
              *sfcb.front().value("location"));
}

TEST_F(PegasusRegistration, CapabilitiesCoverEveryClassForTheTypesItNeeds)
{
    const auto modules = instancesOf(doc, "PG_ProviderModule");
    const auto providers = instancesOf(doc, "PG_Provider");
    ASSERT_EQ(modules.size(), 1u);
    ASSERT_EQ(providers.size(), 1u);
    const std::string provider = textOf(*providers.front(), "Name");
    const std::map<std::int64_t, std::string> providerTypes = {
        {2, "instance"}, {4, "indication"}, {5, "method"}};

    std::vector<std::string> classes;
    std::set<std::string> capabilityIds;
    for (const mof::Instance* c : instancesOf(doc, "PG_ProviderCapabilities"))
    {
        const std::string className = textOf(*c, "ClassName");
        classes.push_back(className);
        EXPECT_TRUE(capabilityIds.insert(textOf(*c, "CapabilityID")).second)
            << "CapabilityID given twice: " << textOf(*c, "CapabilityID");
        EXPECT_EQ(textOf(*c, "ProviderModuleName"),
                  textOf(*modules.front(), "Name"));
        EXPECT_EQ(textOf(*c, "ProviderName"), provider);
        ASSERT_NE(c->property("Namespaces"), nullptr) << className;
        EXPECT_EQ(c->property("Namespaces")->strings(),
                  std::vector<std::string>{nameSpace})
            << className;
        const mof::Class* declared = deploy::projectClasses().find(className);
        ASSERT_NE(declared, nullptr) << className << " is not in the MOF";
        EXPECT_EQ(declared->name, className) << "spelling";
        ASSERT_NE(c->property("ProviderType"), nullptr) << className;
        std::vector<std::string> types;
        for (const std::int64_t code : c->property("ProviderType")->integers())
        {
            const auto type = providerTypes.find(code);
            ASSERT_NE(type, providerTypes.end())
                << className << ": ProviderType " << code;
            types.push_back(type->second);
            EXPECT_TRUE(exportsFactory(provider, type->second))
                << className << ": no " << type->second << " MI factory";
        }
        EXPECT_THAT(types, ElementsAreArray(neededTypes(*declared)))
            << className;
    }
    EXPECT_THAT(classes, UnorderedElementsAreArray(projectClassNames()));
}

TEST(ProviderFactories, MissingFactoriesAreSeenAsMissing)
{
    // The check of the registrations relies on a missing factory being
    // seen as missing.
    EXPECT_FALSE(exportsFactory("NoSuchProvider", "instance"));
    EXPECT_FALSE(exportsFactory("SELProvider", "association"));
}

} // namespace
