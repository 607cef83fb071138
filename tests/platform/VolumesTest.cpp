// Volumes that are really mounted. Skipped where the process may not mount.
#include <fcntl.h>
#include <gio/gio.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <linux/msdos_fs.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <thread>

#include "platform/linux/LinuxFileManager.h"
#include "platform/linux/LinuxWorkspace.h"
#include "tests/platform/CollectedLog.h"
#include "tests/platform/SidecarBytes.h"
#include "tests/support/LoopImage.h"
#include "tests/support/TemporaryFolder.h"

using namespace platform;
using namespace testing_support;
using testing::Contains;
using testing::ElementsAre;
using testing::Eq;
using testing::Not;
using testing::Optional;

namespace {

#define NEEDS_MOUNTS(...)                                       \
    if (const auto reason = reasonAgainstMounting(__VA_ARGS__)) \
    GTEST_SKIP() << *reason

std::optional<Mount> mountAt(const MountTable& table, const std::string& path) {
    for (const Mount& mount : table.mounts())
        if (mount.path == path)
            return mount;
    return std::nullopt;
}

std::vector<std::string> paths(const std::vector<Mount>& mounts) {
    std::vector<std::string> result;
    for (const Mount& mount : mounts)
        result.push_back(mount.path);
    return result;
}

bool isNoPackage(std::string_view) {
    return false;
}

}  // namespace

TEST(Volumes, ALabelledDiskIsKnownByItsLabel) {
    NEEDS_MOUNTS("ext4");
    const TemporaryFolder folder;
    const SystemMountTable table;
    const auto before = table.mounts();
    const LoopImage image(folder.path("image"), "Footage");
    const auto mount = image.mountAt(folder.makeFolder("disk"));

    const auto found = mountAt(table, mount.mountPoint());
    ASSERT_TRUE(found);
    EXPECT_EQ(found->displayName, "Footage");
    EXPECT_EQ(found->fileSystem, "ext4");
    EXPECT_EQ(table.mounts().size(), before.size() + 1);
}

TEST(Volumes, ASlashInALabelShowsAsAColon) {
    NEEDS_MOUNTS("ext4");
    const TemporaryFolder folder;
    const SystemMountTable table;
    const auto mount = LoopImage(folder.path("image"), "2008/09 a").mountAt(folder.makeFolder("disk"));
    EXPECT_EQ(mountAt(table, mount.mountPoint())->displayName, "2008:09 a");
}

TEST(Volumes, ADiskWithoutALabelIsKnownByItsMountPoint) {
    NEEDS_MOUNTS("ext4");
    const TemporaryFolder folder;
    const SystemMountTable table;
    const auto mount = LoopImage(folder.path("image"), "").mountAt(folder.makeFolder("My Disk"));
    EXPECT_EQ(mountAt(table, mount.mountPoint())->displayName, "My Disk");
}

TEST(Volumes, TheTableFollowsMountsAndUnmounts) {
    NEEDS_MOUNTS("ext4");
    const TemporaryFolder folder;
    const SystemMountTable table;
    const LoopImage image(folder.path("image"), "Footage");
    const auto before = table.mounts();
    for (int round = 0; round < 3; ++round) {
        {
            const auto mount = image.mountAt(folder.makeFolder("disk"));
            EXPECT_TRUE(mountAt(table, mount.mountPoint()));
        }
        EXPECT_EQ(table.mounts(), before);
    }
}

TEST(Volumes, AnyThreadSeesAMountThatHappenedBeforeItAsked) {
    NEEDS_MOUNTS("ext4");
    const TemporaryFolder folder;
    const SystemMountTable table;
    const LoopImage image(folder.path("image"), "Footage");
    folder.makeFolder("disk");
    std::atomic<bool> isOver = false;
    std::vector<std::thread> threads;
    for (int i = 0; i < 3; ++i)
        threads.emplace_back([&] {
            while (!isOver)
                table.mounts();
        });
    for (int round = 0; round < 5; ++round) {
        const auto mount = image.mountAt(folder.path("disk"));
        EXPECT_TRUE(mountAt(table, mount.mountPoint()));
    }
    isOver = true;
    for (auto& thread : threads)
        thread.join();
    EXPECT_FALSE(mountAt(table, folder.path("disk")));
}

TEST(Volumes, TheNameOfAVolumeLeadsToItsFiles) {
    NEEDS_MOUNTS("ext4");
    const TemporaryFolder folder;
    const SystemMountTable table;
    CollectedLog log;
    const LinuxFileManager files(folder.path(), table, log, isNoPackage);
    const std::string clip = "/Volumes/Test Footage/Events/clip.mov";
    {
        const auto mount = LoopImage(folder.path("image"), "Test Footage").mountAt(folder.makeFolder("disk"));
        folder.writeFile("disk/Events/clip.mov", "12345");
        EXPECT_THAT(files.resolvedPath(clip), Optional(Eq(folder.path("disk/Events/clip.mov"))));
        EXPECT_EQ(files.attributesOfItemAtPath(clip)->size, 5u);
        EXPECT_THAT(files.displayNameAtPath(mount.mountPoint()), Optional(Eq("Test Footage")));
        EXPECT_THAT(files.displayNameAtPath("/Volumes/Test Footage"), Optional(Eq("Test Footage")));
        EXPECT_THAT(files.fileSystemTypeNameAtPath(clip), Optional(Eq("ext4")));
    }
    EXPECT_FALSE(files.fileExistsAtPath(clip));
    EXPECT_THAT(log.lines(), ElementsAre());
}

TEST(Volumes, ALinkToAMountPointKeepsItsOwnName) {
    NEEDS_MOUNTS("ext4");
    const TemporaryFolder folder;
    const SystemMountTable table;
    CollectedLog log;
    const LinuxFileManager files(folder.path(), table, log, isNoPackage);
    const auto mount = LoopImage(folder.path("image"), "Footage").mountAt(folder.makeFolder("disk"));
    folder.makeLink("link", mount.mountPoint());
    folder.makeLink("way", folder.path());
    EXPECT_THAT(files.displayNameAtPath(folder.path("link")), Optional(Eq("link")));
    EXPECT_THAT(files.displayNameAtPath(folder.path("way/disk")), Optional(Eq("Footage")));
}

TEST(Volumes, BindMountsUnderMediaAreRemovableVolumes) {
    NEEDS_MOUNTS("ext4");
    const TemporaryFolder folder;
    const SystemMountTable table;
    if (access("/media", F_OK) != 0)
        GTEST_SKIP() << "there is no /media";
    const auto disk = LoopImage(folder.path("image"), "Footage").mountAt(folder.makeFolder("disk"));
    const std::string clips = folder.makeFolder("disk/clips");
    const std::string file = folder.writeFile("disk/file");
    const auto media = ScopedMount::memory("/media");
    ASSERT_EQ(mkdir("/media/clips", 0700), 0);
    close(open("/media/file", O_CREAT | O_WRONLY, 0600));
    const auto boundFolder = ScopedMount::bind(clips, "/media/clips");
    const auto boundFile = ScopedMount::bind(file, "/media/file");

    const auto found = mountAt(table, "/media/clips");
    ASSERT_TRUE(found);
    EXPECT_EQ(found->displayName, "clips");
    EXPECT_TRUE(found->removable);
    EXPECT_THAT(paths(table.mounts()), Not(Contains("/media")));
    EXPECT_THAT(paths(table.mounts()), Not(Contains("/media/file")));
    EXPECT_FALSE(mountAt(table, disk.mountPoint())->removable);
}

TEST(Volumes, ABindMountElsewhereIsNoVolume) {
    NEEDS_MOUNTS("ext4");
    const TemporaryFolder folder;
    const SystemMountTable table;
    const auto disk = LoopImage(folder.path("image"), "Footage").mountAt(folder.makeFolder("disk"));
    const auto again = ScopedMount::bind(disk.mountPoint(), folder.makeFolder("again"));
    EXPECT_THAT(paths(table.mounts()), Contains(disk.mountPoint()));
    EXPECT_THAT(paths(table.mounts()), Not(Contains(again.mountPoint())));
}

TEST(Volumes, TheWorkspacePostsEachNewMount) {
    NEEDS_MOUNTS("ext4");
    const TemporaryFolder folder;
    const SystemMountTable table;
    CollectedLog log;
    LinuxWorkspace workspace(table, log);
    workspace.followMounts();
    std::vector<std::string> posted;
    const auto observer = std::make_shared<int>();
    workspace.notificationCenter().addObserver(
        observer, NSWorkspaceDidMountNotification, [&](const Notification& notification) {
            posted.push_back(*find(notification.userInfo, "NSDevicePath")->string());
        });
    const auto mount = LoopImage(folder.path("image"), "Footage").mountAt(folder.makeFolder("disk"));
    EXPECT_THAT(workspace.mountedLocalVolumePaths(), Contains(mount.mountPoint()));

    bool late = false;
    const auto stop = [](gpointer flag) -> gboolean { return *static_cast<bool*>(flag) = true; };
    const guint deadline = g_timeout_add_seconds(30, stop, &late);
    while (posted.empty() && !late)
        g_main_context_iteration(nullptr, TRUE);
    g_source_remove(deadline);
    EXPECT_THAT(posted, ElementsAre(mount.mountPoint()));
}

TEST(Volumes, TheSidecarCountsWhereTheFileSystemKeepsNoAttributes) {
    NEEDS_MOUNTS();
    const TemporaryFolder folder;
    const SystemMountTable table;
    CollectedLog log;
    const LinuxFileManager files(folder.path(), table, log, isNoPackage);
    const auto card = ScopedMount::memory(folder.makeFolder("card"));
    const std::string clip = folder.writeFile("card/clip.mov");
    folder.writeFile("card/._clip.mov", sidecarWithAttributes({{"date", "2009-03-01"}}));
    folder.makeLink("link.mov", clip);
    for (const std::string& path : {clip, folder.path("link.mov")}) {
        std::string value(10, ' ');
        EXPECT_EQ(files.extendedAttribute(path, "date", {}), 10);
        EXPECT_EQ(files.extendedAttribute(path, "date", std::span(value).first(9)), -ERANGE);
        ASSERT_EQ(files.extendedAttribute(path, "date", value), 10);
        EXPECT_EQ(value, "2009-03-01");
        EXPECT_LT(files.extendedAttribute(path, "other", value), 0);
    }
    EXPECT_THAT(log.lines(), ElementsAre());
}

TEST(Volumes, TheHiddenFlagOfFATHides) {
    NEEDS_MOUNTS("vfat");
    const TemporaryFolder folder;
    const SystemMountTable table;
    CollectedLog log;
    const LinuxFileManager files(folder.path(), table, log, isNoPackage);
    const auto mount = LoopImage(folder.path("image"), "CARD", "vfat").mountAt(folder.makeFolder("disk"));
    const std::string clip = folder.writeFile("disk/clip.mov");
    EXPECT_EQ(files.itemFlagsAtPath(clip), 0u);
    EXPECT_THAT(files.fileSystemTypeNameAtPath(clip), Optional(Eq("msdos")));

    const int file = open(clip.c_str(), O_RDONLY);
    std::uint32_t attributes = ATTR_HIDDEN | ATTR_ARCH;
    ASSERT_EQ(ioctl(file, FAT_IOCTL_SET_ATTRIBUTES, &attributes), 0);
    close(file);
    EXPECT_EQ(files.itemFlagsAtPath(clip), itemIsInvisible);
}
