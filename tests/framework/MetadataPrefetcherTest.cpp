#include "framework/metadata/MetadataPrefetcher.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "host/VXConstants.h"
#include "tests/support/HostEnvironment.h"

using namespace testing_support;
using namespace vexo;
using testing::ElementsAre;

namespace {

VXMediaObjectRef item(const std::string& path) {
    auto mediaObject = std::make_shared<VXMediaObject>(3, path, path);
    mediaObject->setPath(path);
    return mediaObject;
}

VXMediaGroupRef group(const std::vector<std::string>& paths) {
    auto group = std::make_shared<VXMediaGroup>(VXReelixEventGroupTypeIdentifier, std::nullopt);
    VXMediaObjectList items;
    for (const std::string& path : paths)
        items = items.appending(item(path));
    group->setMediaObjects(items);
    return group;
}

class Prefetching : public testing::Test {
  protected:
    HostEnvironment host_;
    std::vector<std::string> read_;
    std::function<void(const std::string&)> whileReading_ = [](const std::string&) {};
    const std::shared_ptr<MetadataPrefetcher> prefetcher_ =
        std::make_shared<MetadataPrefetcher>([this](const std::string& path) {
            read_.push_back(path);
            whileReading_(path);
        });
};

}  // namespace

TEST_F(Prefetching, ReadsEveryMovieOfATreeOnAThreadOfLowestPriority) {
    const VXMediaGroupRef root = group({"/a"});
    root->addChildGroup(group({"/b", "/c"}));
    root->addChildGroup(group({"/d"}));
    prefetcher_->prefetch(root);
    EXPECT_THAT(read_, ElementsAre());
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(read_, ElementsAre("/a", "/b", "/c", "/d"));
    ASSERT_EQ(host_.dispatcher.requests().size(), 1u);
    EXPECT_EQ(host_.dispatcher.requests()[0].place, VirtualDispatcher::Place::ownThread);
    EXPECT_EQ(host_.dispatcher.requests()[0].priority, 0);
}

TEST_F(Prefetching, ATreeThatIsPublishedAgainIsNotGoneThroughAgain) {
    const VXMediaGroupRef root = group({"/a"}), other = group({"/b"});
    for (const VXMediaGroupRef& tree : {root, other, root, other}) {
        prefetcher_->prefetch(tree);
        host_.dispatcher.runDueBlocks();
    }
    EXPECT_THAT(read_, ElementsAre("/a", "/b"));
}

TEST_F(Prefetching, OneThreadGoesThroughTreesThatComeMeanwhile) {
    const VXMediaGroupRef later = group({"/later"});
    whileReading_ = [&](const std::string& path) {
        if (path == "/a")
            prefetcher_->prefetch(later);
    };
    prefetcher_->prefetch(group({"/a", "/b"}));
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(read_, ElementsAre("/a", "/b", "/later"));
    EXPECT_EQ(host_.dispatcher.requests().size(), 1u);
}

TEST_F(Prefetching, ACancelStopsBeforeTheNextFileAndForgetsWhatWaits) {
    prefetcher_->prefetch(group({"/a", "/b"}));
    prefetcher_->prefetch(group({"/c"}));
    whileReading_ = [&](const std::string&) { prefetcher_->cancel(); };
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(read_, ElementsAre("/a"));

    whileReading_ = [](const std::string&) {};
    prefetcher_->prefetch(group({"/d"}));
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(read_, ElementsAre("/a", "/d"));
}

TEST_F(Prefetching, AfterClosingNothingIsRead) {
    prefetcher_->prefetch(group({"/a"}));
    prefetcher_->close();
    prefetcher_->prefetch(group({"/b"}));
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(read_, ElementsAre());
    EXPECT_EQ(host_.dispatcher.requests().size(), 1u);
}

TEST_F(Prefetching, NoTreeIsPassedOver) {
    prefetcher_->prefetch(nullptr);
    EXPECT_TRUE(host_.dispatcher.requests().empty());
}

TEST_F(Prefetching, AFailureEndsTheTreeAloneAndIsAWarning) {
    whileReading_ = [](const std::string& path) {
        if (path == "/a")
            throw std::runtime_error("no memory");
    };
    prefetcher_->prefetch(group({"/a"}));
    prefetcher_->prefetch(group({"/b"}));
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(read_, ElementsAre("/a", "/b"));
    EXPECT_EQ(host_.diagnostics.warnings().size(), 1u);
}
