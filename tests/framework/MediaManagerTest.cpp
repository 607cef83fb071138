#include "host/VXMediaManager.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <condition_variable>
#include <thread>

#include "framework/Diagnostics.h"
#include "platform/KeyedUnarchiver.h"
#include "platform/linux/LinuxDispatcher.h"
#include "tests/support/HostEnvironment.h"

namespace vexo {
namespace {

using std::chrono::seconds;
using testing::ElementsAre;

// A manager whose loads a test writes.
class ScriptedManager final : public VXMediaManager {
  public:
    using VXMediaManager::VXMediaManager;

    std::function<VXMediaGroupRef()> load;
    int loads = 0;

    VXMediaGroupRef performLoadData() override {
        ++loads;
        return load ? load() : newMediaGroupWithTypeIdentifier(VXReelixRootGroupTypeIdentifier, "root");
    }
    std::string rootMediaGroupTitle() override { return "Scripted"; }
    platform::ImageRef rootMediaGroupIcon() override { return nullptr; }
    unsigned mediaTypesSupported() override { return VXMediaTypeMaskMovie; }
    std::string uniqueID() override { return "scripted"; }
    std::string displayName() override { return rootMediaGroupTitle(); }
    platform::ImageRef displayImage() override { return nullptr; }
    std::vector<VXMediaGroupRef> mediaGroups() override { return {}; }
    bool canLoadData() override { return true; }
    bool appInstalled() override { return true; }
    std::optional<std::string> defaultLoadingMessage() override { return std::nullopt; }
    std::optional<std::string> defaultNoDataMessage(const VXMediaGroupRef&) override { return std::nullopt; }
};

class MediaManagerTest : public testing::Test {
  protected:
    MediaManagerTest() : manager(std::make_shared<ScriptedManager>(environment.bundle)) {}

    VXMediaGroupRef newRoot() {
        return manager->newMediaGroupWithTypeIdentifier(VXReelixRootGroupTypeIdentifier, "root");
    }
    VXMediaObjectRef newItem(const std::string& ID) {
        return manager->newMediaObjectWithType(VXMediaTypeMovie, "name of " + ID, ID);
    }
    void loadNow() {
        manager->loadData();
        environment.dispatcher.runDueBlocks();
    }

    testing_support::HostEnvironment environment;
    std::shared_ptr<ScriptedManager> manager;
};

TEST_F(MediaManagerTest, ThereIsNoRootBeforeTheFirstLoad) {
    EXPECT_EQ(manager->rootMediaGroup(), nullptr);
    EXPECT_TRUE(manager->firstTimeCallingLoadData());
    EXPECT_FALSE(manager->isLoading());
}

TEST_F(MediaManagerTest, ALoadRunsOnAThreadOfItsOwnWithTheWantedPriority) {
    manager->setLoadThreadPriority(0.25);
    manager->loadData();
    EXPECT_TRUE(manager->isLoading());
    EXPECT_FALSE(manager->firstTimeCallingLoadData());
    ASSERT_EQ(environment.dispatcher.requests().size(), 1u);
    EXPECT_EQ(environment.dispatcher.requests()[0].place,
              testing_support::VirtualDispatcher::Place::ownThread);
    EXPECT_DOUBLE_EQ(environment.dispatcher.requests()[0].priority, 0.25);

    environment.dispatcher.runDueBlocks();
    EXPECT_FALSE(manager->isLoading());
    EXPECT_NE(manager->rootMediaGroup(), nullptr);
}

TEST_F(MediaManagerTest, RequestsDuringALoadLeadToOneMoreLoad) {
    manager->load = [this] {
        if (manager->loads == 1) {
            manager->loadData();
            manager->loadData();
        }
        return newRoot();
    };
    loadNow();
    EXPECT_EQ(manager->loads, 2);
    EXPECT_FALSE(manager->isLoading());
}

TEST_F(MediaManagerTest, ACancelledLoadIsDroppedAndTheLastTreeStays) {
    loadNow();
    const VXMediaGroupRef first = manager->rootMediaGroup();
    manager->load = [this] {
        manager->cancelLoad();
        EXPECT_TRUE(manager->isCancelLoadRequestPending());
        return newRoot();
    };
    loadNow();
    EXPECT_EQ(manager->rootMediaGroup(), first);
    EXPECT_FALSE(manager->isCancelLoadRequestPending());
}

TEST_F(MediaManagerTest, ACancelWithoutALoadChangesNothing) {
    manager->cancelLoad();
    EXPECT_FALSE(manager->isCancelLoadRequestPending());
}

TEST_F(MediaManagerTest, AClosedManagerStaysCancelledAndLoadsNoMore) {
    manager->close();
    EXPECT_TRUE(manager->isCancelLoadRequestPending());
    loadNow();
    EXPECT_EQ(manager->loads, 0);
}

TEST_F(MediaManagerTest, ALoadThatRaisesIsAWarningAndTheLastTreeStays) {
    loadNow();
    const VXMediaGroupRef first = manager->rootMediaGroup();
    manager->load = []() -> VXMediaGroupRef { throw std::runtime_error("no luck"); };
    loadNow();
    EXPECT_EQ(manager->rootMediaGroup(), first);
    EXPECT_EQ(manager->loads, 2);
    EXPECT_THAT(environment.diagnostics.warnings(), ElementsAre("a plug-in failed: no luck"));
}

TEST_F(MediaManagerTest, ALoadThatMeetsABrokenArchiveRunsOnceMoreWithBrokenArchivesAsUnreadable) {
    manager->load = [this]() -> VXMediaGroupRef {
        if (!platform::RejectedArchivesAsUnreadable::current())
            throw platform::ArchiveError("/a/Project", "is damaged");
        return newRoot();
    };
    loadNow();
    EXPECT_EQ(manager->loads, 2);
    EXPECT_NE(manager->rootMediaGroup(), nullptr);
    EXPECT_EQ(platform::RejectedArchivesAsUnreadable::current(), nullptr);
    EXPECT_THAT(environment.diagnostics.warnings(), ElementsAre("/a/Project: is damaged"));
}

TEST_F(MediaManagerTest, ItemsAreFoundByTheirIDOnceTheirTreeIsInstalled) {
    const auto root = newRoot();
    const auto item = newItem("/a.mov");
    root->setMediaObjects({item});
    EXPECT_EQ(manager->mediaObjectForID("/a.mov"), nullptr);
    manager->setRootMediaGroup(root);
    EXPECT_EQ(manager->mediaObjectForID("/a.mov"), item);
    EXPECT_EQ(manager->mediaObjectForID("/b.mov"), nullptr);
}

TEST_F(MediaManagerTest, ItemsThatATreeNoLongerHoldsAreFreed) {
    const auto root = newRoot();
    const std::weak_ptr<VXMediaObject> item = [&] {
        const auto made = newItem("/a.mov");
        root->setMediaObjects({made});
        return made;
    }();
    manager->setRootMediaGroup(root);
    root->setMediaObjects({});
    manager->setRootMediaGroup(root);
    EXPECT_TRUE(item.expired());
}

TEST_F(MediaManagerTest, AGroupsOwnItemsAreRegisteredBeforeThoseOfItsChildren) {
    const auto root = newRoot();
    const auto child = newRoot();
    const auto inRoot = newItem("/a.mov");
    const auto inChild = newItem("/a.mov");
    child->setMediaObjects({inChild});
    root->addChildGroup(child);
    root->setMediaObjects({inRoot});
    manager->setRootMediaGroup(root);
    EXPECT_EQ(manager->mediaObjectForID("/a.mov"), inRoot);
}

TEST_F(MediaManagerTest, AnItemIsFoundWhileATreeThatHoldsItIsInstalled) {
    const auto first = newItem("/a.mov");
    const auto second = newItem("/a.mov");
    auto root = newRoot();
    root->setMediaObjects({first});
    manager->setRootMediaGroup(root);
    EXPECT_EQ(manager->mediaObjectForID("/a.mov"), first);

    root = newRoot();
    root->setMediaObjects({second});
    manager->setRootMediaGroup(root);
    EXPECT_EQ(manager->mediaObjectForID("/a.mov"), second);

    root->setMediaObjects({first});
    manager->setRootMediaGroup(root);
    EXPECT_EQ(manager->mediaObjectForID("/a.mov"), first);

    manager->setRootMediaGroup(nullptr);
    EXPECT_EQ(manager->mediaObjectForID("/a.mov"), nullptr);
}

TEST_F(MediaManagerTest, ObserversHearOfEveryPublishedTreeWhileTheyLive) {
    int heard = 0;
    auto observer = std::make_shared<int>(0);
    manager->addTreeObserver(observer, [&heard](const VXMediaGroupRef&) { ++heard; });
    const auto root = newRoot();
    manager->setRootMediaGroup(root);
    manager->setRootMediaGroup(root);
    EXPECT_EQ(heard, 2);
    observer.reset();
    manager->setRootMediaGroup(root);
    EXPECT_EQ(heard, 2);
}

TEST_F(MediaManagerTest, ATreeThatNeedsReloadingIsReloadedByItselfAfterTheFirstLoad) {
    manager->setAutoReloadEnabled(true);
    manager->setNeedsReload(true);
    environment.dispatcher.runDueBlocks();
    EXPECT_EQ(manager->loads, 0);

    loadNow();
    EXPECT_FALSE(manager->needsReload());
    manager->setNeedsReload(true);
    environment.dispatcher.runDueBlocks();
    EXPECT_EQ(manager->loads, 2);
}

TEST_F(MediaManagerTest, WithoutAutoReloadNothingIsReloadedByItself) {
    loadNow();
    manager->setNeedsReload(true);
    environment.dispatcher.runDueBlocks();
    EXPECT_EQ(manager->loads, 1);
    EXPECT_TRUE(manager->needsReload());
}

TEST_F(MediaManagerTest, TheBaseWritesItemsAsPercentEncodedURIsAndPaths) {
    const auto item = newItem("/a b.mov");
    item->setPath("/a b.mov");
    platform::Pasteboard pasteboard;
    EXPECT_TRUE(manager->writeMediaObjects({item, newItem("without a path")}, pasteboard));
    EXPECT_EQ(pasteboard.valueForType("text/uri-list"), platform::Value("file:///a%20b.mov\r\n"));
    EXPECT_EQ(pasteboard.valueForType("text/plain"), platform::Value("/a b.mov"));
}

TEST_F(MediaManagerTest, TheBaseWritesNothingWhereThereIsNoPath) {
    platform::Pasteboard pasteboard;
    EXPECT_FALSE(manager->writeMediaObjects({newItem("x")}, pasteboard));
    EXPECT_FALSE(manager->writeMediaGroups({newRoot()}, pasteboard));
    EXPECT_TRUE(pasteboard.types().empty());
}

TEST_F(MediaManagerTest, TheBaseHasNoMenusAndNoOverlay) {
    EXPECT_EQ(manager->contextMenuForMediaGroup(newRoot()), nullptr);
    EXPECT_EQ(manager->contextMenuForMediaObject(newItem("x"), newRoot()), nullptr);
    EXPECT_EQ(manager->thumbnailOverlayForMediaObject(newItem("x"), {}, {100, 100}), nullptr);
}

// The real dispatcher: a load on a real thread, waited for and cancelled.
class RealLoadTest : public testing::Test {
  protected:
    RealLoadTest() {
        const platform::Services& fake = platform::services();
        scope.emplace(platform::Services{fake.fileManager, fake.workspace, fake.userDefaults, dispatcher,
                                         fake.notificationCenter, fake.systemLog});
        manager = std::make_shared<ScriptedManager>(environment.bundle);
    }

    testing_support::HostEnvironment environment;
    platform::LinuxDispatcher dispatcher{environment.log};
    std::optional<platform::ServicesScope> scope;
    std::shared_ptr<ScriptedManager> manager;
};

TEST_F(RealLoadTest, WaitingEndsWhenTheTreeIsInstalled) {
    std::thread::id loadThread;
    manager->load = [&] {
        loadThread = std::this_thread::get_id();
        return manager->newMediaGroupWithTypeIdentifier(VXReelixRootGroupTypeIdentifier, "root");
    };
    manager->loadData();
    manager->waitUntilLoaded();
    EXPECT_NE(manager->rootMediaGroup(), nullptr);
    EXPECT_NE(loadThread, std::this_thread::get_id());
}

TEST_F(RealLoadTest, ACancelEndsALoadThatTestsForIt) {
    manager->load = [this]() -> VXMediaGroupRef {
        while (!manager->isCancelLoadRequestPending())
            std::this_thread::yield();
        return nullptr;
    };
    manager->loadData();
    EXPECT_FALSE(manager->waitUntilLoaded(std::chrono::milliseconds(1)));
    manager->cancelLoad();
    manager->waitUntilLoaded();
    EXPECT_FALSE(manager->isLoading());
    EXPECT_EQ(manager->rootMediaGroup(), nullptr);
}

}  // namespace
}  // namespace vexo
