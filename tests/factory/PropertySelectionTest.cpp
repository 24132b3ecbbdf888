#include "PropertySelection.h"

#include <string>

#include <gtest/gtest.h>

namespace
{

using QX::SELComposite::PropertySelection;

TEST(PropertySelection, NoListAndNotKeysOnlyWantsEverything)
{
    const PropertySelection selection(nullptr, false);
    EXPECT_TRUE(selection.wants("Caption"));
    EXPECT_TRUE(selection.wants("AnyNameAtAll"));
}

TEST(PropertySelection, KeysOnlyOrAnEmptyListWantsNothingConditional)
{
    const PropertySelection keysOnly(nullptr, true);
    EXPECT_FALSE(keysOnly.wants("Caption"));
    const char* none[] = {nullptr};
    const PropertySelection empty(none, false);
    EXPECT_FALSE(empty.wants("Caption"));
    EXPECT_FALSE(empty.wants(""));
}

TEST(PropertySelection, ListedNamesAreComparedByteForByte)
{
    const char* listed[] = {"RecordID", "MessageTimestamp", "Caption",
                            "LogCreationClassName", nullptr};
    const PropertySelection selection(listed, false);
    EXPECT_TRUE(selection.wants("RecordID"));
    EXPECT_TRUE(selection.wants("MessageTimestamp"));
    EXPECT_TRUE(selection.wants("Caption"));
    EXPECT_TRUE(selection.wants("LogCreationClassName"));
    EXPECT_FALSE(selection.wants("recordid"));
    EXPECT_FALSE(selection.wants("Record"));
    EXPECT_FALSE(selection.wants("RecordIDs"));
    EXPECT_FALSE(selection.wants("Description"));
}

TEST(PropertySelection, KeysOnlyWithAListWantsTheListedNames)
{
    const char* listed[] = {"Caption", nullptr};
    const PropertySelection selection(listed, true);
    EXPECT_TRUE(selection.wants("Caption"));
    EXPECT_FALSE(selection.wants("Description"));
}

TEST(PropertySelection, DuplicatesAndHostileNamesAreHarmless)
{
    const std::string longName(100000, 'x');
    const char* listed[] = {"Caption",        "Caption",  "%n%s",
                            longName.c_str(), "\xff\xfe", nullptr};
    const PropertySelection selection(listed, false);
    EXPECT_TRUE(selection.wants("Caption"));
    EXPECT_TRUE(selection.wants("%n%s"));
    EXPECT_TRUE(selection.wants(longName.c_str()));
    EXPECT_TRUE(selection.wants("\xff\xfe"));
    EXPECT_FALSE(selection.wants("\xff"));
}

} // namespace
