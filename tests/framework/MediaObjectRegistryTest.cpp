// Which registries answer an item.
#include "framework/MediaObjectRegistry.h"

#include <gtest/gtest.h>

#include <optional>

#include "host/VXConstants.h"

namespace vexo {
namespace {

class MediaObjectRegistryTest : public testing::Test {
  protected:
    MediaObjectRegistryTest() { root_->setMediaObjects({item_}); }

    const VXMediaObjectRef item_ = std::make_shared<VXMediaObject>(VXMediaTypeMovie, "a", "/a.mov");
    const VXMediaGroupRef root_ = std::make_shared<VXMediaGroup>(VXReelixRootGroupTypeIdentifier, "root");
};

TEST_F(MediaObjectRegistryTest, AnItemIsFoundInEachRegistryThatHoldsIt) {
    MediaObjectRegistry one, other;
    one.registerTree(root_);
    other.registerTree(root_);
    one.registerTree(root_);
    EXPECT_EQ(one.objectForID("/a.mov"), item_);
    EXPECT_EQ(other.objectForID("/a.mov"), item_);
}

TEST_F(MediaObjectRegistryTest, OneThatComesToLieWhereAnotherWasHoldsItsOwn) {
    std::optional<MediaObjectRegistry> registry;
    for (int i = 0; i < 2; ++i) {
        registry.emplace();
        EXPECT_EQ(registry->objectForID("/a.mov"), nullptr);
        registry->registerTree(root_);
        EXPECT_EQ(registry->objectForID("/a.mov"), item_);
    }
}

}  // namespace
}  // namespace vexo
