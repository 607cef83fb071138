#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <pwd.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <fstream>
#include <thread>

#include "platform/linux/FileSystemTypes.h"
#include "platform/linux/HiddenNames.h"
#include "platform/linux/LinuxFileManager.h"
#include "tests/platform/CollectedLog.h"
#include "tests/support/FakeMountTable.h"
#include "tests/support/TemporaryFolder.h"

using namespace platform;
using namespace testing_support;
using testing::ElementsAre;
using testing::Eq;
using testing::Optional;
using testing::UnorderedElementsAre;

namespace {

class LinuxFileManagerTest : public testing::Test {
  protected:
    std::string path(std::string_view relative) const { return folder_.path(relative); }
    std::string attribute(const std::string& file, std::string_view name) const {
        std::string value(64, '\0');
        const auto size = files_.extendedAttribute(file, name, value);
        return size < 0 ? "missing" : value.substr(0, static_cast<std::size_t>(size));
    }

    const TemporaryFolder folder_;
    FakeMountTable mounts_;
    CollectedLog log_;
    const LinuxFileManager files_{folder_.path(), mounts_, log_,
                                  [](std::string_view extension) { return extension == "qnproject"; },
                                  folder_.path("Volumes")};
};

constexpr std::uint32_t package = itemIsPackage, container = itemIsContainer, invisible = itemIsInvisible;

}  // namespace

// --- Kinds, attributes, names

TEST_F(LinuxFileManagerTest, KindsFollowLinks) {
    folder_.makeFolder("folder");
    folder_.writeFile("file");
    folder_.makeFifo("fifo");
    folder_.makeLink("link to folder", path("folder"));
    folder_.makeLink("link to nothing", path("nothing"));
    EXPECT_EQ(files_.kindOfItemAtPath(path("folder")), FileKind::directory);
    EXPECT_EQ(files_.kindOfItemAtPath(path("folder/")), FileKind::directory);
    EXPECT_EQ(files_.kindOfItemAtPath(path("file")), FileKind::file);
    EXPECT_EQ(files_.kindOfItemAtPath(path("fifo")), FileKind::file);
    EXPECT_EQ(files_.kindOfItemAtPath(path("link to folder")), FileKind::directory);
    EXPECT_EQ(files_.kindOfItemAtPath(path("link to nothing")), std::nullopt);
    EXPECT_FALSE(files_.fileExistsAtPath(path("nothing")));
    EXPECT_FALSE(files_.fileExistsAtPath(path("file/below")));
    EXPECT_FALSE(files_.fileExistsAtPath(""));
    EXPECT_THAT(log_.lines(), ElementsAre());
}

TEST_F(LinuxFileManagerTest, APathWithANULNamesNothing) {
    folder_.writeFile("file");
    const std::string odd = path("file") + std::string("\0.mov", 5);
    EXPECT_FALSE(files_.fileExistsAtPath(odd));
    EXPECT_EQ(files_.itemFlagsAtPath(odd), std::nullopt);
    EXPECT_EQ(files_.openFileAtPath(odd), nullptr);
}

TEST_F(LinuxFileManagerTest, AttributesTellSizeAndDates) {
    folder_.writeFile("clip.mov", "12345");
    setModificationTime(path("clip.mov"), 1234567890.25);
    const auto attributes = files_.attributesOfItemAtPath(path("clip.mov"));
    ASSERT_TRUE(attributes);
    EXPECT_EQ(attributes->size, 5u);
    ASSERT_TRUE(attributes->modificationDate && attributes->creationDate);
    EXPECT_DOUBLE_EQ(attributes->modificationDate->secondsSince1970(), 1234567890.25);
    EXPECT_EQ(files_.attributesOfItemAtPath(path("nothing")), std::nullopt);
}

TEST_F(LinuxFileManagerTest, TheCreationDateIsTheTimeOfBirthWhereThereIsOne) {
    folder_.writeFile("clip.mov");
    setModificationTime(path("clip.mov"), 1000);
    struct statx status {};
    ASSERT_EQ(statx(AT_FDCWD, path("clip.mov").c_str(), 0, STATX_BTIME, &status), 0);
    if (!(status.stx_mask & STATX_BTIME))
        GTEST_SKIP() << "the temporary folder's file system keeps no time of birth";
    EXPECT_NEAR(files_.attributesOfItemAtPath(path("clip.mov"))->creationDate->secondsSince1970(),
                static_cast<double>(status.stx_btime.tv_sec) + status.stx_btime.tv_nsec * 1e-9, 1e-6);
}

TEST_F(LinuxFileManagerTest, TheCreationDateIsTheModificationDateWhereThereIsNoTimeOfBirth) {
    const auto attributes = files_.attributesOfItemAtPath("/proc/self/status");
    ASSERT_TRUE(attributes && attributes->creationDate);
    EXPECT_EQ(attributes->creationDate->secondsSince1970(), attributes->modificationDate->secondsSince1970());
}

TEST_F(LinuxFileManagerTest, AFolderListsItsNamesAndNotItself) {
    folder_.makeFolder("event/sub");
    folder_.writeFile("event/clip.mov");
    folder_.writeFile("event/.hidden");
    folder_.writeFile("event/not UTF-8 \xFF");
    EXPECT_THAT(files_.contentsOfDirectoryAtPath(path("event")),
                Optional(UnorderedElementsAre("sub", "clip.mov", ".hidden", "not UTF-8 \xFF")));
}

TEST_F(LinuxFileManagerTest, AFolderThatIsMissingIsNoTrouble) {
    EXPECT_EQ(files_.contentsOfDirectoryAtPath(path("nothing")), std::nullopt);
    EXPECT_THAT(log_.lines(), ElementsAre());
}

TEST_F(LinuxFileManagerTest, AFolderThatCannotBeListedIsLoggedInOneLine) {
    folder_.writeFile("line\nbreak");
    folder_.makeFifo("fifo");
    EXPECT_EQ(files_.contentsOfDirectoryAtPath(path("line\nbreak")), std::nullopt);
    EXPECT_EQ(files_.contentsOfDirectoryAtPath(path("fifo")), std::nullopt);
    EXPECT_THAT(log_.lines(), ElementsAre("cannot list " + path("line\\x0abreak") + ": Not a directory",
                                          "cannot list " + path("fifo") + ": Not a directory"));
}

TEST_F(LinuxFileManagerTest, ALinkThatGoesInCirclesIsLogged) {
    folder_.makeLink("circle", path("circle"));
    EXPECT_FALSE(files_.fileExistsAtPath(path("circle")));
    EXPECT_THAT(log_.lines(),
                ElementsAre("cannot look at " + path("circle") + ": Too many levels of symbolic links"));
    EXPECT_EQ(files_.itemFlagsAtPath(path("circle")), 0u);
}

TEST_F(LinuxFileManagerTest, TheDisplayNameIsTheLastComponent) {
    folder_.makeFolder("Summer.qnproject");
    EXPECT_THAT(files_.displayNameAtPath(path("Summer.qnproject/")), Optional(Eq("Summer.qnproject")));
    EXPECT_EQ(files_.displayNameAtPath(path("nothing")), std::nullopt);
    EXPECT_EQ(mounts_.questions, 0);
}

TEST_F(LinuxFileManagerTest, TheDisplayNameOfAMountPointIsItsVolumes) {
    mounts_.list = {{"/", "/dev/sda1", "ext4", "Work", false}};
    EXPECT_THAT(files_.displayNameAtPath("/"), Optional(Eq("Work")));
    EXPECT_THAT(files_.displayNameAtPath("/proc"), Optional(Eq("proc")));
}

// --- Item flags

TEST_F(LinuxFileManagerTest, FoldersAreContainersAndSomeArePackages) {
    folder_.makeFolder("Event");
    folder_.makeFolder("Summer.qnproject");
    folder_.writeFile("file.qnproject");
    EXPECT_EQ(files_.itemFlagsAtPath(path("Event")), container);
    EXPECT_EQ(files_.itemFlagsAtPath(path("Summer.qnproject")), container | package);
    EXPECT_EQ(files_.itemFlagsAtPath(path("file.qnproject")), 0u);
    EXPECT_EQ(files_.itemFlagsAtPath(path("nothing")), std::nullopt);
}

TEST_F(LinuxFileManagerTest, ALinkIsNeverAContainerNorAPackage) {
    folder_.makeFolder("Event");
    folder_.makeLink("Link.qnproject", path("Event"));
    folder_.makeLink(".hidden link", path("Event"));
    EXPECT_EQ(files_.itemFlagsAtPath(path("Link.qnproject")), 0u);
    EXPECT_EQ(files_.itemFlagsAtPath(path("Link.qnproject/")), 0u);
    EXPECT_EQ(files_.itemFlagsAtPath(path(".hidden link")), invisible);
}

TEST_F(LinuxFileManagerTest, ALeadingDotHides) {
    folder_.makeFolder(".Trash");
    folder_.writeFile("event/.clip.mov");
    EXPECT_EQ(files_.itemFlagsAtPath(path(".Trash")), container | invisible);
    EXPECT_EQ(files_.itemFlagsAtPath(path("event/.clip.mov")), invisible);
}

TEST_F(LinuxFileManagerTest, TheFoldersListOfHiddenNamesHides) {
    folder_.writeFile("event/.hidden", "secret.mov\nsub\n");
    folder_.writeFile("event/secret.mov");
    folder_.writeFile("event/shown.mov");
    folder_.makeFolder("event/sub");
    folder_.writeFile("event/sub/secret.mov");
    EXPECT_EQ(files_.itemFlagsAtPath(path("event/secret.mov")), invisible);
    EXPECT_EQ(files_.itemFlagsAtPath(path("event/shown.mov")), 0u);
    EXPECT_EQ(files_.itemFlagsAtPath(path("event/sub")), container | invisible);
    EXPECT_EQ(files_.itemFlagsAtPath(path("event/sub/secret.mov")), 0u);
}

TEST_F(LinuxFileManagerTest, AChangedListOfHiddenNamesCountsAtOnce) {
    folder_.writeFile("a.mov");
    folder_.writeFile("b.mov");
    for (int round = 0; round < 3; ++round) {
        folder_.writeFile(".hidden", "a.mov");
        EXPECT_EQ(files_.itemFlagsAtPath(path("a.mov")), invisible);
        folder_.writeFile(".hidden", "b.mov");
        EXPECT_EQ(files_.itemFlagsAtPath(path("a.mov")), 0u);
        EXPECT_EQ(files_.itemFlagsAtPath(path("b.mov")), invisible);
        folder_.remove(".hidden");
        EXPECT_EQ(files_.itemFlagsAtPath(path("b.mov")), 0u);
    }
}

TEST_F(LinuxFileManagerTest, AListOfHiddenNamesThatIsNoPlainFileHidesNothing) {
    folder_.makeFifo("fifo/.hidden");
    folder_.makeFolder("folder/.hidden");
    folder_.writeFile("fifo/clip.mov");
    folder_.writeFile("folder/clip.mov");
    EXPECT_EQ(files_.itemFlagsAtPath(path("fifo/clip.mov")), 0u);
    EXPECT_EQ(files_.itemFlagsAtPath(path("folder/clip.mov")), 0u);
}

TEST(HiddenNames, AreOneALine) {
    EXPECT_THAT(namesInHiddenFile("a\n\nb c\r\n\nlast"), ElementsAre("a", "b c\r", "last"));
    EXPECT_THAT(namesInHiddenFile(""), ElementsAre());
    EXPECT_THAT(namesInHiddenFile("\n"), ElementsAre());
}

TEST(HiddenNames, OfAnEnormousFileTheBeginningCounts) {
    const TemporaryFolder folder;
    folder.writeFile(".hidden", "first\n" + std::string(1024 * 1024, 'x') + "\nlast\n");
    const HiddenNames names;
    EXPECT_TRUE(names.contains(folder.path(), "first"));
    EXPECT_FALSE(names.contains(folder.path(), "last"));
}

// A list that is older than a moment is kept; only its own change makes it read again.
TEST(HiddenNames, AnOldListIsReadAgainWhenTheFileIsReplaced) {
    const TemporaryFolder folder;
    folder.writeFile(".hidden", "a");
    setModificationTime(folder.path(".hidden"), 1000);
    const HiddenNames names;
    EXPECT_TRUE(names.contains(folder.path(), "a"));
    folder.writeFile("new", "b");
    setModificationTime(folder.path("new"), 1000);
    ASSERT_EQ(rename(folder.path("new").c_str(), folder.path(".hidden").c_str()), 0);
    EXPECT_FALSE(names.contains(folder.path(), "a"));
    EXPECT_TRUE(names.contains(folder.path(), "b"));
}

// --- Extended attributes

TEST_F(LinuxFileManagerTest, TheAttributeOfTheUserIsFound) {
    folder_.writeFile("clip.mov");
    setExtendedAttribute(path("clip.mov"), "user.date", "2009-03-01");
    folder_.makeLink("link.mov", path("clip.mov"));
    EXPECT_EQ(attribute(path("clip.mov"), "date"), "2009-03-01");
    EXPECT_EQ(attribute(path("link.mov"), "date"), "2009-03-01");
    EXPECT_EQ(attribute(path("clip.mov"), "other"), "missing");
    EXPECT_EQ(attribute(path("nothing"), "date"), "missing");
    EXPECT_THAT(log_.lines(), ElementsAre());
}

TEST_F(LinuxFileManagerTest, AnAttributeAnswersItsSizeOrThatItDoesNotFit) {
    folder_.writeFile("clip.mov");
    setExtendedAttribute(path("clip.mov"), "user.date", "2009");
    char small[3];
    EXPECT_EQ(files_.extendedAttribute(path("clip.mov"), "date", {}), 4);
    EXPECT_LT(files_.extendedAttribute(path("clip.mov"), "date", small), 0);
}

TEST_F(LinuxFileManagerTest, ASidecarCountsOnlyWhereTheFileSystemKeepsNoAttributes) {
    folder_.writeFile("clip.mov");
    folder_.writeFile("._clip.mov", "no matter what");
    EXPECT_EQ(attribute(path("clip.mov"), "date"), "missing");
}

// --- Opening

TEST_F(LinuxFileManagerTest, AnOpenFileReadsAnyPart) {
    folder_.writeFile("document", "0123456789");
    const auto file = files_.openFileAtPath(path("document"));
    ASSERT_TRUE(file);
    EXPECT_EQ(file->size(), 10u);
    EXPECT_EQ(file->name(), path("document"));
    std::string part(3, ' ');
    ASSERT_TRUE(file->read(4, std::as_writable_bytes(std::span(part))));
    EXPECT_EQ(part, "456");
    EXPECT_TRUE(file->read(7, std::as_writable_bytes(std::span(part))));
    EXPECT_FALSE(file->read(8, std::as_writable_bytes(std::span(part))));
    EXPECT_FALSE(file->read(~std::uint64_t{0}, std::as_writable_bytes(std::span(part))));
    EXPECT_TRUE(file->read(10, {}));
}

TEST_F(LinuxFileManagerTest, AFileThatIsTruncatedWhileItIsOpenFailsToRead) {
    folder_.writeFile("document", "0123456789");
    const auto file = files_.openFileAtPath(path("document"));
    ASSERT_EQ(truncate(path("document").c_str(), 5), 0);
    std::string part(3, ' ');
    EXPECT_TRUE(file->read(0, std::as_writable_bytes(std::span(part))));
    EXPECT_FALSE(file->read(4, std::as_writable_bytes(std::span(part))));
}

TEST_F(LinuxFileManagerTest, WhatIsNoPlainFileIsNeverOpened) {
    folder_.makeFifo("fifo");
    folder_.makeFolder("folder");
    folder_.makeLink("link to fifo", path("fifo"));
    const int listener = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{AF_UNIX, {}};
    path("socket").copy(address.sun_path, sizeof address.sun_path - 1);
    ASSERT_EQ(bind(listener, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    for (const char* const name : {"fifo", "folder", "link to fifo", "socket"})
        EXPECT_EQ(files_.openFileAtPath(path(name)), nullptr) << name;
    EXPECT_EQ(files_.openFileAtPath("/dev/zero"), nullptr);
    close(listener);
    EXPECT_THAT(log_.lines(), ElementsAre("cannot open " + path("fifo") + ": No such device",
                                          "cannot open " + path("folder") + ": Is a directory",
                                          "cannot open " + path("link to fifo") + ": No such device",
                                          "cannot open " + path("socket") + ": No such device",
                                          "cannot open /dev/zero: No such device"));
}

TEST_F(LinuxFileManagerTest, AMissingFileIsNoTrouble) {
    EXPECT_EQ(files_.openFileAtPath(path("nothing")), nullptr);
    EXPECT_THAT(log_.lines(), ElementsAre());
}

TEST_F(LinuxFileManagerTest, EveryOpenFileIsClosedWithItsSource) {
    folder_.writeFile("document", "x");
    rlimit limit{};
    ASSERT_EQ(getrlimit(RLIMIT_NOFILE, &limit), 0);
    for (rlim_t i = 0; i < std::min<rlim_t>(limit.rlim_cur + 16, 100'000); ++i)
        ASSERT_TRUE(files_.openFileAtPath(path("document")));
}

// --- Volumes

TEST_F(LinuxFileManagerTest, EveryOperationUnderstandsTheNameOfAVolume) {
    folder_.writeFile("disk/Events/clip.mov", "12345");
    folder_.makeFolder("disk/.Trash");
    setExtendedAttribute(path("disk/Events/clip.mov"), "user.date", "2009");
    mounts_.list = {{path("disk"), "/dev/sdb1", "ext4", "Footage", true}};
    const std::string events = path("Volumes/Footage/Events"), clip = events + "/clip.mov";
    EXPECT_EQ(files_.resolvedPath(clip), path("disk/Events/clip.mov"));
    EXPECT_EQ(files_.kindOfItemAtPath(path("Volumes/Footage")), FileKind::directory);
    EXPECT_THAT(files_.contentsOfDirectoryAtPath(events), Optional(ElementsAre("clip.mov")));
    EXPECT_EQ(files_.attributesOfItemAtPath(clip)->size, 5u);
    EXPECT_EQ(files_.itemFlagsAtPath(path("Volumes/Footage/.Trash")), container | invisible);
    EXPECT_THAT(files_.displayNameAtPath(clip), Optional(Eq("clip.mov")));
    EXPECT_EQ(attribute(clip, "date"), "2009");
    EXPECT_EQ(files_.fileSystemTypeNameAtPath(clip), files_.fileSystemTypeNameAtPath(folder_.path()));
    const auto file = files_.openFileAtPath(clip);
    ASSERT_TRUE(file);
    EXPECT_EQ(file->name(), clip);
}

TEST_F(LinuxFileManagerTest, ARealEntryWinsOverTheNameOfAVolume) {
    folder_.makeFolder("Volumes/Footage");
    folder_.makeLink("Volumes/Dangling", path("nothing"));
    mounts_.list = {{path("disk"), "/dev/sdb1", "ext4", "Footage", true},
                    {path("disk"), "/dev/sdb1", "ext4", "Dangling", true}};
    EXPECT_EQ(files_.resolvedPath(path("Volumes/Footage/a")), path("Volumes/Footage/a"));
    EXPECT_EQ(files_.resolvedPath(path("Volumes/Dangling/a")), path("Volumes/Dangling/a"));
}

TEST_F(LinuxFileManagerTest, OfTwoVolumesWithOneNameTheFirstIsMeant) {
    mounts_.list = {{"/media/first", "/dev/sdb1", "ext4", "NO NAME", true},
                    {"/media/second", "/dev/sdc1", "ext4", "NO NAME", true}};
    EXPECT_EQ(files_.resolvedPath(path("Volumes/NO NAME/a")), "/media/first/a");
}

TEST_F(LinuxFileManagerTest, ANameThatNoVolumeHasLeadsNowhere) {
    const std::string gone = path("Volumes/Gone/clip.mov");
    EXPECT_EQ(files_.resolvedPath(gone), std::nullopt);
    EXPECT_EQ(files_.kindOfItemAtPath(gone), std::nullopt);
    EXPECT_EQ(files_.contentsOfDirectoryAtPath(gone), std::nullopt);
    EXPECT_EQ(files_.attributesOfItemAtPath(gone), std::nullopt);
    EXPECT_EQ(files_.itemFlagsAtPath(gone), std::nullopt);
    EXPECT_EQ(files_.displayNameAtPath(gone), std::nullopt);
    EXPECT_EQ(attribute(gone, "date"), "missing");
    EXPECT_EQ(files_.fileSystemTypeNameAtPath(gone), std::nullopt);
    EXPECT_EQ(files_.openFileAtPath(gone), nullptr);
    EXPECT_THAT(log_.lines(), ElementsAre());
}

TEST_F(LinuxFileManagerTest, TheNameOfTheRootVolumeIsTheRoot) {
    mounts_.list = {{"/", "/dev/sda1", "ext4", "File System", false}};
    EXPECT_EQ(files_.resolvedPath(path("Volumes/File System")), "/");
    EXPECT_EQ(files_.resolvedPath(path("Volumes/File System/home/a")), "/home/a");
}

TEST_F(LinuxFileManagerTest, OtherPathsStayAsTheyAreAndAskNobody) {
    for (const std::string& other :
         {std::string(), std::string("relative"), path("Volumes"), path("Volumes/"), path("Volumes/../a"),
          path("Volumes/."), path("VolumesAndMore/Footage"), path("a/../b//c/")})
        EXPECT_EQ(files_.resolvedPath(other), other);
    EXPECT_EQ(mounts_.questions, 0);
}

// --- Types of file systems

TEST_F(LinuxFileManagerTest, KernelFileSystemsHaveTheirOwnNames) {
    EXPECT_THAT(files_.fileSystemTypeNameAtPath("/proc/self"), Optional(Eq("proc")));
    EXPECT_THAT(files_.fileSystemTypeNameAtPath("/sys"), Optional(Eq("sysfs")));
    EXPECT_EQ(files_.fileSystemTypeNameAtPath(path("nothing")), std::nullopt);
}

TEST(FileSystemTypes, AreNamedByTheirMagicNumbers) {
    EXPECT_EQ(fileSystemNameForMagic(0xEF53), "ext4");
    EXPECT_EQ(fileSystemNameForMagic(0x4D44), "msdos");
    EXPECT_EQ(fileSystemNameForMagic(0x2011BAB0), "msdos");
    EXPECT_EQ(fileSystemNameForMagic(0x7366746E), "ntfs");
    EXPECT_EQ(fileSystemNameForMagic(0x6969), "nfs");
    EXPECT_EQ(fileSystemNameForMagic(0x15013346), "udf");
    EXPECT_EQ(fileSystemNameForMagic(0x12AB), "0x12ab");
}

TEST(FileSystemTypes, AreNamedByTheMountTable) {
    EXPECT_EQ(fileSystemNameForType("fuse.afpfs", "afpfs"), "afpfs");
    EXPECT_EQ(fileSystemNameForType("fuse", "https://cloud.example/files/"), "webdav");
    EXPECT_EQ(fileSystemNameForType("fuse.davfs2", "dav"), "webdav");
    EXPECT_EQ(fileSystemNameForType("fuse.exfat-fuse", "/dev/sdb1"), "msdos");
    EXPECT_EQ(fileSystemNameForType("fuse.lowntfs-3g", "/dev/sdb1"), "ntfs");
    EXPECT_EQ(fileSystemNameForType("fuse.sshfs", "me@there:/home"), "sshfs");
    EXPECT_EQ(fileSystemNameForType("fuseblk", "/dev/sdb1"), "fuseblk");
}

// --- The user's home

TEST(UserHome, IsTheEnvironmentsWhereThatIsAnAbsolutePath) {
    const ScopedEnvironment home("HOME", "/home/somebody");
    EXPECT_THAT(LinuxFileManager::userHomeDirectory(), Optional(Eq("/home/somebody")));
}

TEST(UserHome, LosesTheSlashesAtItsEnd) {
    const ScopedEnvironment home("HOME", "/home/somebody//");
    EXPECT_EQ(LinuxFileManager::userHomeDirectory(), "/home/somebody");
}

TEST(UserHome, IsThePasswordDatabasesOtherwise) {
    const passwd* const user = getpwuid(getuid());
    if (!user || user->pw_dir[0] != '/')
        GTEST_SKIP() << "the password database knows no home";
    const std::string expected = user->pw_dir;
    for (const char* const useless : {"", "relative/home", static_cast<const char*>(nullptr)}) {
        const ScopedEnvironment home("HOME", useless);
        EXPECT_THAT(LinuxFileManager::userHomeDirectory(), Optional(Eq(expected)));
    }
}

TEST(UserHome, MayBeMissing) {
    FakeMountTable mounts;
    CollectedLog log;
    const LinuxFileManager files(std::nullopt, mounts, log, [](std::string_view) { return false; });
    EXPECT_EQ(files.homeDirectory(), std::nullopt);
}
