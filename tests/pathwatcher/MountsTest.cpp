// Watched paths on mounts: of every kind by a made-up mount table, and real ones that come and go.
#include <filesystem>
#include <fstream>

#include "tests/pathwatcher/FakeMounts.h"
#include "tests/pathwatcher/WatcherTest.h"
#include "tests/support/DeadMount.h"
#include "tests/support/LoopImage.h"

using namespace testing_support;
using testing::Contains;

namespace fs = std::filesystem;

namespace {

// Folders of the disk stand for mounts of whatever kind the test says.
class PretendedMounts : public WatcherTest {
  protected:
    PretendedMounts() {
        seamMaker = [this](const auto& wake) {
            vexo::WatchSeams seams = vexo::systemSeams(wake, std::chrono::milliseconds(20));
            seams.mounts = std::make_unique<FakeMounts>(mounts);
            return seams;
        };
    }
    // As the kernel would tell of it.
    void mountsChanged() {
        // A new path is looked up in the present table.
        const auto listener = std::make_shared<const vexo::ChangeListener>();
        watcher().listen(folder.path("new" + std::to_string(++tableChanges)), listener);
        settle();
    }
    // That it was reported, once some round of looks is over.
    bool isReported(const std::string& path) {
        return settleUntil([&] { return observer->paths().contains(path); });
    }

    FakeMounts::Table mounts;

  private:
    int tableChanges = 0;
};

using RealMounts = WatcherTest;

}  // namespace

TEST_F(PretendedMounts, APathOnANetworkMountIsPolled) {
    const std::string path = folder.makeFolder("nas/Movies/sub");
    mounts.add(folder.path("nas"), "nfs4", "server:/movies");
    watcher().watchPath(folder.path("nas/Movies"), observer);
    EXPECT_EQ(stateOf(path), "polling: network file system (nfs4); looked at every 0 s");
    ASSERT_TRUE(isReported(folder.path("nas/Movies")));  // by the first look
    observer->calls.clear();
    folder.writeFile("nas/Movies/sub/new");
    EXPECT_TRUE(isReported(path));
    EXPECT_THAT(follower().watchedFolders(), testing::IsEmpty());
}

TEST_F(PretendedMounts, AMountBelowAWatchedFolderIsPolledAndTheRestIsNot) {
    folder.makeFolder("Movies/local");
    folder.makeFolder("Movies/nas/sub");
    mounts.add(folder.path("Movies/nas"), "fuse.sshfs", "me@server:/");
    watcher().watchPath(folder.path("Movies"), observer);
    EXPECT_EQ(stateOf(folder.path("Movies/nas/sub")),
              "polling: network file system (fuse.sshfs); looked at every 0 s");
    EXPECT_EQ(stateOf(folder.path("Movies/local")), "events: watched through " + folder.path("Movies"));
    ASSERT_TRUE(isReported(folder.path("Movies/nas")));
    observer->calls.clear();
    folder.writeFile("Movies/nas/sub/new");
    EXPECT_TRUE(isReported(folder.path("Movies/nas/sub")));
    EXPECT_THAT(follower().watchedFolders(),
                testing::UnorderedElementsAre(folder.path("Movies"), folder.path("Movies/local")));
}

TEST_F(PretendedMounts, AMountBelowANetworkMountIsPolledForItself) {
    folder.makeFolder("nas/Movies/other/sub");
    mounts.add(folder.path("nas"), "nfs4", "server:/movies");
    mounts.add(folder.path("nas/Movies/other"), "nfs4", "another:/movies");
    watcher().watchPath(folder.path("nas/Movies"), observer);
    ASSERT_TRUE(isReported(folder.path("nas/Movies/other")));
    observer->calls.clear();
    folder.writeFile("nas/Movies/other/sub/new");
    EXPECT_TRUE(isReported(folder.path("nas/Movies/other/sub")));
}

TEST_F(PretendedMounts, TheKernelsOwnFileSystemsAreLeftAlone) {
    folder.makeFolder("proc/1");
    mounts.add(folder.path("proc"), "proc", "proc");
    watch(folder.path());
    watch(folder.path("proc/1"));
    EXPECT_THAT(follower().watchedFolders(), testing::ElementsAre(folder.path()));
    EXPECT_EQ(stateOf(folder.path("proc/1")),
              "none: file system that does not tell of changes (proc); not watched");
}

TEST_F(PretendedMounts, AMountThatComesAndGoesIsReportedAndWatchedAsItIs) {
    const std::string path = folder.makeFolder("nas/Movies");
    watch(path);
    mounts.add(folder.path("nas"), "nfs4", "server:/");
    EXPECT_THAT(reportsOf([&] { mountsChanged(); }), Contains(path));
    EXPECT_THAT(stateOf(path), testing::StartsWith("polling: "));
    mounts.remove(folder.path("nas"));
    EXPECT_THAT(reportsOf([&] { mountsChanged(); }), Contains(path));
    EXPECT_EQ(stateOf(path), "events: watched through " + path);
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("nas/Movies/x"); }), Paths{path});
}

TEST_F(PretendedMounts, AChangeOfTheTableElsewhereIsNoChange) {
    const std::string path = folder.makeFolder("Movies"), file = folder.writeFile("suite.plist");
    const std::string polled = folder.makeFolder("nas");
    mounts.add(polled, "nfs4", "server:/");
    watch(path);
    watch(file);
    watch(folder.path("missing"));
    watcher().watchPath(polled, observer);
    ASSERT_TRUE(isReported(polled));
    mounts.add(folder.path("elsewhere"), "ext4");
    EXPECT_EQ(reportsOf([&] { mountsChanged(); }), Paths{});
}

TEST_F(PretendedMounts, TheNameOfAVolumeIsFollowedToWhereItIsMounted) {
    const std::string path = "/Volumes/Watched Disk/Movies";
    folder.makeFolder("disk/Movies/sub");
    watch(path);
    EXPECT_THAT(stateOf(path), testing::StartsWith("events: does not exist; "));
    environment.mounts.list = {{folder.path("disk"), "/dev/sdb1", "ext4", "Watched Disk"}};
    mounts.add(folder.path("disk"), "ext4", "/dev/sdb1");
    EXPECT_EQ(reportsOf([&] { mountsChanged(); }), Paths{path});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("disk/Movies/sub/x"); }), Paths{path + "/sub"});
    environment.mounts.list.clear();
    mounts.remove(folder.path("disk"));
    EXPECT_EQ(reportsOf([&] { mountsChanged(); }), Paths{path});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("disk/Movies/sub/y"); }), Paths{});
}

TEST_F(RealMounts, AVolumeThatIsTakenOutAndPutInIsFollowed) {
    if (const auto reason = reasonAgainstMounting("ext4"))
        GTEST_SKIP() << *reason;
    const LoopImage disk(folder.path("image"), "Disk");
    const std::string mountPoint = folder.makeFolder("disk"), path = mountPoint + "/Movies";
    watch(path);
    {
        const ScopedMount mount = disk.mountAt(mountPoint);
        fs::create_directories(path + "/sub");
        settle();
        EXPECT_EQ(observer->paths(), Paths{path});
        EXPECT_EQ(reportsOf([&] { fs::create_directory(path + "/sub/x"); }), Paths{path + "/sub"});
        observer->calls.clear();
    }
    settle();
    EXPECT_EQ(observer->paths(), Paths{path});
    EXPECT_THAT(stateOf(path), testing::StartsWith("events: does not exist; "));
    EXPECT_THAT(warnings, testing::IsSubsetOf({path + " was unmounted"}));

    observer->calls.clear();
    const ScopedMount mount = disk.mountAt(mountPoint);
    settle();
    EXPECT_EQ(observer->paths(), Paths{path});
    EXPECT_EQ(reportsOf([&] { fs::create_directory(path + "/sub/y"); }), Paths{path + "/sub"});
}

TEST_F(RealMounts, AVolumeThatIsMountedBelowAWatchedFolderIsPartOfIt) {
    if (const auto reason = reasonAgainstMounting())
        GTEST_SKIP() << *reason;
    const std::string path = folder.makeFolder("Movies"), mountPoint = folder.makeFolder("Movies/disk");
    watch(path);
    {
        const ScopedMount mount = ScopedMount::memory(mountPoint);
        settle();
        EXPECT_EQ(observer->paths(), Paths{path});
        EXPECT_EQ(reportsOf([&] { fs::create_directory(mountPoint + "/sub"); }), Paths{mountPoint});
        observer->calls.clear();
    }
    settle();
    EXPECT_EQ(observer->paths(), Paths{path});
    EXPECT_EQ(reportsOf([&] { fs::create_directory(mountPoint + "/local"); }), Paths{mountPoint});
}

TEST_F(RealMounts, AFolderThatIsReachedThroughABindMountIsReportedByBothPaths) {
    if (const auto reason = reasonAgainstMounting())
        GTEST_SKIP() << *reason;
    const std::string real = folder.makeFolder("Movies/real"), shown = folder.makeFolder("Movies/shown");
    const std::string clip = folder.writeFile("Movies/real/sub/a.mov");
    const ScopedMount mount = ScopedMount::bind(real, shown);
    watch(folder.path("Movies"));
    EXPECT_EQ(reportsOf([&] { fs::create_directory(real + "/sub/x"); }),
              (Paths{real + "/sub", shown + "/sub"}));
    EXPECT_EQ(reportsOf([&] { fs::remove_all(shown + "/sub/x"); }), (Paths{real + "/sub", shown + "/sub"}));
    EXPECT_EQ(reportsOf([&] { std::ofstream(clip) << "content"; }), (Paths{clip, shown + "/sub/a.mov"}));
}

TEST_F(RealMounts, AMountWhoseServerIsGoneHoldsUpNobody) {
    if (const auto reason = DeadMount::reasonAgainst())
        GTEST_SKIP() << *reason;
    const std::string mountPoint = folder.makeFolder("Movies/gone"),
                      local = folder.makeFolder("Movies/local");
    const DeadMount mount(mountPoint);
    watch(folder.path("Movies"));
    watch(mountPoint + "/Library");
    EXPECT_EQ(stateOf(mountPoint + "/Library"),
              "polling: network file system (fuse.sshfs); looked at every 0 s");
    mount.awaitRequest();  // the polling hangs from now on
    EXPECT_EQ(reportsOf([&] { fs::create_directory(local + "/x"); }), Paths{local});
    watcher().close();
}
