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
#include "tests/support/FakeMountTable.h"
#include "tests/support/PathFolder.h"
#include "tests/support/TemporaryFolder.h"

namespace testing_support {
namespace {

using platform::Folder;
using platform::FolderItem;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;
using testing::UnorderedElementsAre;

class FolderTest : public testing::Test {
  protected:
    // An open folder with all its items.
    struct ReadFolder {
        explicit ReadFolder(std::unique_ptr<Folder> opened)
            : folder(std::move(opened)), items(folder->allItems().value()) {}
        const Folder* operator->() const { return folder.get(); }
        const Folder& operator*() const { return *folder; }

        std::unique_ptr<Folder> folder;
        std::vector<FolderItem> items;
    };

    ReadFolder open() const { return ReadFolder(files_.openFolderAtPath(home_.path())); }
    static FolderItem itemNamed(const ReadFolder& folder, std::string_view name) {
        const auto found = std::ranges::find(folder.items, name, &FolderItem::name);
        return found != folder.items.end() ? *found : FolderItem{name};
    }
    static std::string attribute(const ReadFolder& folder, std::string_view name) {
        std::array<char, 16> value{};
        const auto size = folder->extendedAttributeOf(itemNamed(folder, name), "date", value);
        if (!size)
            return "out of reach";
        return *size < 0 ? "missing" : std::string(value.data(), static_cast<std::size_t>(*size));
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

std::string told(const Folder& folder, const FolderItem& item) {
    const auto flags = folder.flagsOf(item);
    const auto attributes = folder.attributesOf(item);
    std::string text = flags ? std::to_string(*flags) : "nothing";
    text += folder.isPlainFile(item) ? " plain" : "";
    text += attributes ? " attributes" : "";
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

TEST_F(FolderTest, ItemsAreThoseOfTheListing) {
    fill(home_);
    const auto folder = open();
    std::vector<std::string> names;
    for (const FolderItem& item : folder.items)
        names.emplace_back(item.name);
    EXPECT_EQ(names, files_.contentsOfDirectoryAtPath(home_.path()));
}

TEST_F(FolderTest, ItemsOfALargeFolderAreToldSomeAtATime) {
    constexpr std::size_t count = 1000;
    for (std::size_t i = 0; i < count; ++i)
        home_.writeFile("a name that takes its room " + std::to_string(i));
    home_.writeFile(".hidden", "a name that takes its room 0\na name that takes its room 999\n");
    const auto folder = files_.openFolderAtPath(home_.path());
    ASSERT_TRUE(folder);
    std::vector<FolderItem> all;
    while (folder->mayHaveMoreItems()) {
        const auto items = folder->nextItems();
        ASSERT_TRUE(items);
        EXPECT_LT(items->size(), count / 2);
        all.insert(all.end(), items->begin(), items->end());
    }
    EXPECT_THAT(folder->nextItems(), Optional(IsEmpty()));
    std::vector<std::string> names;
    std::vector<std::string_view> invisible;
    for (const FolderItem& item : all) {
        names.emplace_back(item.name);
        if (folder->flagsOf(item).value_or(0) & platform::itemIsInvisible)
            invisible.push_back(item.name);
    }
    EXPECT_EQ(names, files_.contentsOfDirectoryAtPath(home_.path()));
    EXPECT_THAT(invisible, UnorderedElementsAre(".hidden", "a name that takes its room 0",
                                                "a name that takes its room 999"));
}

TEST_F(FolderTest, ItemsAreToldOfAsByPath) {
    fill(home_);
    fileWithDate("dated.mov");
    const auto folder = open();
    const ReadFolder byPath(PathFolder::open(files_, home_.path()));
    std::vector<FolderItem> items = folder.items;
    for (const char* name : {".", "missing", "file.mov/below"})
        items.push_back({name});
    for (const FolderItem& item : items) {
        EXPECT_EQ(told(*folder, item), told(*byPath, item)) << item.name;
        EXPECT_EQ(attribute(folder, item.name), attribute(byPath, item.name)) << item.name;
    }
}

// As where the file system does not say what it lists.
TEST_F(FolderTest, AListingThatSaysNothingChangesNoAnswer) {
    fill(home_);
    const auto folder = open();
    for (const FolderItem& item : folder.items)
        EXPECT_EQ(told(*folder, item), told(*folder, {item.name})) << item.name;
}

TEST_F(FolderTest, AttributesAreThoseByPath) {
    const std::string file = home_.writeFile("a.mov", "content");
    const auto folder = open();
    const auto attributes = folder->attributesOf(folder.items[0]);
    const auto byPath = files_.attributesOfItemAtPath(file);
    EXPECT_EQ(attributes->size, byPath->size);
    EXPECT_EQ(attributes->creationDate->secondsSince1970(), byPath->creationDate->secondsSince1970());
    EXPECT_EQ(attributes->modificationDate->secondsSince1970(), byPath->modificationDate->secondsSince1970());
}

TEST_F(FolderTest, ItemsTellWhatAScanAsks) {
    fill(home_);
    const auto folder = open();
    const auto toldOf = [&folder](const std::string& name) { return told(*folder, itemNamed(folder, name)); };
    EXPECT_EQ(toldOf("file.mov"), "0 plain attributes");
    EXPECT_EQ(toldOf("folder"), "8 attributes");
    EXPECT_EQ(toldOf("package.qnproject"), "10 attributes");
    EXPECT_EQ(toldOf("fifo.mov"), "0 attributes");
    EXPECT_EQ(toldOf("link to file.mov"), "0 plain attributes");
    EXPECT_EQ(toldOf("link to folder"), "0 attributes");
    EXPECT_EQ(toldOf("link to nothing.mov"), "0");
    EXPECT_EQ(toldOf("hidden.mov"), "64 plain attributes");
    EXPECT_EQ(toldOf("hidden folder"), "72 attributes");
    EXPECT_EQ(toldOf(".dotted.mov"), "64 plain attributes");
}

TEST_F(FolderTest, AFolderThatCantBeListedIsNil) {
    EXPECT_EQ(files_.openFolderAtPath(home_.path("missing")), nullptr);
    EXPECT_EQ(files_.openFolderAtPath(""), nullptr);
    EXPECT_THAT(log_.lines(), IsEmpty());
    EXPECT_EQ(files_.openFolderAtPath(home_.makeFifo("fifo")), nullptr);
    EXPECT_EQ(log_.lines().size(), 1u);
}

TEST_F(FolderTest, HasTheAttributesThatItHasByPath) {
    const auto attributes = open()->attributes();
    const auto byPath = files_.attributesOfItemAtPath(home_.path());
    ASSERT_TRUE(attributes && byPath);
    EXPECT_EQ(attributes->creationDate->secondsSince1970(), byPath->creationDate->secondsSince1970());
    EXPECT_EQ(attributes->modificationDate->secondsSince1970(), byPath->modificationDate->secondsSince1970());
}

TEST_F(FolderTest, AFolderInItIsOpenedAsByPath) {
    fill(home_);
    home_.makeFolder("folder/inner");
    home_.writeFile("folder/.hidden", "hidden.mov");
    home_.writeFile("folder/hidden.mov");
    fileWithDate("folder/dated.mov");
    home_.makeFolder("hidden folder");
    for (const std::string name : {"folder", "package.qnproject", "link to folder", "hidden folder"}) {
        auto openedInFolder = open()->openFolder({name});  // which is closed again at once
        auto openedByPath = files_.openFolderAtPath(home_.path(name));
        ASSERT_TRUE(openedInFolder && openedByPath) << name;
        const ReadFolder inFolder(std::move(openedInFolder));
        const ReadFolder byPath(std::move(openedByPath));
        ASSERT_EQ(inFolder.items.size(), byPath.items.size()) << name;
        for (const FolderItem& item : byPath.items) {
            EXPECT_EQ(told(*inFolder, item), told(*byPath, item)) << name << "/" << item.name;
            EXPECT_EQ(attribute(inFolder, item.name), attribute(byPath, item.name)) << name;
        }
    }
    EXPECT_EQ(told(*open()->openFolder({"folder"}), {"hidden.mov"}), "64 plain attributes");
    EXPECT_EQ(attribute(ReadFolder(open()->openFolder({"folder"})), "dated.mov"), "2009");
}

TEST_F(FolderTest, WhatCantBeListedInItIsNilAsByPath) {
    fill(home_);
    const auto folder = open();
    home_.remove("hidden folder");
    for (const std::string name : {"missing", "hidden folder", "link to nothing.mov"})
        EXPECT_EQ(folder->openFolder({name}), nullptr) << name;
    EXPECT_THAT(log_.lines(), IsEmpty());
    EXPECT_EQ(folder->openFolder({"fifo.mov"}), nullptr);
    EXPECT_EQ(files_.openFolderAtPath(home_.path("fifo.mov")), nullptr);
    ASSERT_EQ(log_.lines().size(), 2u);
    EXPECT_EQ(log_.lines()[0], log_.lines()[1]);
}

TEST_F(FolderTest, AFolderOfAnotherFileSystemIsOpenedAsWell) {
    const auto root = files_.openFolderAtPath("/");
    ASSERT_TRUE(root);
    auto opened = root->openFolder({"proc"});
    const auto byPath = files_.openFolderAtPath("/proc");
    ASSERT_TRUE(opened && byPath);
    const ReadFolder folder(std::move(opened));
    EXPECT_TRUE(folder->isPlainFile(itemNamed(folder, "version")));
    // Where files may be hidden by a flag the file is looked at, and found missing.
    const FolderItem missing{"missing", FolderItem::Kind::plainFile};
    EXPECT_EQ(folder->flagsOf(missing), byPath->flagsOf(missing));
}

TEST_F(FolderTest, AFolderThatIsGoneBeforeItIsListedIsEmpty) {
    const platform::FileDescriptor gone(::open(home_.makeFolder("gone").c_str(), O_RDONLY | O_DIRECTORY));
    home_.remove("gone");
    const auto folder = files_.openFolderAtPath("/proc/self/fd/" + std::to_string(gone.number()));
    ASSERT_TRUE(folder);
    EXPECT_THAT(folder->allItems(), Optional(IsEmpty()));
    EXPECT_THAT(log_.lines(), IsEmpty());
}

TEST_F(FolderTest, AFileThatVanishesHasNoAttributes) {
    home_.writeFile("a.mov");
    const auto folder = open();
    home_.remove("a.mov");
    ASSERT_EQ(folder.items.size(), 1u);
    EXPECT_EQ(folder->attributesOf(folder.items[0]), std::nullopt);
    EXPECT_EQ(attribute(folder, "a.mov"), "out of reach");
    EXPECT_THAT(log_.lines(), IsEmpty());
}

TEST_F(FolderTest, WhatWasNoFileAndVanishesIsNothing) {
    home_.makeFifo("a.mov");
    const auto folder = open();
    home_.remove("a.mov");
    EXPECT_EQ(told(*folder, folder.items[0]), "nothing");
    EXPECT_THAT(log_.lines(), IsEmpty());
}

TEST_F(FolderTest, HiddenFileInAnyCaseOfLettersHidesAsByPath) {
    home_.writeFile("a.mov");
    home_.writeFile(".HIDDEN", "a.mov\n");
    const auto folder = open();
    EXPECT_EQ(folder->flagsOf(itemNamed(folder, "a.mov")), files_.itemFlagsAtPath(home_.path("a.mov")));
}

TEST_F(FolderTest, AttributesAreReadBesideFilesWithoutAny) {
    home_.writeFile("1.mov");
    fileWithDate("2.mov");
    home_.writeFile("3.mov");
    fileWithDate("4.mov");
    const auto folder = open();
    EXPECT_EQ(attribute(folder, "1.mov"), "missing");
    EXPECT_EQ(attribute(folder, "2.mov"), "2009");
    EXPECT_EQ(attribute(folder, "3.mov"), "missing");
    EXPECT_EQ(attribute(folder, "4.mov"), "2009");
}

TEST_F(FolderTest, AttributesFollowLinks) {
    home_.makeLink("link.mov", fileWithDate("elsewhere/target.mov"));
    EXPECT_EQ(attribute(open(), "link.mov"), "2009");
}

TEST_F(FolderTest, AnAttributeThatDoesNotFitIsAnError) {
    const std::string file = home_.writeFile("a.mov");
    setExtendedAttribute(file, "user.date", std::string(17, 'x'));
    EXPECT_EQ(attribute(open(), "a.mov"), "missing");
    EXPECT_THAT(log_.lines(), IsEmpty());
}

}  // namespace
}  // namespace testing_support
