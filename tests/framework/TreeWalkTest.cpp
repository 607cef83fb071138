#include "framework/TreeWalk.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

namespace vexo {
namespace {

using testing::ElementsAre;

VXMediaGroupRef group(const std::string& ID, VXMediaGroupList children = {}) {
    auto made = std::make_shared<VXMediaGroup>(VXReelixFolderGroupTypeIdentifier, ID);
    made->setChildGroups(std::move(children));
    return made;
}

// The IDs of the groups that were visited, of which `visit` may answer false and change what it likes.
template <typename Visit>
std::vector<std::string> visited(const VXMediaGroupRef& root, const Visit& visit) {
    std::vector<std::string> IDs;
    visitGroups(root, [&](const VXMediaGroupRef& each) {
        IDs.push_back(each->ID().value_or("nil"));
        return visit(IDs.back());
    });
    return IDs;
}

TEST(TreeWalk, PassesAGroupBeforeItsChildrenAndTheseInOrder) {
    const auto root = group("root", {group("a", {group("b", {group("c")})}), group("d"), group("e")});
    EXPECT_THAT(visited(root, [](const std::string&) { return true; }),
                ElementsAre("root", "a", "b", "c", "d", "e"));
}

TEST(TreeWalk, EndsWhereItIsAnsweredFalse) {
    const auto root = group("root", {group("a", {group("b")}), group("c")});
    EXPECT_THAT(visited(root, [](const std::string& ID) { return ID != "b"; }),
                ElementsAre("root", "a", "b"));
}

TEST(TreeWalk, GoesOnWithTheChildrenThatThereWere) {
    const auto root = group("root", {group("a"), group("b")});
    EXPECT_THAT(visited(root,
                        [&](const std::string& ID) {
                            if (ID == "a")
                                root->setChildGroups({group("c")});
                            return true;
                        }),
                ElementsAre("root", "a", "b"));
}

TEST(TreeWalk, PassesTheChildrenThatAGroupIsGivenInItsVisit) {
    const auto root = group("root", {group("a")});
    EXPECT_THAT(visited(root,
                        [&](const std::string& ID) {
                            if (ID == "root")
                                root->setChildGroups({group("b"), group("c")});
                            return true;
                        }),
                ElementsAre("root", "b", "c"));
}

}  // namespace
}  // namespace vexo
