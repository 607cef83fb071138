#include "host/VXMediaGroup.h"

#include <gtest/gtest.h>

#include <thread>

#include "tests/support/HostEnvironment.h"

namespace vexo {
namespace {

VXMediaObjectRef item(const std::string& path) {
    return std::make_shared<VXMediaObject>(VXMediaTypeMovie, path, path);
}

VXMediaGroupRef group(const std::string& ID) {
    return std::make_shared<VXMediaGroup>(VXReelixFolderGroupTypeIdentifier, ID);
}

std::vector<std::string> IDs(const VXMediaObjectList& list) {
    std::vector<std::string> result;
    for (const VXMediaObjectRef& mediaObject : list)
        result.push_back(mediaObject->ID());
    return result;
}

TEST(GroupTest, TypeIdentifiersAreDistinctObjectsNamedAfterTheirSymbols) {
    const std::vector<const VXGroupTypeIdentifier*> identifiers{&VXReelixRootGroupTypeIdentifier,
                                                                &VXReelixProjectGroupTypeIdentifier,
                                                                &VXReelixProjectLibraryGroupTypeIdentifier,
                                                                &VXReelixFolderGroupTypeIdentifier,
                                                                &VXReelixOldReelixProjectsGroupTypeIdentifier,
                                                                &VXReelixEventLibraryGroupTypeIdentifier,
                                                                &VXReelixEventCalendarGroupTypeIdentifier,
                                                                &VXReelixEventGroupTypeIdentifier};
    for (std::size_t i = 0; i < identifiers.size(); ++i) {
        for (std::size_t j = 0; j < identifiers.size(); ++j)
            EXPECT_EQ(*identifiers[i] == *identifiers[j], i == j);
    }
    EXPECT_STREQ(VXReelixEventCalendarGroupTypeIdentifier.text(), "VXReelixEventCalendarGroupTypeIdentifier");
}

TEST(GroupTest, ACopyOfATextIsAnotherTypeIdentifier) {
    static const VXGroupTypeIdentifier copy{"VXReelixEventGroupTypeIdentifier"};
    EXPECT_FALSE(copy == VXReelixEventGroupTypeIdentifier);
}

TEST(GroupTest, AGroupThatWasGivenNoItemsReportsThoseOfItsChildren) {
    const auto parent = group("parent");
    const auto first = group("first");
    const auto second = group("second");
    first->setMediaObjects({item("a"), item("b")});
    second->setMediaObjects({item("c")});
    parent->addChildGroup(first);
    parent->addChildGroup(second);

    EXPECT_EQ(IDs(parent->mediaObjects()), (std::vector<std::string>{"a", "b", "c"}));
    EXPECT_EQ(parent->mediaObjectCount(), 3u);
    EXPECT_EQ(parent->ownMediaObjects(), std::nullopt);
}

TEST(GroupTest, ItemsAreGatheredThroughGroupsWithoutItemsAndNotBelowThoseWithSome) {
    const auto root = group("root");
    const auto middle = group("middle");
    const auto empty = group("empty");
    const auto below = group("below");
    const auto last = group("last");
    root->setChildGroups({middle, empty, group("without anything"), last});
    middle->setChildGroups({last, last});
    empty->setMediaObjects({});
    empty->addChildGroup(below);
    below->setMediaObjects({item("hidden")});
    last->setMediaObjects({item("a"), item("b")});

    EXPECT_EQ(IDs(root->mediaObjects()), (std::vector<std::string>{"a", "b", "a", "b", "a", "b"}));
    EXPECT_EQ(root->mediaObjectCount(), 6u);
}

TEST(GroupTest, AGroupThatWasGivenAnEmptyListReportsNone) {
    const auto parent = group("parent");
    const auto child = group("child");
    child->setMediaObjects({item("a")});
    parent->addChildGroup(child);

    parent->setMediaObjects({});
    EXPECT_TRUE(parent->mediaObjects().empty());
    EXPECT_EQ(parent->mediaObjectCount(), 0u);
}

TEST(GroupTest, AddingNilLeavesTheChildrenUnchanged) {
    const auto parent = group("parent");
    parent->addChildGroup(group("child"));
    parent->addChildGroup(nullptr);
    EXPECT_EQ(parent->childGroups().size(), 1u);
}

TEST(GroupTest, ASnapshotOfChildrenStaysAsItWas) {
    const auto parent = group("parent");
    parent->addChildGroup(group("first"));
    const VXMediaGroupList before = parent->childGroups();
    parent->addChildGroup(group("second"));
    parent->setChildGroups({});
    ASSERT_EQ(before.size(), 1u);
    EXPECT_EQ(before[0]->ID(), "first");
}

TEST(GroupTest, ACopyHasTheSameFieldsAndListsOfItsOwn) {
    const auto original = group("id");
    original->setName("name");
    original->setPath("/a b");
    original->setAttributes({{"key", 7}});
    original->setMediaObjects({item("a"), item("b")});
    original->addChildGroup(group("child"));

    const auto copy = original->copy();
    copy->setMediaObjects({item("c")});

    EXPECT_EQ(copy->ID(), "id");
    EXPECT_EQ(copy->name(), "name");
    EXPECT_EQ(copy->URL()->absoluteString(), "file:///a%20b");
    EXPECT_EQ(*copy->attributes(), *original->attributes());
    EXPECT_EQ(copy->childGroups().size(), 1u);
    EXPECT_EQ(IDs(original->mediaObjects()), (std::vector<std::string>{"a", "b"}));
}

TEST(GroupTest, ReadersSeeConsistentListsWhileAWriterReplacesThem) {
    const auto shared = group("shared");
    shared->setMediaObjects({item("0")});
    std::thread writer([&shared] {
        for (int i = 1; i < 2000; ++i) {
            shared->setMediaObjects(shared->mediaObjects().appending(item(std::to_string(i))));
            if (i % 100 == 0)
                shared->setMediaObjects({item("0")});
        }
    });
    for (int i = 0; i < 500; ++i) {
        const VXMediaObjectList list = shared->mediaObjects();
        ASSERT_FALSE(list.empty());
        EXPECT_EQ(list[0]->ID(), "0");
        for (const VXMediaObjectRef& mediaObject : list)
            ASSERT_NE(mediaObject, nullptr);
    }
    writer.join();
}

TEST(GroupTest, TheModificationDateOfAFileIsRead) {
    testing_support::HostEnvironment environment;
    const std::string file = environment.home.writeFile("file");
    testing_support::setModificationTime(file, 1230768000.5);

    const auto date = VXMediaGroup::modDateForFile(file);
    ASSERT_NE(date, nullptr);
    EXPECT_NEAR(date->secondsSince1970(), 1230768000.5, 0.001);
    EXPECT_EQ(VXMediaGroup::modDateForFile(environment.home.path("missing")), nullptr);
}

}  // namespace
}  // namespace vexo
