#include "framework/FilePasteboard.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>

#include "host/VXConstants.h"
#include "tests/support/HostEnvironment.h"
#include "tests/support/Program.h"

namespace vexo {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class FilePasteboardTest : public testing::Test {
  protected:
    static VXMediaObjectRef item(const std::string& path) {
        auto mediaObject = std::make_shared<VXMediaObject>(VXMediaTypeMovie, "name", "ID of " + path);
        mediaObject->setPath(path);
        return mediaObject;
    }
    static VXMediaObjectRef itemWithoutPath() {
        return std::make_shared<VXMediaObject>(VXMediaTypeMovie, "name", "/no/path");
    }
    static VXMediaGroupRef group(const std::string& path, std::vector<VXMediaObjectRef> items = {}) {
        auto mediaGroup = std::make_shared<VXMediaGroup>(VXReelixFolderGroupTypeIdentifier, "ID of " + path);
        mediaGroup->setPath(path);
        mediaGroup->setMediaObjects(VXMediaObjectList(items));
        return mediaGroup;
    }
    static std::string textOf(const platform::Pasteboard& pasteboard, std::string_view type) {
        const auto value = pasteboard.valueForType(type);
        return value && value->string() ? *value->string() : "nothing";
    }
    // What is written for the paths, under one type.
    static std::string written(const std::vector<std::string>& paths, std::string_view type) {
        platform::Pasteboard pasteboard;
        EXPECT_TRUE(writeFiles(paths, pasteboard, nullptr));
        return textOf(pasteboard, type);
    }
    // A volume whose real folder is "disk" in the home.
    void mountDisk() {
        environment.mounts.list = {{environment.home.path("disk"), "/dev/x", "ext4", "My Disk", false}};
    }

    testing_support::HostEnvironment environment;
};

TEST_F(FilePasteboardTest, ItemsStandForTheirFilesInOrder) {
    EXPECT_THAT(filesOfMediaObjects({item("/b"), item("/a"), item("/c")}), ElementsAre("/b", "/a", "/c"));
}

TEST_F(FilePasteboardTest, ItemsWithoutAPathAreLeftOut) {
    EXPECT_THAT(filesOfMediaObjects({itemWithoutPath(), item("/a"), itemWithoutPath()}), ElementsAre("/a"));
    EXPECT_THAT(filesOfMediaObjects({itemWithoutPath()}), IsEmpty());
}

TEST_F(FilePasteboardTest, AFileIsNamedOnceWhereItComesFirst) {
    EXPECT_THAT(filesOfMediaObjects({item("/b"), item("/a"), item("/b"), item("/a")}),
                ElementsAre("/b", "/a"));
    EXPECT_THAT(filesOfMediaGroups({group("/b"), group("/a"), group("/b")}), ElementsAre("/b", "/a"));
}

TEST_F(FilePasteboardTest, NamesOfVolumesBecomeTheRealPaths) {
    mountDisk();
    EXPECT_THAT(filesOfMediaObjects({item("/Volumes/My Disk/a.mov")}),
                ElementsAre(environment.home.path("disk/a.mov")));
    EXPECT_THAT(filesOfMediaGroups({group("/Volumes/My Disk/Trip")}),
                ElementsAre(environment.home.path("disk/Trip")));
}

TEST_F(FilePasteboardTest, WhatLiesOnAVolumeThatIsGoneIsLeftOut) {
    EXPECT_THAT(filesOfMediaObjects({item("/Volumes/Gone Disk/a.mov"), item("/a")}), ElementsAre("/a"));
    EXPECT_THAT(filesOfMediaGroups({group("/Volumes/Gone Disk/Trip"), group("/a")}), ElementsAre("/a"));
}

TEST_F(FilePasteboardTest, AGroupStandsForItsFolderAndNotForItsItems) {
    const std::string folder = environment.home.makeFolder("Trip");
    EXPECT_THAT(filesOfMediaGroups({group(folder, {item(folder + "/a.mov")})}), ElementsAre(folder));
}

TEST_F(FilePasteboardTest, APackageStandsForTheFilesOfItsItems) {
    const std::string package = environment.home.makeFolder("Film.qnproject");
    EXPECT_THAT(filesOfMediaGroups({group(package, {item("/b"), itemWithoutPath(), item("/a")})}),
                ElementsAre("/b", "/a"));
}

TEST_F(FilePasteboardTest, APackageOnAVolumeIsRecognised) {
    mountDisk();
    environment.home.makeFolder("disk/Film.qnproject");
    EXPECT_THAT(filesOfMediaGroups({group("/Volumes/My Disk/Film.qnproject", {item("/a")})}),
                ElementsAre("/a"));
}

TEST_F(FilePasteboardTest, APackageWithoutItemsStandsForItself) {
    const std::string package = environment.home.makeFolder("Film.qnproject");
    EXPECT_THAT(filesOfMediaGroups({group(package)}), ElementsAre(package));
    EXPECT_THAT(filesOfMediaGroups({group(package, {itemWithoutPath()})}), ElementsAre(package));
}

TEST_F(FilePasteboardTest, AGroupWithoutAPathIsLeftOutWithItsItems) {
    const auto year = std::make_shared<VXMediaGroup>(VXReelixEventCalendarGroupTypeIdentifier, "2008");
    year->addChildGroup(group("/2008/Trip", {item("/2008/Trip/a.mov")}));
    EXPECT_THAT(filesOfMediaGroups({year}), IsEmpty());
}

TEST_F(FilePasteboardTest, NothingToWriteDeclaresNoType) {
    platform::Pasteboard pasteboard;
    EXPECT_FALSE(writeFiles({}, pasteboard, nullptr));
    EXPECT_THAT(pasteboard.types(), IsEmpty());
}

TEST_F(FilePasteboardTest, TheTypesAreThoseOfFileManagers) {
    platform::Pasteboard pasteboard;
    writeFiles({"/a b.mov", "/c.mov"}, pasteboard, nullptr);
    EXPECT_THAT(pasteboard.types(),
                ElementsAre("text/uri-list", "x-special/gnome-copied-files", "text/plain"));
    EXPECT_EQ(textOf(pasteboard, "text/uri-list"), "file:///a%20b.mov\r\nfile:///c.mov\r\n");
    EXPECT_EQ(textOf(pasteboard, "x-special/gnome-copied-files"), "copy\nfile:///a%20b.mov\nfile:///c.mov");
    EXPECT_EQ(textOf(pasteboard, "text/plain"), "/a b.mov\n/c.mov");
}

TEST_F(FilePasteboardTest, AURIHoldsNoByteThatAReaderCouldTakeForAnotherThing) {
    EXPECT_EQ(written({"/100%/#1?\r\n\xFF;\u00E9"}, "text/uri-list"),
              "file:///100%25/%231%3F%0D%0A%FF%3B%C3%A9\r\n");
}

TEST_F(FilePasteboardTest, APathThatIsNoLineOfTextIsAURLInPlainText) {
    EXPECT_EQ(written({"/\u00E9 %#", "/a\nb", "/a\x1B[2J", "/\x7F", "/\xFF"}, "text/plain"),
              "/\u00E9 %#\nfile:///a%0Ab\nfile:///a%1B%5B2J\nfile:///%7F\nfile:///%FF");
}

TEST_F(FilePasteboardTest, PythonReadsTheSamePathsFromBothListsOfURIs) {
    const std::vector<std::string> paths{"/plain.mov", "/a b%20c",  "/#?&;=",          "/line\nbreak\r",
                                         "/\xFF\xC3",  "/]]>&amp;", "/gr\u00FC\u00DFe"};
    std::string expected;
    for (const std::string& path : paths)
        expected += path + '\0';
    const testing_support::TemporaryFolder folder;
    const std::string list = folder.writeFile("list", written(paths, "text/uri-list"));
    const std::string copied = folder.writeFile("copied", written(paths, "x-special/gnome-copied-files"));
    const std::string script =
        "import sys, urllib.parse\n"
        "data = open(sys.argv[1], 'rb').read()\n"
        "lines = data.split(b'\\r\\n')[:-1] if sys.argv[2] == 'list' else data.split(b'\\n')[1:]\n"
        "for line in lines:\n"
        "    url = urllib.parse.urlsplit(line.decode('ascii'))\n"
        "    assert url.scheme == 'file' and not (url.netloc or url.query or url.fragment), url\n"
        "    sys.stdout.buffer.write(urllib.parse.unquote_to_bytes(url.path) + b'\\0')\n";
    EXPECT_EQ(testing_support::runProgram("python3", {"-c", script, list, "list"}).output, expected);
    EXPECT_EQ(testing_support::runProgram("python3", {"-c", script, copied, "copied"}).output, expected);
}

}  // namespace
}  // namespace vexo
