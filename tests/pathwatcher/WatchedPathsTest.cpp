// The bookkeeping of watched paths on a made-up disk, where everything that the kernel may do can be
// arranged.
#include "framework/pathwatcher/WatchedPaths.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cerrno>
#include <random>
#include <set>

#include "platform/Path.h"
#include "tests/pathwatcher/FakeDisk.h"
#include "tests/pathwatcher/FakeMounts.h"
#include "tests/pathwatcher/FakePolling.h"

using namespace testing_support;
using namespace vexo;
using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::UnorderedElementsAre;

namespace {

using Changes = std::set<std::string>;

class WatchedDisk : public testing::Test {
  protected:
    WatchedDisk() {
        for (const char* folder : {"/home", "/home/Movies", "/home/Movies/a", "/home/Movies/b", "/tmp"})
            disk.makeFolder(folder);
    }

    // Made at the first call, so that a test can set the disk up before.
    WatchedPaths& paths() {
        if (!paths_) {
            WatchSeams seams;
            seams.events = disk.events();
            seams.folders = disk.access();
            seams.mounts = std::make_unique<FakeMounts>(mounts);
            seams.polling = std::make_unique<FakePolling>(looks);
            seams.resolvedPath = [](const std::string& path) { return std::optional(path); };
            paths_ = std::make_unique<WatchedPaths>(std::move(seams));
        }
        return *paths_;
    }
    void watch(const std::string& path) { paths().add(path); }

    // What is known to have changed.
    Changes changes() {
        while (disk.queueLength() > 0)
            paths().takeEvents();
        paths().takePollReports();
        Changes all;
        for (const auto& [watchedPath, changedPaths] : paths().burst().take())
            all.insert(changedPaths.begin(), changedPaths.end());
        return all;
    }

    FakeDisk disk;
    FakeMounts::Table mounts;
    FakePolling::Looks looks;

  private:
    std::unique_ptr<WatchedPaths> paths_;
};

}  // namespace

TEST_F(WatchedDisk, WatchesTheFolderItsFoldersAndTheWayToIt) {
    watch("/home/Movies");
    EXPECT_THAT(paths().watchedFolders(),
                UnorderedElementsAre("/home/Movies", "/home/Movies/a", "/home/Movies/b"));
    EXPECT_EQ(paths().watchCount(), 5u);  // "/" and /home as well
    EXPECT_EQ(disk.watchCount(), 5u);
    EXPECT_THAT(changes(), IsEmpty());
}

TEST_F(WatchedDisk, AFolderIsMarkedOnceABurst) {
    watch("/home/Movies");
    disk.makeFile("/home/Movies/a/x");
    disk.makeFile("/home/Movies/a/y");
    EXPECT_EQ(changes(), (Changes{"/home/Movies/a", "/home/Movies/a/x", "/home/Movies/a/y"}));
    disk.remove("/home/Movies/a/x");
    EXPECT_EQ(changes(), Changes{"/home/Movies/a"});
}

TEST_F(WatchedDisk, NoWatchIsLeftWhenAPathIsGivenUp) {
    watch("/home/Movies");
    watch("/home");
    paths().remove("/home");
    EXPECT_EQ(paths().watchCount(), 5u);
    paths().remove("/home/Movies");
    EXPECT_EQ(paths().watchCount(), 0u);
    EXPECT_EQ(disk.watchCount(), 0u);
}

TEST_F(WatchedDisk, EventsOfRemovedWatchesAreIgnored) {
    watch("/home/Movies");
    disk.makeFolder("/home/Movies/a/deep");
    changes();
    disk.makeFile("/home/Movies/a/deep/x");
    disk.rename("/home/Movies/a", "/tmp/a");
    disk.makeFile("/tmp/a/deep/y");
    EXPECT_THAT(changes(), Contains("/home/Movies"));
    EXPECT_EQ(paths().watchCount(), 4u);
    disk.makeFile("/tmp/a/deep/z");
    EXPECT_THAT(changes(), IsEmpty());
}

TEST_F(WatchedDisk, WhatIsMadeInANewFolderBeforeItIsWatchedIsReported) {
    watch("/home/Movies");
    disk.makeFolder("/home/Movies/new");
    disk.makeFolder("/home/Movies/new/newer");
    disk.makeFile("/home/Movies/new/newer/x");
    EXPECT_EQ(changes(), (Changes{"/home/Movies", "/home/Movies/new", "/home/Movies/new/newer"}));
}

TEST_F(WatchedDisk, WhatIsMadeBetweenTheWatchAndTheListingIsReported) {
    watch("/home/Movies");
    int looksTaken = 0;
    disk.afterLook = [&] {
        if (++looksTaken == 1)  // the new folder was just watched
            disk.makeFile("/home/Movies/new/x");
        if (looksTaken == 2)  // and just listed
            disk.makeFolder("/home/Movies/new/newer");
    };
    disk.makeFolder("/home/Movies/new");
    const Changes all = changes();
    EXPECT_THAT(all, Contains("/home/Movies/new"));
    EXPECT_THAT(paths().watchedFolders(), Contains("/home/Movies/new/newer"));
}

TEST_F(WatchedDisk, WhatWasMadeInAFolderWhileItWasAwayIsFound) {
    watch("/home/Movies");
    int looksTaken = 0;
    disk.afterLook = [&] {
        if (++looksTaken == 1)  // the folder was looked for where it had been, and is back
            disk.rename("/home/Movies/a", "/tmp/a");
        if (looksTaken == 2)  // the new one in it was looked for, and is not there
            disk.rename("/tmp/a", "/home/Movies/a");
    };
    disk.rename("/home/Movies/a", "/tmp/a");
    disk.makeFolder("/tmp/a/new");
    disk.rename("/tmp/a", "/home/Movies/a");
    changes();
    EXPECT_THAT(paths().watchedFolders(), Contains("/home/Movies/a/new"));
}

TEST_F(WatchedDisk, WhatWasMadeInTheWatchedPathWhileItWasAwayIsFound) {
    watch("/home/Movies");
    disk.afterLook = [&] { disk.rename("/tmp/Movies", "/home/Movies"); };
    disk.rename("/home/Movies", "/tmp/Movies");
    disk.makeFolder("/tmp/Movies/new");
    EXPECT_THAT(changes(), Contains("/home/Movies"));
    EXPECT_THAT(paths().watchedFolders(), Contains("/home/Movies/new"));
}

TEST_F(WatchedDisk, AFolderThatIsReplacedByAnEmptyOneOfItsNameIsWatchedAnew) {
    watch("/home/Movies");
    disk.makeFolder("/home/Movies/c");
    disk.rename("/home/Movies/a", "/home/Movies/c");
    changes();
    disk.makeFolder("/home/Movies/c/x");
    EXPECT_EQ(changes(), Changes{"/home/Movies/c"});
}

TEST_F(WatchedDisk, LostEventsReportEveryWatchedPathAndAreAWarning) {
    watch("/home/Movies/a");
    watch("/home/Movies/b");
    watch("/missing");
    disk.queueLimit = 3;
    for (int i = 0; i < 10; ++i)
        disk.makeFolder("/home/Movies/a/" + std::to_string(i));
    EXPECT_THAT(changes(), testing::IsSupersetOf({"/home/Movies/a", "/home/Movies/b"}));
    EXPECT_THAT(paths().takeWarnings(),
                ElementsAre(testing::HasSubstr("faster than they could be taken in")));
    EXPECT_EQ(paths().watchedFolders().size(), 12u);

    disk.queueLimit = SIZE_MAX;
    disk.makeFile("/home/Movies/a/7/x");
    EXPECT_EQ(changes(), (Changes{"/home/Movies/a/7", "/home/Movies/a/7/x"}));
    EXPECT_THAT(paths().takeWarnings(), IsEmpty());
}

TEST_F(WatchedDisk, FoldersBeyondTheLimitArePolledUntilThereIsRoom) {
    disk.watchLimit = 4;  // "/", /home, Movies and one of its two folders
    watch("/home/Movies");
    EXPECT_THAT(looks.paths(), ElementsAre("/home/Movies/b"));
    const WatchState state = paths().stateOf("/home/Movies", "/home/Movies/b/deep");
    EXPECT_EQ(state.how, WatchState::How::polling);
    EXPECT_THAT(state.why, testing::MatchesRegex(
                               "the limit of [0-9]+ watched folders is reached; looked at every 10 s"));
    EXPECT_EQ(paths().stateOf("/home/Movies", "/home/Movies/a").why, "watched through /home/Movies");
    EXPECT_THAT(
        paths().stateOf("/home/Movies", "/home/Movies").why,
        testing::MatchesRegex("watched through /home/Movies; some folders below are looked at every 10 s: "
                              "the limit of [0-9]+ watched folders is reached"));
    EXPECT_THAT(paths().takeWarnings(), ElementsAre(testing::HasSubstr("watched folders is reached")));

    looks.reports.push_back({looks.lastPlace, {"/home/Movies/b/deep"}});
    EXPECT_EQ(changes(), Changes{"/home/Movies/b/deep"});
    EXPECT_THAT(looks.paths(), ElementsAre("/home/Movies/b"));

    disk.watchLimit = 5;
    looks.nothingNew();
    changes();
    EXPECT_THAT(looks.paths(), IsEmpty());
    disk.makeFolder("/home/Movies/b/x");
    EXPECT_EQ(changes(), Changes{"/home/Movies/b"});
}

TEST_F(WatchedDisk, APathWhoseWayCantBeWatchedIsPolledUntilItCan) {
    disk.watchLimit = 1;
    watch("/home/Movies");
    EXPECT_THAT(looks.paths(), ElementsAre("/home/Movies"));
    EXPECT_EQ(paths().stateOf("/home/Movies", "/home/Movies").how, WatchState::How::polling);
    disk.watchLimit = 10;
    looks.nothingNew();
    EXPECT_EQ(changes(), Changes{"/home/Movies"});
    EXPECT_THAT(looks.paths(), IsEmpty());
    EXPECT_EQ(paths().watchedFolders().size(), 3u);
}

TEST_F(WatchedDisk, AFolderThatIsPolledForTheLimitIsForgottenWithItsParent) {
    disk.makeFolder("/home/Movies/a/deep");
    disk.watchLimit = 4;
    watch("/home/Movies");
    ASSERT_FALSE(looks.paths().empty());
    disk.rename("/home/Movies", "/tmp/Movies");
    changes();
    EXPECT_THAT(looks.paths(), IsEmpty());
}

TEST_F(WatchedDisk, WithoutAQueueEverythingIsPolled) {
    disk.failures = {{"/", EMFILE}};
    watch("/home/Movies");
    EXPECT_THAT(looks.paths(), ElementsAre("/home/Movies"));
    EXPECT_THAT(paths().stateOf("/home/Movies", "/home/Movies").why,
                testing::MatchesRegex("the limit of [0-9]+ watchers is reached; looked at every 10 s"));
}

TEST_F(WatchedDisk, AFolderThatCantBeListedIsPolledUntilItCan) {
    disk.listingFailures = {{"/home/Movies/a", EIO}};
    watch("/home/Movies");
    EXPECT_THAT(looks.paths(), ElementsAre("/home/Movies/a"));
    EXPECT_EQ(paths().stateOf("/home/Movies", "/home/Movies/a").why,
              "/home/Movies/a cannot be watched: Input/output error; looked at every 10 s");
    looks.nothingNew();
    EXPECT_THAT(changes(), IsEmpty());
    EXPECT_THAT(looks.paths(), ElementsAre("/home/Movies/a"));
    EXPECT_EQ(looks.lastPlace, 1u);  // what is known of it was not thrown away
    disk.listingFailures.clear();
    looks.nothingNew();
    changes();
    EXPECT_THAT(looks.paths(), IsEmpty());
    EXPECT_THAT(paths().watchedFolders(), Contains("/home/Movies/a"));
}

TEST_F(WatchedDisk, ReportsOfPlacesThatAreNoLongerPolledAreIgnored) {
    watch("/home/Movies");
    looks.reports.push_back({4711, {"/home/Movies/b"}});
    EXPECT_THAT(changes(), IsEmpty());
}

TEST_F(WatchedDisk, AFileSystemBelowThatIsUnmountedIsAChangeOfTheFolderAroundIt) {
    disk.makeFolder("/home/Movies/a/deep");
    watch("/home/Movies");
    disk.unmount("/home/Movies/a");
    EXPECT_THAT(changes(), Contains("/home/Movies"));
    EXPECT_THAT(paths().watchedFolders(), UnorderedElementsAre("/home/Movies", "/home/Movies/b"));
    EXPECT_THAT(paths().takeWarnings(), IsEmpty());
}

TEST_F(WatchedDisk, AnUnmountedPathIsAWarning) {
    watch("/home/Movies");
    disk.unmount("/home/Movies");
    EXPECT_EQ(changes(), Changes{"/home/Movies"});
    EXPECT_THAT(paths().takeWarnings(), ElementsAre("/home/Movies was unmounted"));
    EXPECT_EQ(paths().stateOf("/home/Movies", "/home/Movies").why, "does not exist; /home is watched for it");
}
