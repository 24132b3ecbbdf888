#include "ClassRepository.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using ::testing::ElementsAre;
using ::testing::HasSubstr;

mof::ClassRepository repositoryOf(const std::string& text)
{
    mof::ClassRepository repository;
    repository.add(mof::parse(text, "t.mof"));
    return repository;
}

const char* const hierarchy = R"(
[Indication] class Root { [Key] string Id; string Note; };
class Middle : Root { [Key, Override("Id")] string ID; uint16 Level; };
class Leaf : middle { [Key] datetime Stamp;
                      [Override("Level")] uint16 Level;
                      uint32 Go(); };
class Other { string Id; };
)";

TEST(ClassRepository, ChainRunsFromTheClassToItsRoot)
{
    const auto repository = repositoryOf(hierarchy);
    const auto chain = repository.chain("LEAF");
    ASSERT_EQ(chain.size(), 3u);
    EXPECT_EQ(chain[0]->name, "Leaf");
    EXPECT_EQ(chain[1]->name, "Middle");
    EXPECT_EQ(chain[2]->name, "Root");
    EXPECT_EQ(repository.chain("Other").size(), 1u);
}

TEST(ClassRepository, PropertiesResolveToTheMostDerivedDeclaration)
{
    const auto repository = repositoryOf(hierarchy);
    const mof::Class* declaredIn = nullptr;
    const mof::Feature* level =
        repository.findProperty("Leaf", "level", &declaredIn);
    ASSERT_NE(level, nullptr);
    EXPECT_EQ(declaredIn->name, "Leaf");
    const mof::Feature* note =
        repository.findProperty("Leaf", "Note", &declaredIn);
    ASSERT_NE(note, nullptr);
    EXPECT_EQ(declaredIn->name, "Root");
    EXPECT_EQ(repository.findProperty("Leaf", "Absent"), nullptr);
    EXPECT_NE(repository.findMethod("Leaf", "GO"), nullptr);
    EXPECT_EQ(repository.findMethod("Middle", "Go"), nullptr);
}

TEST(ClassRepository, KeysAreInheritedOnceEachUnderTheirLatestName)
{
    const auto repository = repositoryOf(hierarchy);
    EXPECT_THAT(repository.keys("Leaf"), ElementsAre("ID", "Stamp"));
    EXPECT_THAT(repository.keys("Root"), ElementsAre("Id"));
    EXPECT_TRUE(repository.keys("Other").empty());
}

TEST(ClassRepository, ClassQualifiersAreInheritedOnRequest)
{
    const auto repository = repositoryOf(hierarchy);
    EXPECT_TRUE(repository.hasInheritedFlag("Leaf", "Indication"));
    EXPECT_FALSE(repository.find("Leaf")->hasFlag("Indication"));
    EXPECT_FALSE(repository.hasInheritedFlag("Other", "Indication"));
}

TEST(ClassRepository, BrokenHierarchiesAreReported)
{
    EXPECT_THROW(repositoryOf(hierarchy).chain("Nowhere"), mof::MofError);
    try
    {
        repositoryOf("class A : Missing { };").chain("A");
        FAIL() << "no error for a missing superclass";
    }
    catch (const mof::MofError& e)
    {
        EXPECT_STREQ(e.what(),
                     "t.mof:1: superclass Missing of A is not defined");
    }
    mof::ClassRepository cycle;
    cycle.add(mof::parse("class A : B { }; class B : A { };", "t.mof"));
    EXPECT_THROW(cycle.chain("A"), mof::MofError);
    mof::ClassRepository twice;
    twice.add(mof::parse("class A { };", "one.mof"));
    try
    {
        twice.add(mof::parse("\nclass a { };", "two.mof"));
        FAIL() << "no error for a class defined twice";
    }
    catch (const mof::MofError& e)
    {
        EXPECT_THAT(e.what(), HasSubstr("two.mof:2: class a is already "
                                        "defined in one.mof"));
    }
}

} // namespace
