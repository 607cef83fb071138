#include "framework/pathwatcher/MountKinds.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace vexo;
using platform::MountEntry;
using testing::ElementsAre;
using testing::UnorderedElementsAre;

namespace {

// What is said of a mount of the type.
std::string sourceOf(const std::string& fileSystem, const std::string& device = "device") {
    const MountKinds mounts({{"/", "/dev/disk", "ext4", "/"}, {"/x", device, fileSystem, "/"}});
    const SilentMount* mount = mounts.silentMountAt("/x");
    if (!mount)
        return "events";
    const std::string kind = mount->isNetwork ? "network " : "";
    return kind + (mount->source == ChangeSource::polling ? "polling" : "nothing");
}

std::vector<std::string> pathsOf(const std::vector<const SilentMount*>& mounts) {
    std::vector<std::string> paths;
    for (const SilentMount* mount : mounts)
        paths.push_back(mount->path);
    return paths;
}

}  // namespace

TEST(MountKindsTest, LocalDisksSendEvents) {
    for (const char* type : {"ext4", "btrfs", "xfs", "vfat", "exfat", "ntfs3", "tmpfs", "overlay", "zfs"})
        EXPECT_EQ(sourceOf(type), "events") << type;
    EXPECT_EQ(sourceOf("fuseblk", "/dev/sdb1"), "events");
}

TEST(MountKindsTest, NetworkFileSystemsArePolled) {
    for (const char* type : {"nfs", "nfs4", "cifs", "smb3", "9p", "afs", "ceph", "fuse.sshfs", "fuse.rclone"})
        EXPECT_EQ(sourceOf(type), "network polling") << type;
    EXPECT_EQ(sourceOf("fuse", "user@host:/home"), "network polling");
}

TEST(MountKindsTest, OtherProgramsThatServeFilesArePolled) {
    for (const char* type : {"fuse", "fuse.encfs", "fuse.bindfs"})
        EXPECT_EQ(sourceOf(type), "polling") << type;
}

TEST(MountKindsTest, TheKernelsOwnAndUnmountedAutomountsAreLeftAlone) {
    for (const char* type : {"proc", "sysfs", "cgroup2", "autofs", "devpts"})
        EXPECT_EQ(sourceOf(type), "nothing") << type;
}

TEST(MountKindsTest, TheLastMountAtAPlaceCounts) {
    const MountKinds mounts({{"/a", "auto", "autofs", "/"},
                             {"/a", "/dev/sda", "ext4", "/"},
                             {"/b", "/dev/sda", "ext4", "/"},
                             {"/b", "server:/", "nfs4", "/"}});
    EXPECT_EQ(mounts.silentMountAt("/a"), nullptr);
    ASSERT_NE(mounts.silentMountAt("/b"), nullptr);
    EXPECT_EQ(mounts.silentMountAt("/b")->fileSystem, "nfs4");
}

TEST(MountKindsTest, AMountPointIsExactlyItsPath) {
    const MountKinds mounts({{"/a", "server:/", "nfs4", "/"}});
    EXPECT_EQ(mounts.silentMountAt("/a/b"), nullptr);
    EXPECT_EQ(mounts.silentMountAt("/"), nullptr);
    EXPECT_EQ(mounts.silentMountAt("/ab"), nullptr);
}

TEST(MountKindsTest, MountsBelowAPathAreThoseStrictlyInIt) {
    const MountKinds mounts({{"/a", "server:/", "nfs4", "/"},
                             {"/a/b", "server:/b", "nfs4", "/"},
                             {"/a/c", "/dev/sda", "ext4", "/"},
                             {"/ab", "server:/ab", "nfs4", "/"}});
    EXPECT_THAT(pathsOf(mounts.silentMountsBelow("/a")), ElementsAre("/a/b"));
    EXPECT_THAT(pathsOf(mounts.silentMountsBelow("/")), UnorderedElementsAre("/a", "/a/b", "/ab"));
}

TEST(MountKindsTest, APathLiesOnTheNearestMountAboveIt) {
    const MountKinds mounts({{"/", "/dev/sda", "ext4", "/"}, {"/a/b", "/dev/sdb", "ext4", "/"}});
    EXPECT_EQ(mounts.mountPointOf("/a/b/c/d"), "/a/b");
    EXPECT_EQ(mounts.mountPointOf("/a/b"), "/a/b");
    EXPECT_EQ(mounts.mountPointOf("/a"), "/");
    EXPECT_EQ(MountKinds().mountPointOf("/a"), "/");
}

TEST(MountKindsTest, TablesDifferWhereSomethingElseIsMounted) {
    const MountKinds before({{"/same", "/dev/sda", "ext4", "/"},
                             {"/gone", "/dev/sdb", "ext4", "/"},
                             {"/other", "/dev/sdc", "ext4", "/"}});
    const MountKinds after({{"/same", "/dev/sda", "ext4", "/"},
                            {"/other", "/dev/sdd", "ext4", "/"},
                            {"/new", "/dev/sde", "ext4", "/"}});
    EXPECT_THAT(before.differences(after), UnorderedElementsAre("/gone", "/other", "/new"));
    EXPECT_THAT(after.differences(after), ElementsAre());
}
