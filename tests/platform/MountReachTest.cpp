// What lies on mounts whose server is gone, with real ones.
#include <gmock/gmock.h>

#include <chrono>
#include <thread>

#include "platform/linux/LinuxFileManager.h"
#include "platform/linux/MountReach.h"
#include "tests/platform/CollectedLog.h"
#include "tests/support/DeadMount.h"
#include "tests/support/FakeMountTable.h"
#include "tests/support/LoopImage.h"
#include "tests/support/TemporaryFolder.h"

using namespace platform;
using namespace std::chrono_literals;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;
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

    std::optional<std::string> mountPointOnTheWayTo(std::string_view relative) {
        return ServedWays(served_).mountPointOnTheWayTo(folder_.path(relative));
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

TEST_F(ServedWaysTest, EndAtTheFirstServedMount) {
    EXPECT_EQ(mountPointOnTheWayTo("served"), served);
    EXPECT_EQ(mountPointOnTheWayTo("served/a/b"), served);
    EXPECT_EQ(mountPointOnTheWayTo("a/served/b"), folder_.path("a/served"));
}

TEST_F(ServedWaysTest, LeadElsewhereAsWell) {
    for (const char* const path : {"a", "served2", "a/b/served", "missing/x", "served/../x", "served/.."})
        EXPECT_EQ(mountPointOnTheWayTo(path),
                  std::string_view(path).starts_with("served/") ? std::optional(served) : std::nullopt)
            << path;
}

TEST_F(ServedWaysTest, FollowLinks) {
    folder_.makeLink("absolute", served);
    folder_.makeLink("relative", "served");
    folder_.makeLink("folder/up", "../relative");
    folder_.makeLink("below", "served/below");
    folder_.makeLink("chain", "folder/up/.");
    folder_.makeLink("away", "/");
    for (const char* const path : {"absolute", "relative/a", "folder/up", "folder/up/b", "below", "chain"})
        EXPECT_EQ(mountPointOnTheWayTo(path), served) << path;
    EXPECT_EQ(mountPointOnTheWayTo("away/usr"), std::nullopt);
    EXPECT_EQ(mountPointOnTheWayTo("away" + served), served);
}

TEST_F(ServedWaysTest, ThatLeadNowhereEnd) {
    folder_.makeLink("circle", "circle");
    folder_.makeLink("circle of two/a", "b");
    folder_.makeLink("circle of two/b", "a/x");
    for (const char* const path : {"circle", "circle/a", "circle of two/a", "circle of two/b/c"})
        EXPECT_EQ(mountPointOnTheWayTo(path), std::nullopt) << path;
    std::string deep;
    while (deep.size() < 10'000)
        deep += "deep/";
    EXPECT_EQ(mountPointOnTheWayTo(deep), std::nullopt);
    for (const char* const odd : {"", "relative/path", "."})
        EXPECT_EQ(ServedWays(theseAlone({"/"})).mountPointOnTheWayTo(odd), std::nullopt) << odd;
}

TEST_F(ServedWaysTest, BeginAtARootThatMayBeServed) {
    ServedWays ways(theseAlone({"/"}));
    for (const char* const path : {"/", "/a", "/a/b"})
        EXPECT_EQ(ways.mountPointOnTheWayTo(path), "/") << path;
}

TEST_F(ServedWaysTest, AreTheSameTheSecondTimeAndAfterManyOthers) {
    folder_.makeLink("link", "served");
    ServedWays ways(served_);
    for (int round = 0; round < 2; ++round) {
        EXPECT_EQ(ways.mountPointOnTheWayTo(folder_.path("link/a/b")), served);
        EXPECT_EQ(ways.mountPointOnTheWayTo(folder_.path("a/b/c")), std::nullopt);
        for (int i = 0; i < 3000; ++i)
            ASSERT_EQ(ways.mountPointOnTheWayTo(folder_.path(std::to_string(i) + "/x")), std::nullopt);
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

TEST_F(DeadServerReach, AServerThatAnswersAfterAllIsInReach) {
    const MountReach reach(table_, log_, nextToNone);
    EXPECT_FALSE(reach.isInReach(gone_));
    mount_.reset();  // ends all waiting with an error
    const auto deadline = std::chrono::steady_clock::now() + 60s;
    while (!reach.isInReach(gone_) && std::chrono::steady_clock::now() < deadline)
        std::this_thread::yield();
    EXPECT_TRUE(reach.isInReach(gone_));
}

TEST_F(DeadServerReach, NoOperationOnFilesWaitsForIt) {
    const LinuxFileManager files(
        std::nullopt, table_, log_, [](std::string_view) { return false; }, "/Volumes", nextToNone);
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
    EXPECT_THAT(log_.lines(), Each(lineAbout(gone_)));
    EXPECT_EQ(files.kindOfItemAtPath(folder_.path()), FileKind::directory);
}

TEST_F(DeadServerReach, TheKernelsTableNamesIt) {
    const SystemMountTable system;
    EXPECT_TRUE(system.servedMountPoints()->contains(gone_));
    const auto before = system.servedMountPoints();
    EXPECT_EQ(system.servedMountPoints(), before);
    mount_.reset();
    EXPECT_FALSE(system.servedMountPoints()->contains(gone_));
}
