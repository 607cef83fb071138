// What lies on mounts whose server is gone, with real ones.
#include <gmock/gmock.h>

#include <chrono>

#include "platform/linux/LinuxFileManager.h"
#include "platform/linux/MountReach.h"
#include "tests/platform/CollectedLog.h"
#include "tests/support/DeadMount.h"
#include "tests/support/FakeMountTable.h"
#include "tests/support/LoopImage.h"
#include "tests/support/TemporaryFolder.h"

using namespace platform;
using namespace std::chrono_literals;
using testing::AllOf;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;
using testing::SizeIs;
using testing_support::DeadMount;
using testing_support::FakeMountTable;
using testing_support::ScopedMount;
using testing_support::TemporaryFolder;

namespace {

// Where nobody answers, the shorter the better.
constexpr auto nextToNone = 20ms;

MountTable::MountPoints theseAlone(std::set<std::string, std::less<>> mountPoints) {
    return std::make_shared<const std::set<std::string, std::less<>>>(std::move(mountPoints));
}

std::string lineAbout(const std::string& mountPoint) {
    return "cannot look at " + mountPoint + ": Connection timed out";
}

class ServedWaysTest : public testing::Test {
  protected:
    ServedWaysTest() { served_ = theseAlone({folder_.makeFolder("served"), folder_.path("a/served")}); }

    std::vector<std::string> mountPointsOnTheWayTo(std::string_view relative) {
        return ServedWays(served_).mountPointsOnTheWayTo(folder_.path(relative));
    }

    const TemporaryFolder folder_;
    const std::string served = folder_.path("served");
    MountTable::MountPoints served_;
};

class DeadServerReach : public testing::Test {
  protected:
    void SetUp() override {
        if (const auto reason = DeadMount::reasonAgainst())
            GTEST_SKIP() << *reason;
        mount_.emplace(gone_);
        table_.served = theseAlone({gone_});
    }

    const TemporaryFolder folder_;
    const std::string gone_ = folder_.makeFolder("gone");
    FakeMountTable table_;
    CollectedLog log_;
    std::optional<DeadMount> mount_;
};

}  // namespace

TEST_F(ServedWaysTest, TellWhichMountsAPathLeadsThrough) {
    for (const char* const path : {"served", "served/", "served/a/b", "served/../a", "a/../served"})
        EXPECT_THAT(mountPointsOnTheWayTo(path), ElementsAre(served)) << path;
    EXPECT_THAT(mountPointsOnTheWayTo("a/served/b"), ElementsAre(folder_.path("a/served")));
    for (const char* const path : {"", "a", "served2", "a/b/served", "missing/x", "\xFF"})
        EXPECT_THAT(mountPointsOnTheWayTo(path), IsEmpty()) << path;
}

TEST_F(ServedWaysTest, TellEachMountOnTheWay) {
    served_ = theseAlone({served, served + "/a/inner"});
    EXPECT_THAT(mountPointsOnTheWayTo("served/a/inner/b"), ElementsAre(served, served + "/a/inner"));
    served_ = theseAlone({"/", served});
    EXPECT_THAT(mountPointsOnTheWayTo("served/b"), ElementsAre("/", served));
}

TEST_F(ServedWaysTest, BeginAtTheRoot) {
    for (const char* const path : {"/", "//", "/a", "//a//b/"}) {
        EXPECT_THAT(ServedWays(theseAlone({"/"})).mountPointsOnTheWayTo(path), ElementsAre("/")) << path;
        EXPECT_THAT(ServedWays(served_).mountPointsOnTheWayTo(path), IsEmpty()) << path;
    }
}

TEST_F(ServedWaysTest, FollowLinks) {
    folder_.makeLink("absolute", served);
    folder_.makeLink("relative", "served");
    folder_.makeLink("folder/up", "../relative");
    folder_.makeLink("below", "served/below");
    folder_.makeLink("chain", "folder/up/.");
    folder_.makeLink("away", "/");
    for (const char* const path : {"absolute", "relative/a", "folder/up", "folder/up/b", "below", "chain"})
        EXPECT_THAT(mountPointsOnTheWayTo(path), ElementsAre(served)) << path;
    EXPECT_THAT(mountPointsOnTheWayTo("away/usr"), IsEmpty());
    EXPECT_THAT(mountPointsOnTheWayTo("away" + served), ElementsAre(served));
}

TEST_F(ServedWaysTest, ThatLeadNowhereEnd) {
    folder_.makeLink("circle", "circle");
    folder_.makeLink("circle of two/a", "b");
    folder_.makeLink("circle of two/b", "a/x");
    for (const char* const path : {"circle", "circle/a", "circle of two/a", "circle of two/b/c"})
        EXPECT_THAT(mountPointsOnTheWayTo(path), IsEmpty()) << path;
    std::string deep;
    while (deep.size() < 10'000)
        deep += "deep/";
    EXPECT_THAT(mountPointsOnTheWayTo("served/" + deep), IsEmpty());
    for (const char* const odd : {"", "relative/path", "."})
        EXPECT_THAT(ServedWays(theseAlone({"/"})).mountPointsOnTheWayTo(odd), IsEmpty()) << odd;
}

TEST_F(ServedWaysTest, AreTheSameTheSecondTimeAndAfterManyOthers) {
    folder_.makeLink("link", "served");
    ServedWays ways(served_);
    for (int round = 0; round < 2; ++round) {
        EXPECT_THAT(ways.mountPointsOnTheWayTo(folder_.path("link/a/b")), ElementsAre(served));
        EXPECT_THAT(ways.mountPointsOnTheWayTo(folder_.path("a/b/c")), IsEmpty());
        for (int i = 0; i < 3000; ++i)
            ASSERT_THAT(ways.mountPointsOnTheWayTo(folder_.path(std::to_string(i) + "/x")), IsEmpty());
    }
}

TEST(MountReach, WhatAnswersIsInReach) {
    const TemporaryFolder folder;
    FakeMountTable table;
    table.served = theseAlone({folder.path()});
    CollectedLog log;
    const MountReach reach(table, log);
    EXPECT_TRUE(reach.isInReach(folder.path()));
    EXPECT_TRUE(reach.isInReach(folder.path("missing")));
    EXPECT_TRUE(reach.isInReach("/usr"));
    EXPECT_THAT(log.lines(), IsEmpty());
}

TEST_F(DeadServerReach, WhatLiesOnTheMountIsOutOfReachAndTheRestIsNot) {
    const MountReach reach(table_, log_, nextToNone);
    folder_.makeLink("link", "gone");
    EXPECT_FALSE(reach.isInReach(gone_));
    EXPECT_FALSE(reach.isInReach(gone_ + "/a"));
    EXPECT_FALSE(reach.isInReach(folder_.path("link/b")));
    EXPECT_THAT(log_.lines(), ElementsAre(lineAbout(gone_), lineAbout(gone_), lineAbout(gone_)));
    EXPECT_TRUE(reach.isInReach(folder_.path("elsewhere")));
    mount_->awaitRequest();
}

TEST_F(DeadServerReach, IsInReachWhenItAnswersAfterAll) {
    const MountReach reach(table_, log_, nextToNone);
    EXPECT_FALSE(reach.isInReach(gone_));
    mount_.reset();  // the folder answers in its stead
    const auto deadline = std::chrono::steady_clock::now() + 60s;
    bool isInReach = false;
    while (!isInReach && std::chrono::steady_clock::now() < deadline)
        isInReach = reach.isInReach(gone_);
    EXPECT_TRUE(isInReach);
}

TEST_F(DeadServerReach, IsAskedOnceForAll) {
    const MountReach reach(table_, log_, nextToNone);
    for (int i = 0; i < 20; ++i)
        EXPECT_FALSE(reach.isInReach(gone_));
    mount_->takeRequest();
    EXPECT_FALSE(reach.isInReach(gone_));
    EXPECT_FALSE(mount_->hasRequest());
}

TEST_F(DeadServerReach, AnotherMountThatAppearsDoesNotHaveItAskedAgain) {
    const MountReach reach(table_, log_, nextToNone, /*freshness=*/0ms);
    EXPECT_FALSE(reach.isInReach(gone_));
    mount_->takeRequest();
    table_.served = theseAlone({gone_, "/elsewhere"});
    EXPECT_FALSE(reach.isInReach(gone_));
    EXPECT_FALSE(mount_->hasRequest());
}

TEST_F(DeadServerReach, HidesWhatIsMountedBelowOneThatAnswers) {
    table_.served = theseAlone({folder_.path(), gone_});
    const MountReach reach(table_, log_, /*patience=*/3s);
    EXPECT_FALSE(reach.isInReach(gone_ + "/a"));
    EXPECT_THAT(log_.lines(), ElementsAre(lineAbout(gone_)));
}

TEST_F(DeadServerReach, NoOperationOnFilesWaitsForIt) {
    const LinuxFileManager files(
        std::nullopt, table_, log_, [](std::string_view) { return false; }, folder_.path(), nextToNone);
    const std::string item = gone_ + "/item";
    EXPECT_EQ(files.kindOfItemAtPath(item), std::nullopt);
    EXPECT_EQ(files.contentsOfDirectoryAtPath(gone_), std::nullopt);
    EXPECT_EQ(files.openFolderAtPath(gone_), nullptr);
    EXPECT_EQ(files.attributesOfItemAtPath(item), std::nullopt);
    EXPECT_EQ(files.itemFlagsAtPath(gone_), std::nullopt);
    EXPECT_EQ(files.displayNameAtPath(item), std::nullopt);
    EXPECT_LT(files.extendedAttribute(item, "date", {}), 0);
    EXPECT_EQ(files.fileSystemTypeNameAtPath(gone_), std::nullopt);
    EXPECT_EQ(files.openFileAtPath(item), nullptr);
    EXPECT_FALSE(files.isInReach(item));
    EXPECT_THAT(log_.lines(), AllOf(SizeIs(10), Each(lineAbout(gone_))));
    EXPECT_EQ(files.resolvedPath(item), item);  // a volume by its place
    EXPECT_EQ(files.kindOfItemAtPath(folder_.path()), FileKind::directory);
}

TEST_F(DeadServerReach, ALinkThatLeadsThereHoldsUpNoFolder) {
    folder_.makeLink("event/clip.mov", gone_ + "/clip.mov");
    const LinuxFileManager files(
        std::nullopt, table_, log_, [](std::string_view) { return false; }, "/Volumes", nextToNone);
    const auto folder = files.openFolderAtPath(folder_.path("event"));
    ASSERT_TRUE(folder);
    const auto items = folder->allItems();
    ASSERT_THAT(items, Optional(SizeIs(1)));
    const FolderItem& link = items->front();
    EXPECT_EQ(folder->flagsOf(link), 0u);
    EXPECT_FALSE(folder->isPlainFile(link));
    EXPECT_EQ(folder->attributesOf(link), std::nullopt);
    EXPECT_EQ(folder->extendedAttributeOf(link, "date", {}), std::nullopt);
}

TEST_F(DeadServerReach, TheKernelsTableNamesIt) {
    const SystemMountTable system;
    EXPECT_TRUE(system.servedMountPoints()->contains(gone_));
    const auto before = system.servedMountPoints();
    EXPECT_EQ(system.servedMountPoints(), before);
    mount_.reset();
    EXPECT_FALSE(system.servedMountPoints()->contains(gone_));
}
