#include <barrier>
#include <thread>

#include "tests/support/LoopImage.h"
#include "tests/watching/WatchingTest.h"

namespace testing_support {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class VolumeMountsTest : public WatchingTest {
  protected:
    VolumeMountsTest() { files.displayNames["/media/usb1"] = "Footage"; }

    void loadFirst() {
        load();
        plugin().loadData();  // subscribes; the load that it starts waits for the clock
        searchPathsAtFirst_ = eventsSearchPaths();
    }
    // What mounts added to the search paths.
    std::vector<std::string> addedPaths() {
        std::vector<std::string> paths = eventsSearchPaths();
        EXPECT_GE(paths.size(), searchPathsAtFirst_.size());
        paths.erase(paths.begin(), paths.begin() + static_cast<std::ptrdiff_t>(searchPathsAtFirst_.size()));
        return paths;
    }
    // Mounts and lets the thread that the mount starts run to its end.
    void mount(const std::string& mountPoint) {
        environment.workspace.mount(mountPoint);
        environment.dispatcher.runDueBlocks();
    }
    // The thread's work itself, as on a thread of its own.
    void handle(platform::Dictionary userInfo) {
        offMainThread([&, userInfo] {
            plugin()._fileSystemMountedThreaded(
                {std::string(platform::NSWorkspaceDidMountNotification), nullptr, userInfo});
        });
    }
    bool monitorIsFree() {
        bool isFree = false;
        std::thread([&] {
            plugin().mediaGroups();  // takes it, or waits for ever
            isFree = true;
        }).join();
        return isFree;
    }

  private:
    std::vector<std::string> searchPathsAtFirst_;
};

TEST_F(VolumeMountsTest, MountAddsBothFormsOfTheEventFolderByDisplayName) {
    loadFirst();
    mount("/media/usb1");
    EXPECT_THAT(addedPaths(),
                ElementsAre("/Volumes/Footage/Reelix Events", "/Volumes/Footage/Reelix Events.localized"));
}

TEST_F(VolumeMountsTest, MountLeadsToOneEventReloadFiveSecondsLater) {
    loadFirst();
    environment.dispatcher.runDueBlocks();
    publications = 0;
    mount("/media/usb1");
    EXPECT_EQ(pending(), "events");
    EXPECT_EQ(scheduled(), 1u);
    environment.dispatcher.advance(delay);
    EXPECT_EQ(publications, 1);
}

TEST_F(VolumeMountsTest, EventsOfAMountedVolumeAppear) {
    const std::string volume = home().makeFolder("disk");
    home().writeFile("disk/Reelix Events/Trip/clip-2008-07-04 18;30;05.mov");
    files.displayNames[volume] = "Vexo Test Footage";
    environment.mounts.list = {{volume, "/dev/sdx1", "ext4", "Vexo Test Footage"}};
    loadFirst();
    EXPECT_THAT(plugin().rootMediaGroup()->childGroups(), IsEmpty());
    mount(volume);
    environment.dispatcher.advance(delay);
    const auto clips = plugin().rootMediaGroup()->mediaObjects();
    ASSERT_EQ(clips.size(), 1u);
    EXPECT_EQ(clips.front()->ID(),
              "/Volumes/Vexo Test Footage/Reelix Events/Trip/clip-2008-07-04 18;30;05.mov");
}

TEST_F(VolumeMountsTest, MountIsSeenToOnAThreadOfItsOwn) {
    loadFirst();
    environment.dispatcher.runDueBlocks();
    bool asked = false;
    files.beforeDisplayName = [&](const std::string&) { asked = true; };
    environment.workspace.mount("/media/usb1");
    EXPECT_FALSE(asked);
    EXPECT_EQ(environment.dispatcher.requests().back().place, VirtualDispatcher::Place::ownThread);
    environment.dispatcher.runDueBlocks();
    EXPECT_TRUE(asked);
}

TEST_F(VolumeMountsTest, EachMountHasAThread) {
    files.displayNames["/media/usb2"] = "More";
    loadFirst();
    environment.dispatcher.runDueBlocks();
    const std::size_t before = environment.dispatcher.requests().size();
    environment.workspace.mount("/media/usb1");
    environment.workspace.mount("/media/usb2");
    EXPECT_EQ(environment.dispatcher.requests().size(), before + 2);
    environment.dispatcher.runDueBlocks();
    EXPECT_EQ(addedPaths().size(), 4u);
    EXPECT_EQ(scheduled(), 1u);
}

TEST_F(VolumeMountsTest, VolumeThatIsMountedAgainAddsNothing) {
    loadFirst();
    mount("/media/usb1");
    environment.dispatcher.advance(delay);
    mount("/media/usb1");
    EXPECT_EQ(addedPaths().size(), 2u);
    EXPECT_EQ(pending(), "");
    EXPECT_EQ(scheduled(), 1u);
}

TEST_F(VolumeMountsTest, VolumeFoundAtStartAddsNothing) {
    environment.workspace.setVolumes({"/", "/media/usb1"});
    loadFirst();
    mount("/media/usb1");
    EXPECT_THAT(addedPaths(), IsEmpty());
    EXPECT_EQ(scheduled(), 0u);
}

TEST_F(VolumeMountsTest, NetworkMountsChangeNothing) {
    for (const char* path : {"/Network", "/Network/share", "/Networked", "/private/Network/share"})
        files.displayNames[path] = "Share";
    loadFirst();
    for (const char* path : {"/Network", "/Network/share", "/Networked", "/private/Network/share"}) {
        mount(path);
        EXPECT_THAT(addedPaths(), IsEmpty()) << path;
    }
    EXPECT_EQ(scheduled(), 0u);
}

TEST_F(VolumeMountsTest, OnlyThePrefixMakesANetworkMount) {
    files.displayNames["/mnt/Network"] = "Share";
    loadFirst();
    mount("/mnt/Network");
    EXPECT_EQ(addedPaths().size(), 2u);
}

TEST_F(VolumeMountsTest, NotificationWithoutAPathOrAVolumeWithoutANameChangesNothing) {
    loadFirst();
    handle({});
    handle({{"NSDevicePath", 5}});
    handle({{"NSDevicePath", "/media/gone"}});
    handle({{"Path", "/media/usb1"}});
    EXPECT_THAT(addedPaths(), IsEmpty());
    EXPECT_EQ(scheduled(), 0u);
    EXPECT_THAT(environment.log.lines(), IsEmpty());
}

TEST_F(VolumeMountsTest, MountBeforeTheFirstLoadChangesNothing) {
    handle({{"NSDevicePath", "/media/usb1"}});
    EXPECT_THAT(eventsSearchPaths(), ElementsAre("<none>"));
    EXPECT_EQ(scheduled(), 0u);
    environment.workspace.setVolumes({"/", "/media/usb1"});
    load();
    EXPECT_THAT(eventsSearchPaths(), testing::Contains("/Volumes/Footage/Reelix Events"));
}

TEST_F(VolumeMountsTest, MountWhileACancelIsPendingAddsThePathsAndSchedulesNothing) {
    loadFirst();
    environment.dispatcher.runDueBlocks();
    plugin().cancelAfter(0);
    mount("/media/usb1");
    EXPECT_EQ(addedPaths().size(), 2u);
    EXPECT_EQ(scheduled(), 0u);
}

TEST_F(VolumeMountsTest, MountPointInsideAProjectLibrarySchedulesAProjectReload) {
    const std::string mountPoint = home().makeFolder("Reelix Projects/disk");
    files.displayNames[mountPoint] = "Footage";
    loadFirst();
    mount(mountPoint);
    EXPECT_EQ(pending(), "projects");
    EXPECT_EQ(addedPaths().size(), 2u);
}

TEST_F(VolumeMountsTest, AddedPathsAreInTheScopeOfTheEventQuery) {
    loadFirst();
    mount("/media/usb1");
    const auto queries = environment.watcher.queries();
    ASSERT_EQ(queries.size(), 2u);
    EXPECT_TRUE(queries[1].scope->contains("/Volumes/Footage/Reelix Events.localized"));
}

TEST_F(VolumeMountsTest, FailureIsLoggedAndNothingIsAdded) {
    loadFirst();
    environment.dispatcher.runDueBlocks();
    files.beforeDisplayName = [](const std::string&) { throw std::runtime_error("no answer"); };
    handle({{"NSDevicePath", "/media/usb1"}});
    EXPECT_THAT(environment.log.lines(), ElementsAre("Error in _fileSystemMountedThreaded: no answer"));
    EXPECT_THAT(addedPaths(), IsEmpty());
    EXPECT_TRUE(monitorIsFree());
}

TEST_F(VolumeMountsTest, FailureAfterThePathsWereAddedKeepsThem) {
    loadFirst();
    environment.dispatcher.runDueBlocks();
    files.beforeKind = [](const std::string&) { throw std::runtime_error("no answer"); };
    handle({{"NSDevicePath", "/media/usb1"}});
    EXPECT_THAT(environment.log.lines(), ElementsAre("watchedPathChanged:/media/usb1",
                                                     "Error in _fileSystemMountedThreaded: no answer"));
    EXPECT_EQ(addedPaths().size(), 2u);
    EXPECT_TRUE(monitorIsFree());
}

TEST_F(VolumeMountsTest, WhatIsNoExceptionOfTheStandardKindIsNotCaught) {
    files.beforeDisplayName = [](const std::string&) { throw 5; };
    EXPECT_THROW(
        plugin()._fileSystemMountedThreaded({.name = "", .userInfo = {{"NSDevicePath", "/media/usb1"}}}),
        int);
}

TEST_F(VolumeMountsTest, NotificationsOfOneVolumeAtTheSameTimeAddItOnce) {
    constexpr int rounds = 300;
    constexpr int threadsPerRound = 4;
    for (int round = 0; round < rounds; ++round)
        files.displayNames["/media/" + std::to_string(round)] = "Disk " + std::to_string(round);
    loadFirst();
    std::barrier together(threadsPerRound);  // right before the list is looked at
    files.beforeDisplayName = [&](const std::string&) { together.arrive_and_wait(); };
    std::vector<std::thread> threads;
    for (int i = 0; i < threadsPerRound; ++i)
        threads.emplace_back([&] {
            for (int round = 0; round < rounds; ++round)
                plugin()._fileSystemMountedThreaded(
                    {"", nullptr, {{"NSDevicePath", "/media/" + std::to_string(round)}}});
        });
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(addedPaths().size(), 2u * rounds);
    EXPECT_EQ(pending(), "events");
    EXPECT_EQ(scheduled(), 1u);
}

TEST_F(VolumeMountsTest, StartUpVolumeHasAValidFormatAndAMissingPathHasNone) {
    EXPECT_TRUE(ExposedPlugin::validDiskFormat("/"));
    EXPECT_TRUE(ExposedPlugin::validDiskFormat(home().path()));
    EXPECT_FALSE(ExposedPlugin::validDiskFormat(home().path("missing")));
    EXPECT_FALSE(ExposedPlugin::validDiskFormat(""));
}

TEST_F(VolumeMountsTest, FormatsOfOtherSystemsAndServersAreRefused) {
    for (const char* format : {"msdos", "ntfs", "nfs", "afpfs", "webdav", "udf"}) {
        files.fileSystemTypes["/disk"] = format;
        EXPECT_FALSE(ExposedPlugin::validDiskFormat("/disk")) << format;
    }
    for (const char* format : {"ext4", "exfat", "smbfs", "MSDOS", "ntfs3", "nfs4", ""}) {
        files.fileSystemTypes["/disk"] = format;
        EXPECT_TRUE(ExposedPlugin::validDiskFormat("/disk")) << format;
    }
}

TEST_F(VolumeMountsTest, CardWithFATIsRefused) {
    if (const auto reason = reasonAgainstMounting("vfat"))
        GTEST_SKIP() << *reason;
    const std::string mountPoint = home().makeFolder("card");
    const LoopImage image(home().path("card.img"), "CARD", "vfat");
    const ScopedMount mounted = image.mountAt(mountPoint);
    EXPECT_FALSE(ExposedPlugin::validDiskFormat(mountPoint));
}

}  // namespace
}  // namespace testing_support
