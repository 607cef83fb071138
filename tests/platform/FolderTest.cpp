// Going through a folder answers what the operations by path answer.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <algorithm>

#include "platform/linux/LinuxFileManager.h"
#include "tests/platform/CollectedLog.h"
#include "tests/platform/FakeMountTable.h"
#include "tests/support/PathFolder.h"
#include "tests/support/TemporaryFolder.h"

namespace testing_support {
namespace {

using platform::Folder;
using platform::FolderEntry;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::UnorderedElementsAre;

class FolderTest : public testing::Test {
  protected:
    std::unique_ptr<Folder> open() const { return files_.openFolderAtPath(home_.path()); }
    static std::string attribute(const Folder& folder, const std::string& name) {
        const auto entry = folder.entryNamed(name);
        std::array<char, 16> value{};
        const auto size = folder.extendedAttribute(name, entry.value_or(FolderEntry{}), "date", value);
        return size < 0 ? "missing" : std::string(value.data(), static_cast<std::size_t>(size));
    }
    std::string fileWithDate(const std::string& name, const std::string& attributeName = "user.date") {
        std::string file = home_.writeFile(name);
        setExtendedAttribute(file, attributeName, "2009");
        return file;
    }

    const TemporaryFolder home_;
    FakeMountTable mounts_;
    CollectedLog log_;
    const platform::LinuxFileManager files_{
        home_.path(), mounts_, log_, [](std::string_view extension) { return extension == "qnproject"; }};
};

std::string text(const std::optional<FolderEntry>& entry) {
    if (!entry)
        return "nothing";
    std::string text = std::to_string(entry->flags);
    text += entry->isPlainFile ? " plain" : "";
    text += entry->hasAttributes ? " attributes" : "";
    text += entry->creationTime ? " " + std::to_string(*entry->creationTime) : "";
    return text;
}

// One entry of every kind.
void fill(const TemporaryFolder& home) {
    home.writeFile("file.mov", "content");
    home.writeFile("elsewhere/target.mov");
    home.makeFolder("folder");
    home.makeFolder("package.qnproject");
    home.writeFile("plain.qnproject");
    home.makeFifo("fifo.mov");
    home.makeLink("link to file.mov", home.path("elsewhere/target.mov"));
    home.makeLink("link to folder", home.path("folder"));
    home.makeLink("link to package.qnproject", home.path("package.qnproject"));
    home.makeLink("link to nothing.mov", home.path("nothing"));
    home.writeFile(".dotted.mov");
    home.writeFile("hidden.mov");
    home.makeFolder("hidden folder");
    home.writeFile(".hidden", "hidden.mov\nhidden folder\n");
    home.writeFile("not UTF-8 \xff.mov");
}

TEST_F(FolderTest, NamesAreThoseOfTheListing) {
    fill(home_);
    EXPECT_EQ(open()->names(), files_.contentsOfDirectoryAtPath(home_.path()));
}

TEST_F(FolderTest, EntriesAreToldAsByPath) {
    fill(home_);
    const auto folder = open();
    const auto byPath = PathFolder::open(files_, home_.path());
    for (const std::string& name : folder->names())
        EXPECT_EQ(text(folder->entryNamed(name)), text(byPath->entryNamed(name))) << name;
    for (const std::string name : {".", "missing", "file.mov/below"})
        EXPECT_EQ(text(folder->entryNamed(name)), text(byPath->entryNamed(name))) << name;
}

TEST_F(FolderTest, EntriesTellWhatAScanAsks) {
    fill(home_);
    const auto folder = open();
    const auto withoutTime = [&folder](const std::string& name) {
        auto entry = folder->entryNamed(name);
        entry->creationTime.reset();
        return text(entry);
    };
    EXPECT_EQ(withoutTime("file.mov"), "0 plain attributes");
    EXPECT_EQ(withoutTime("folder"), "8 attributes");
    EXPECT_EQ(withoutTime("package.qnproject"), "10 attributes");
    EXPECT_EQ(withoutTime("fifo.mov"), "0 attributes");
    EXPECT_EQ(withoutTime("link to file.mov"), "0 plain attributes");
    EXPECT_EQ(withoutTime("link to folder"), "0 attributes");
    EXPECT_EQ(withoutTime("link to nothing.mov"), "0");
    EXPECT_EQ(withoutTime("hidden.mov"), "64 plain attributes");
    EXPECT_EQ(withoutTime("hidden folder"), "72 attributes");
    EXPECT_EQ(withoutTime(".dotted.mov"), "64 plain attributes");
}

TEST_F(FolderTest, AFolderThatCantBeListedIsNil) {
    EXPECT_EQ(files_.openFolderAtPath(home_.path("missing")), nullptr);
    EXPECT_EQ(files_.openFolderAtPath(""), nullptr);
    EXPECT_THAT(log_.lines(), IsEmpty());
    EXPECT_EQ(files_.openFolderAtPath(home_.makeFifo("fifo")), nullptr);
    EXPECT_EQ(log_.lines().size(), 1u);
}

TEST_F(FolderTest, AnEntryThatVanishesIsNothing) {
    home_.writeFile("a.mov");
    const auto folder = open();
    home_.remove("a.mov");
    EXPECT_EQ(folder->names(), std::vector<std::string>{"a.mov"});
    EXPECT_EQ(text(folder->entryNamed("a.mov")), "nothing");
    EXPECT_EQ(attribute(*folder, "a.mov"), "missing");
    EXPECT_THAT(log_.lines(), IsEmpty());
}

TEST_F(FolderTest, AFolderThatVanishesHasNoEntries) {
    home_.writeFile("inner/a.mov");
    const auto folder = files_.openFolderAtPath(home_.path("inner"));
    home_.remove("inner");
    EXPECT_EQ(text(folder->entryNamed("a.mov")), "nothing");
    EXPECT_THAT(log_.lines(), IsEmpty());
}

TEST_F(FolderTest, HiddenFileInAnyCaseOfLettersHidesAsByPath) {
    home_.writeFile("a.mov");
    home_.writeFile(".HIDDEN", "a.mov\n");
    const auto entry = open()->entryNamed("a.mov");
    ASSERT_TRUE(entry);
    EXPECT_EQ(entry->flags, files_.itemFlagsAtPath(home_.path("a.mov")));
}

TEST_F(FolderTest, AttributesAreReadBesideFilesWithoutAny) {
    home_.writeFile("1.mov");
    fileWithDate("2.mov");
    home_.writeFile("3.mov");
    fileWithDate("4.mov");
    const auto folder = open();
    EXPECT_EQ(attribute(*folder, "1.mov"), "missing");
    EXPECT_EQ(attribute(*folder, "2.mov"), "2009");
    EXPECT_EQ(attribute(*folder, "3.mov"), "missing");
    EXPECT_EQ(attribute(*folder, "4.mov"), "2009");
}

TEST_F(FolderTest, AttributesFollowLinks) {
    home_.makeLink("link.mov", fileWithDate("elsewhere/target.mov"));
    EXPECT_EQ(attribute(*open(), "link.mov"), "2009");
}

TEST_F(FolderTest, AnAttributeThatDoesNotFitIsAnError) {
    const std::string file = home_.writeFile("a.mov");
    setExtendedAttribute(file, "user.date", std::string(17, 'x'));
    EXPECT_EQ(attribute(*open(), "a.mov"), "missing");
    EXPECT_THAT(log_.lines(), IsEmpty());
}

}  // namespace
}  // namespace testing_support
