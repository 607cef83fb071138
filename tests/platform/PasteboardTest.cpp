#include "platform/Pasteboard.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace platform {
namespace {

using testing::ElementsAre;

TEST(PasteboardTest, TypesStayInTheOrderOfDeclaration) {
    Pasteboard pasteboard;
    pasteboard.addTypes({"b", "a"}, nullptr);
    pasteboard.addTypes({"c", "a", "c"}, nullptr);
    EXPECT_THAT(pasteboard.types(), ElementsAre("b", "a", "c"));
}

TEST(PasteboardTest, DeclaredTypesTakeData) {
    Pasteboard pasteboard;
    pasteboard.addTypes({"count", "text"}, nullptr);
    EXPECT_TRUE(pasteboard.setPropertyList(Value(7), "count"));
    EXPECT_TRUE(pasteboard.setString("/a", "text"));
    ASSERT_TRUE(pasteboard.valueForType("count"));
    EXPECT_EQ(*pasteboard.valueForType("count")->integer(), 7);
    EXPECT_EQ(*pasteboard.valueForType("text")->string(), "/a");
}

TEST(PasteboardTest, TypesThatAreNotDeclaredTakeNone) {
    Pasteboard pasteboard;
    pasteboard.addTypes({"text"}, nullptr);
    EXPECT_FALSE(pasteboard.setString("x", "other"));
    EXPECT_FALSE(pasteboard.setPropertyList(Value(1), "tex"));
    EXPECT_FALSE(pasteboard.valueForType("other"));
    EXPECT_FALSE(pasteboard.valueForType("text"));
    EXPECT_THAT(pasteboard.types(), ElementsAre("text"));
}

TEST(PasteboardTest, LaterDataTakesThePlaceOfEarlier) {
    Pasteboard pasteboard;
    pasteboard.addTypes({"text"}, nullptr);
    pasteboard.setString("old", "text");
    pasteboard.addTypes({"text"}, nullptr);
    EXPECT_EQ(*pasteboard.valueForType("text")->string(), "old");
    pasteboard.setString("new", "text");
    EXPECT_EQ(*pasteboard.valueForType("text")->string(), "new");
}

}  // namespace
}  // namespace platform
