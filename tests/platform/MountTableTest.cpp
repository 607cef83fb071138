// Which mounts are volumes, and what they are called, on made-up tables.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/linux/MountRules.h"
#include "platform/linux/MountTable.h"
#include "platform/linux/VolumeProperties.h"
#include "tests/support/TemporaryFolder.h"

using namespace platform;
using testing::ElementsAre;
using testing::Eq;
using testing::IsEmpty;
using testing::Optional;

namespace {

const MountEntry root{"/", "/dev/sda2", "ext4", "/"};

// A disk, mounted as a whole.
MountEntry disk(const std::string& path, const std::string& device, const std::string& fileSystem = "ext4") {
    return {path, device, fileSystem, "/"};
}

bool everythingIsAFolder(const std::string&) {
    return true;
}

std::vector<std::string> pathsOfVolumes(
    const std::vector<MountEntry>& entries,
    const std::function<bool(const std::string&)>& isFolder = everythingIsAFolder) {
    std::vector<std::string> paths;
    for (const Volume& volume : volumesAmong(entries, isFolder))
        paths.push_back(volume.entry.path);
    return paths;
}

bool isVolume(const MountEntry& entry) {
    return !pathsOfVolumes({root, entry}).empty() && pathsOfVolumes({root, entry}).back() == entry.path;
}

}  // namespace

TEST(MountRules, TheRootComesFirstAndTheOthersInMountOrder) {
    EXPECT_THAT(pathsOfVolumes({disk("/media/b", "/dev/sdb1"), root, disk("/media/a", "/dev/sdc1")}),
                ElementsAre("/", "/media/b", "/media/a"));
}

TEST(MountRules, AnyRootIsAVolume) {
    EXPECT_THAT(pathsOfVolumes({{"/", "overlay", "overlay", "/"}}), ElementsAre("/"));
}

TEST(MountRules, DisksHoldUsersFilesOutsideTheSystemsPlaces) {
    for (const char* const path : {"/home", "/srv/footage", "/data", "/media/me/CARD", "/run/media/me/CARD",
                                   "/mnt", "/mnt/disk", "/Volumes/Disk", "/tmp/image", "/var/home"})
        EXPECT_TRUE(isVolume(disk(path, "/dev/sdb1"))) << path;
    for (const char* const path :
         {"/boot", "/boot/efi", "/usr", "/usr/local", "/var", "/var/lib/docker", "/nix/store", "/snap/core/1",
          "/etc/hosts", "/run/something", "/tmp", "/proc/x", "/sysroot"})
        EXPECT_FALSE(isVolume(disk(path, "/dev/sdb1"))) << path;
}

TEST(MountRules, PlacesAreWholeComponents) {
    EXPECT_TRUE(isVolume(disk("/user-data", "/dev/sdb1")));
    EXPECT_TRUE(isVolume(disk("/bootleg", "/dev/sdb1")));
}

TEST(MountRules, FileSystemsOfTheKernelsOwnAreNone) {
    for (const char* const type :
         {"proc", "sysfs", "tmpfs", "devtmpfs", "cgroup2", "overlay", "autofs", "tracefs"})
        EXPECT_FALSE(isVolume({"/mnt/x", type, type, "/"})) << type;
}

TEST(MountRules, NetworkFileSystemsAreNone) {
    for (const char* const type :
         {"nfs", "nfs4", "cifs", "smb3", "afs", "9p", "ceph", "glusterfs", "fuse.sshfs", "fuse.davfs",
          "fuse.davfs2", "fuse.s3fs", "fuse.rclone", "fuse.gvfsd-fuse"})
        EXPECT_FALSE(isVolume({"/media/x", "/dev/fuse", type, "/"})) << type;
    EXPECT_FALSE(isVolume({"/media/x", "https://cloud.example/", "fuse", "/"}));
    EXPECT_FALSE(isVolume({"/media/x", "me@there:/home/me", "fuse.unheard-of", "/"}));
}

TEST(MountRules, LocalFUSEFileSystemsAreVolumes) {
    EXPECT_TRUE(isVolume({"/home/me/vault", "gocryptfs", "fuse.gocryptfs", "/"}));
    EXPECT_TRUE(isVolume({"/media/me/STICK", "/dev/sdb1", "fuseblk", "/"}));
    EXPECT_THAT(pathsOfVolumes({root,
                                {"/home/me/a", "/dev/fuse", "fuse.encfs", "/"},
                                {"/home/me/b", "/dev/fuse", "fuse.encfs", "/"}}),
                ElementsAre("/", "/home/me/a", "/home/me/b"));
}

TEST(MountRules, BindMountsCountWhereVolumesAreMountedAndNotElsewhere) {
    const MountEntry bound{"/media/clips", "/dev/sda2", "ext4", "/srv/clips"};
    MountEntry elsewhere = bound;
    elsewhere.path = "/home/me/clips";
    EXPECT_THAT(pathsOfVolumes({root, bound, elsewhere}), ElementsAre("/", "/media/clips"));
}

TEST(MountRules, ADiskThatIsMountedTwiceCountsTwiceOnlyWhereVolumesAreMounted) {
    EXPECT_THAT(pathsOfVolumes({root, disk("/data", "/dev/sdb1"), disk("/home/me/data", "/dev/sdb1"),
                                disk("/mnt/data", "/dev/sdb1")}),
                ElementsAre("/", "/data", "/mnt/data"));
}

TEST(MountRules, SubvolumesAreDisksOfTheirOwn) {
    EXPECT_THAT(pathsOfVolumes({{"/", "/dev/sda2", "btrfs", "/@"},
                                {"/home", "/dev/sda2", "btrfs", "/@home"},
                                {"/srv", "/dev/sda2", "btrfs", "/@home"}}),
                ElementsAre("/", "/home"));
}

TEST(MountRules, SingleFilesAreNoVolumes) {
    const MountEntry file{"/media/resolv.conf", "/dev/sda2", "ext4", "/var/lib/resolv.conf"};
    EXPECT_THAT(pathsOfVolumes({root, file}, [](const std::string&) { return false; }), ElementsAre("/"));
    EXPECT_THAT(pathsOfVolumes({root, file}), ElementsAre("/", "/media/resolv.conf"));
}

TEST(MountRules, WhatMayNotAnswerIsNeverLookedAt) {
    const MountEntry share{"/mnt/share", "server:/share", "nfs4", "/"};
    const MountEntry vault{"/mnt/vault", "encfs", "fuse.encfs", "/folder"};
    const MountEntry imageOnShare{"/mnt/share/image", "/dev/loop0", "ext4", "/folder"};
    const MountEntry bound{"/mnt/bound", "/dev/sda2", "ext4", "/srv"};
    std::vector<std::string> asked;
    const auto volumes =
        volumesAmong({root, share, vault, imageOnShare, bound}, [&](const std::string& path) {
            asked.push_back(path);
            return true;
        });
    EXPECT_THAT(asked, ElementsAre("/mnt/bound"));
    std::vector<std::pair<std::string, bool>> answers;
    for (const auto& volume : volumes)
        answers.emplace_back(volume.entry.path, volume.answersAtOnce);
    EXPECT_THAT(answers, ElementsAre(std::pair("/", true), std::pair("/mnt/vault", false),
                                     std::pair("/mnt/share/image", false), std::pair("/mnt/bound", true)));
}

TEST(MountRules, OfMountsAtOnePlaceTheLastIsSeen) {
    const auto volumes =
        volumesAmong({root, disk("/mnt/x", "/dev/sdb1"), disk("/mnt/x", "/dev/sdc1")}, everythingIsAFolder);
    ASSERT_EQ(volumes.size(), 2u);
    EXPECT_EQ(volumes[1].entry.device, "/dev/sdc1");
    EXPECT_THAT(pathsOfVolumes({root, disk("/mnt/x", "/dev/sdb1"), {"/mnt/x", "tmpfs", "tmpfs", "/"}}),
                ElementsAre("/"));
}

TEST(MountRules, WhatLiesBelowAHiddenFolderBelongsToAProgram) {
    EXPECT_FALSE(isVolume({"/tmp/.mount_viewer", "viewer", "fuse.viewer", "/"}));
    EXPECT_FALSE(isVolume(disk("/home/me/.cache/image", "/dev/loop3")));
}

TEST(MountRules, TheFirstMountOfADiskStandsForIt) {
    const auto volumes = volumesAmong({root,
                                       {"/media/clips", "/dev/sda2", "ext4", "/srv"},
                                       disk("/mnt/a", "/dev/sdb1"),
                                       disk("/mnt/b", "/dev/sdb1")},
                                      everythingIsAFolder);
    std::vector<bool> whole;
    for (const auto& volume : volumes)
        whole.push_back(volume.isWholeDisk);
    EXPECT_THAT(whole, ElementsAre(true, false, true, false));
}

TEST(MountRules, NetworkAndFUSEMountsAreServedAndSoIsWhatIsMountedWhenItIsLookedAt) {
    EXPECT_THAT(servedMountPoints({root,
                                   {"/mnt/nas", "nas:/export", "nfs4", "/"},
                                   {"/mnt/ssh", "me@host:/", "fuse.sshfs", "/"},
                                   {"/net", "systemd-1", "autofs", "/"},
                                   {"/media/stick", "/dev/sdb1", "fuseblk", "/"},
                                   disk("/media/card", "/dev/sdc1", "vfat"),
                                   {"/proc", "proc", "proc", "/"}}),
                ElementsAre("/mnt/nas", "/mnt/ssh", "/net"));
}

TEST(MountRules, WhatIsMountedLastAtAPlaceDecidesWhetherItIsServed) {
    const MountEntry share{"/mnt/a", "nas:/export", "nfs4", "/"};
    EXPECT_THAT(servedMountPoints({root, share, disk("/mnt/a", "/dev/sdb1")}), IsEmpty());
    EXPECT_THAT(servedMountPoints({root, disk("/mnt/a", "/dev/sdb1"), share}), ElementsAre("/mnt/a"));
}

// --- Names

TEST(VolumeProperties, AVolumeWithoutALabelIsNamedAfterItsMountPoint) {
    EXPECT_EQ(displayNameOfVolume({{"/media/me/CARD", "/dev/absent", "vfat", "/"}, false, true}), "CARD");
    EXPECT_EQ(displayNameOfVolume({{"/", "/dev/absent", "vfat", "/"}, false, true}), "File System");
}

TEST(VolumeProperties, ALabelBecomesOneComponentOfAPath) {
    EXPECT_THAT(nameFromLabel("Footage"), Optional(Eq("Footage")));
    EXPECT_THAT(nameFromLabel("2008/09"), Optional(Eq("2008:09")));
    EXPECT_EQ(nameFromLabel(""), std::nullopt);
    EXPECT_EQ(nameFromLabel("."), std::nullopt);
    EXPECT_EQ(nameFromLabel(".."), std::nullopt);
}

TEST(VolumeProperties, LabelsAreDecodedFromTheNamesOfTheirLinks) {
    EXPECT_EQ(decodedLabel("My\\x20Disk"), "My Disk");
    EXPECT_EQ(decodedLabel("a\\x2fb\\x5c"), "a/b\\");
    EXPECT_EQ(decodedLabel("\\x"), "\\x");
    EXPECT_EQ(decodedLabel("\\x2"), "\\x2");
    EXPECT_EQ(decodedLabel("\\xzz\\x4"), "\\xzz\\x4");
    EXPECT_EQ(decodedLabel(""), "");
}

TEST(VolumeProperties, WhatTheDesktopMountedIsRemovable) {
    EXPECT_TRUE(isRemovable({"/media/me/CARD", "/dev/absent", "vfat", "/"}));
    EXPECT_TRUE(isRemovable({"/run/media/me/CARD", "/dev/absent", "vfat", "/"}));
    EXPECT_FALSE(isRemovable({"/mnt/disk", "/dev/absent", "ext4", "/"}));
    EXPECT_FALSE(isRemovable({"/mnt/disk", "/dev/null", "ext4", "/"}));
}

// --- The kernel's table

TEST(SystemMountTable, BeginsWithTheRoot) {
    const SystemMountTable table;
    const auto mounts = table.mounts();
    ASSERT_FALSE(mounts.empty());
    EXPECT_EQ(mounts.front().path, "/");
    EXPECT_EQ(table.mounts(), mounts);
    for (const Mount& mount : mounts) {
        EXPECT_NE(mount.displayName, "");
        EXPECT_EQ(mount.displayName.find('/'), std::string::npos);
        EXPECT_FALSE(isInside(mount.path, "/proc"));
    }
}
