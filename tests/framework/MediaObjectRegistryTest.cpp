#include "framework/MediaObjectRegistry.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <vector>

#include "host/VXConstants.h"

namespace vexo {
namespace {

VXMediaObjectRef itemWithID(const std::string& ID) {
    return std::make_shared<VXMediaObject>(VXMediaTypeMovie, "name", ID);
}

VXMediaGroupRef treeOf(const VXMediaObjectRef& item) {
    const auto root = std::make_shared<VXMediaGroup>(VXReelixRootGroupTypeIdentifier, "root");
    root->setMediaObjects({item});
    return root;
}

TEST(MediaObjectRegistryTest, AnItemIsFoundInEachRegistryThatHoldsIt) {
    const auto item = itemWithID("/a.mov");
    MediaObjectRegistry one, other;
    one.setTree(treeOf(item));
    other.setTree(treeOf(item));
    EXPECT_EQ(one.objectForID("/a.mov"), item);
    EXPECT_EQ(other.objectForID("/a.mov"), item);
    one.setTree(nullptr);
    EXPECT_EQ(one.objectForID("/a.mov"), nullptr);
    EXPECT_EQ(other.objectForID("/a.mov"), item);
}

TEST(MediaObjectRegistryTest, ThreadsThatAskWhileTreesComeFindTheItemOfOne) {
    const auto first = itemWithID("/a.mov"), second = itemWithID("/a.mov");
    MediaObjectRegistry registry;
    registry.setTree(treeOf(first));
    std::atomic<int> wrong = 0;
    std::vector<std::thread> threads;
    for (int i = 0; i < 2; ++i) {
        threads.emplace_back([&] {
            for (int j = 0; j < 1000; ++j) {
                const auto found = registry.objectForID("/a.mov");
                wrong += found != first && found != second;
            }
        });
    }
    for (int i = 0; i < 1000; ++i)
        registry.setTree(treeOf(i % 2 == 0 ? second : first));
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(wrong, 0);
}

}  // namespace
}  // namespace vexo
