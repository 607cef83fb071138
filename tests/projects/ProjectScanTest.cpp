#include <sys/stat.h>

#include <filesystem>
#include <set>

#include "host/VXMediaBrowserImageManager.h"
#include "tests/projects/ProjectsTest.h"

using namespace testing_support;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

class ProjectScan : public ProjectsTest {
  protected:
    const std::string library = home().makeFolder("Library");
};

platform::ImageRef fileIcon(const std::string& path) {
    return vexo::VXMediaBrowserImageManager::sharedInstance().iconForFile(path);
}

double modified(const vexo::VXMediaGroup& group) {
    const auto date = group.modificationDate();
    return date ? date->secondsSince1970() : -1;
}

// --- Groups ------------------------------------------------------------------------------------------------

TEST_F(ProjectScan, NoPathMakesNoGroup) {
    EXPECT_EQ(scan(std::nullopt), nullptr);
    EXPECT_THAT(files.listed, IsEmpty());
    EXPECT_EQ(flatList(), "");
}

TEST_F(ProjectScan, ALibraryBecomesATree) {
    makeProject("Library/Beach.qnproject", {"large.m4v", "small.mov"});
    makeProject("Library/Empty.qnproject");
    home().makeFolder("Library/Nothing");
    makeProject("Library/Trips/Rome.qnproject", {"rome.3gp"});
    home().writeFile("Library/Trips/Rome.qnproject/Project", trailerDocument());
    makeProject("Library/Trips/Deep/Zoo.qnproject");
    home().writeFile("Library/readme.txt");

    EXPECT_EQ(text(scan(library)),
              R"(Folder home/Library "Library" <home> icon=folder
  * home/Library/Beach.qnproject/Movies/large.m4v "Beach"
  * home/Library/Trips/Rome.qnproject/Movies/rome.3gp "Rome"
  Project home/Library/Beach.qnproject "Beach" <home/Library> icon=Reelix-icon-project
    * home/Library/Beach.qnproject/Movies/large.m4v "large"
    * home/Library/Beach.qnproject/Movies/small.mov "small"
  Project home/Library/Empty.qnproject "Empty" <home/Library> icon=Reelix-icon-project
  Folder home/Library/Nothing "Nothing" <home/Library> icon=folder
  Folder home/Library/Trips "Trips" <home/Library> icon=folder
    * home/Library/Trips/Rome.qnproject/Movies/rome.3gp "Rome"
    Folder home/Library/Trips/Deep "Deep" <home/Library/Trips> icon=folder
      Project home/Library/Trips/Deep/Zoo.qnproject "Zoo" <home/Library/Trips/Deep> icon=Reelix-icon-project
    Project home/Library/Trips/Rome.qnproject "Rome" <home/Library/Trips> icon=Reelix-icon-trailer
      * home/Library/Trips/Rome.qnproject/Movies/rome.3gp "rome"
)");
    EXPECT_EQ(flatList(),
              R"(Project home/Library/Beach.qnproject "Beach" <home/Library> icon=Reelix-icon-project
Project home/Library/Empty.qnproject "Empty" <home/Library> icon=Reelix-icon-project
Folder home/Library/Nothing "Nothing" <home/Library/Nothing> icon=folder
Project home/Library/Trips/Deep/Zoo.qnproject "Zoo" <home/Library/Trips/Deep> icon=Reelix-icon-project
Project home/Library/Trips/Rome.qnproject "Rome" <home/Library/Trips> icon=Reelix-icon-trailer
)");
}

TEST_F(ProjectScan, TheFlatListHoldsTheVeryGroupsOfTheTree) {
    makeProject("Library/Beach.qnproject");
    const Group folder = scan(library);
    platform::Locked monitor(plugin()._monitor);
    ASSERT_EQ(plugin()._flatProjectGroupsList->size(), 1u);
    EXPECT_EQ(plugin()._flatProjectGroupsList->front(), folder->childGroups().front());
}

TEST_F(ProjectScan, AFolderGroupHasTheFieldsOfItsFolder) {
    makeProject("Library/Beach.qnproject");
    setModificationTime(library, 1230768000.5);
    const Group folder = scan(library);
    EXPECT_EQ(folder->typeIdentifier(), vexo::VXReelixFolderGroupTypeIdentifier);
    EXPECT_EQ(folder->path(), library);
    EXPECT_EQ(folder->ID(), library);
    EXPECT_EQ(modified(*folder), 1230768000.5);
    EXPECT_EQ(folder->icon(), fileIcon(library));
    EXPECT_TRUE(folder->attributes()->empty());
}

TEST_F(ProjectScan, AProjectGroupHasTheFieldsOfItsPackage) {
    const std::string package = makeProject("Library/A.b.qnproject");
    setModificationTime(package, 1230768000);
    const Group project = scan(library)->childGroups().front();
    EXPECT_EQ(project->typeIdentifier(), vexo::VXReelixProjectGroupTypeIdentifier);
    EXPECT_EQ(project->ID(), package);
    EXPECT_EQ(project->name(), "A.b");
    EXPECT_EQ(project->parentID(), library);
    EXPECT_EQ(project->path(), package);
    EXPECT_EQ(project->URL()->path(), package);
    EXPECT_EQ(modified(*project), 1230768000);
    EXPECT_TRUE(project->mediaObjects().empty());
}

TEST_F(ProjectScan, ARenderedMovieBecomesAnItem) {
    const std::string package = makeProject("Library/Beach.qnproject", {"The.Best.mov"});
    const std::string movie = package + "/Movies/The.Best.mov";
    const Group project = scan(library)->childGroups().front();
    ASSERT_EQ(project->mediaObjects().size(), 1u);
    const Object item = project->mediaObjects().front();
    EXPECT_EQ(item->mediaType(), 3);
    EXPECT_EQ(item->mediaSourceType(), 2);
    EXPECT_EQ(item->ID(), movie);
    EXPECT_EQ(item->path(), movie);
    EXPECT_EQ(item->name(), "The.Best");
    EXPECT_EQ(item->icon(), reelix::iconCache().smallApplicationIcon.get());
    EXPECT_TRUE(item->icon());
    EXPECT_EQ(item->thumbnailImage()->name(), "thumbnail of " + movie);  // the host's own
    const platform::Dictionary attributes{{"VXReelixProjectPathKey", package},
                                          {"VXReelixProjectFormatVersion", "7"}};
    EXPECT_EQ(platform::Value(item->attributes()), platform::Value(attributes));
    ASSERT_TRUE(item->spotlightProperties());
    EXPECT_EQ(item->spotlightProperties()->valueForKey(vexo::kMDItemPixelWidth), platform::Value(1280.0));
}

TEST_F(ProjectScan, ItemsKeepTheOrderInWhichTheirFilesAreListed) {
    const std::string package = makeProject("Library/Beach.qnproject", {"a.mov", "b.m4v", "c.3gp"});
    files.listings[package + "/Movies"] = {"c.3gp", "a.mov", "b.m4v"};
    const Group project = scan(library)->childGroups().front();
    EXPECT_THAT(
        inHome(idsOf(project->mediaObjects())),
        ElementsAre("home/Library/Beach.qnproject/Movies/c.3gp", "home/Library/Beach.qnproject/Movies/a.mov",
                    "home/Library/Beach.qnproject/Movies/b.m4v"));
}

TEST_F(ProjectScan, EntriesKeepTheOrderInWhichTheyAreListed) {
    makeProject("Library/a.qnproject");
    makeProject("Library/b.qnproject");
    home().makeFolder("Library/c");
    files.listings[library] = {"b.qnproject", "c", "a.qnproject"};
    EXPECT_THAT(namesOf(scan(library)->childGroups()), ElementsAre("b", "c", "a"));
}

TEST_F(ProjectScan, TheFourKindsOfProjectsHaveFourIconObjects) {
    makeProject("Library/1.qnproject", {"m.mov"});
    makeProject("Library/2.qnproject");
    makeProject("Library/3.qnproject", {"m.mov"});
    makeProject("Library/4.qnproject");
    home().writeFile("Library/1.qnproject/Project", plainDocument());
    home().writeFile("Library/2.qnproject/Project", plainDocument());
    home().writeFile("Library/3.qnproject/Project", trailerDocument());
    home().writeFile("Library/4.qnproject/Project", trailerDocument());
    const auto projects = scan(library)->childGroups();
    ASSERT_EQ(projects.size(), 4u);
    const reelix::IconCache& icons = reelix::iconCache();
    EXPECT_EQ(projects[0]->icon(), icons.projectIcon.get());
    EXPECT_EQ(projects[1]->icon(), icons.spareProjectIcon.get());
    EXPECT_EQ(projects[2]->icon(), icons.trailerIcon.get());
    EXPECT_EQ(projects[3]->icon(), icons.spareTrailerIcon.get());
    std::set<platform::ImageRef> distinct;
    for (const Group& project : projects)
        distinct.insert(project->icon());
    EXPECT_EQ(distinct.size(), 4u);
    EXPECT_EQ(distinct.count(nullptr), 0u);
}

TEST_F(ProjectScan, AProjectWithoutADocumentIsNoTrailer) {
    makeProject("Library/1.qnproject", {"m.mov"});
    const Group project = scan(library)->childGroups().front();
    EXPECT_EQ(project->icon(), reelix::iconCache().projectIcon.get());
}

TEST_F(ProjectScan, AFolderWithoutIconHasNone) {
    const Group folder = scan(home().path("missing"));
    EXPECT_EQ(folder->icon(), nullptr);
    EXPECT_EQ(folder->modificationDate(), nullptr);
    EXPECT_EQ(folder->name(), "missing");
}

// --- Placeholders ------------------------------------------------------------------------------------------

TEST_F(ProjectScan, AnEmptyFolderHasAPlaceholderInTheFlatListAlone) {
    setModificationTime(library, 1230768000);
    const Group folder = scan(library);
    EXPECT_TRUE(folder->childGroups().empty());
    ASSERT_TRUE(folder->ownMediaObjects());
    EXPECT_TRUE(folder->mediaObjects().empty());

    platform::Locked monitor(plugin()._monitor);
    ASSERT_EQ(plugin()._flatProjectGroupsList->size(), 1u);
    const Group placeholder = plugin()._flatProjectGroupsList->front();
    EXPECT_NE(placeholder, folder);
    EXPECT_EQ(placeholder->typeIdentifier(), vexo::VXReelixFolderGroupTypeIdentifier);
    EXPECT_EQ(placeholder->ID(), library);
    EXPECT_EQ(placeholder->name(), "Library");
    EXPECT_EQ(placeholder->parentID(), library);
    EXPECT_EQ(placeholder->path(), library);
    EXPECT_EQ(placeholder->icon(), fileIcon(library));
    EXPECT_EQ(modified(*placeholder), 1230768000);
}

TEST_F(ProjectScan, ThePlaceholderOfADefaultLibraryIsAProjectLibrary) {
    const std::string plain = home().makeFolder("Movies/Reelix Projects");
    EXPECT_EQ(text(scan(plain)),
              "Folder home/Movies/Reelix Projects \"Reelix Projects\" <home/Movies> icon=folder\n");
    EXPECT_EQ(flatList(),
              "ProjectLibrary home/Movies/Reelix Projects \"Reelix Projects\" <home/Movies/Reelix Projects> "
              "icon=folder\n");

    home().makeFolder("Movies/Reelix Projects.localized");
    scan(plain + ".localized");
    EXPECT_EQ(flatList(),
              "ProjectLibrary home/Movies/Reelix Projects.localized \"Reelix Projects.localized\" "
              "<home/Movies/Reelix Projects.localized> icon=folder\n");
}

TEST_F(ProjectScan, AMissingFolderIsAnEmptyOneAndHasAPlaceholder) {
    EXPECT_EQ(text(scan(home().path("none"))), "Folder home/none \"none\" <home> icon=none\n");
    EXPECT_EQ(flatList(), "Folder home/none \"none\" <home/none> icon=none\n");
}

TEST_F(ProjectScan, AFileIsAnEmptyFolder) {
    const std::string file = home().writeFile("file");
    EXPECT_EQ(text(scan(file)), "Folder home/file \"file\" <home> icon=document\n");
    EXPECT_EQ(flatList(), "Folder home/file \"file\" <home/file> icon=document\n");
}

TEST_F(ProjectScan, AFolderOfNothingButFilesAndHiddenThingsHasAPlaceholder) {
    home().writeFile("Library/clip.mov");
    makeProject("Library/.hidden.qnproject");
    scan(library);
    EXPECT_EQ(flatList(), "Folder home/Library \"Library\" <home/Library> icon=folder\n");
}

TEST_F(ProjectScan, EachEmptySubfolderHasAPlaceholderOfItsOwn) {
    home().makeFolder("Library/a/b");
    home().makeFolder("Library/c");
    scan(library);
    EXPECT_EQ(flatList(),
              "Folder home/Library/a/b \"b\" <home/Library/a/b> icon=folder\n"
              "Folder home/Library/c \"c\" <home/Library/c> icon=folder\n");
}

// --- The localized form ------------------------------------------------------------------------------------

TEST_F(ProjectScan, AMissingLocalizedFolderIsReadByItsPlainName) {
    makeProject("Library/Beach.qnproject");
    makeProject("Library/Trips/Rome.qnproject");
    EXPECT_EQ(text(scan(library + ".localized")),
              R"(Folder home/Library.localized "Library.localized" <home> icon=none
  Project home/Library/Beach.qnproject "Beach" <home/Library> icon=Reelix-icon-project
  Folder home/Library/Trips "Trips" <home/Library.localized> icon=folder
    Project home/Library/Trips/Rome.qnproject "Rome" <home/Library/Trips> icon=Reelix-icon-project
)");
    EXPECT_THAT(inHome(files.listed),
                ElementsAre("home/Library.localized", "home/Library", "home/Library/Trips"));
}

TEST_F(ProjectScan, ThePlaceholderStandsForTheFolderThatWasListed) {
    setModificationTime(library, 1230768000);
    scan(library + ".localized");
    EXPECT_EQ(flatList(), "Folder home/Library \"Library\" <home/Library> icon=folder\n");
    platform::Locked monitor(plugin()._monitor);
    EXPECT_EQ(plugin()._flatProjectGroupsList->front()->path(), library);
    EXPECT_EQ(modified(*plugin()._flatProjectGroupsList->front()), 1230768000);
}

TEST_F(ProjectScan, WithBothFormsMissingThePlainOneWasListed) {
    scan(home().path("Movies/Reelix Projects.localized"));
    EXPECT_EQ(flatList(),
              "ProjectLibrary home/Movies/Reelix Projects \"Reelix Projects\" <home/Movies/Reelix Projects> "
              "icon=none\n");
}

TEST_F(ProjectScan, ALocalizedFolderThatCanBeListedIsReadItself) {
    makeProject("Library/Beach.qnproject");
    home().makeFolder("Library.localized");
    EXPECT_EQ(text(scan(library + ".localized")),
              "Folder home/Library.localized \"Library.localized\" <home> icon=folder\n");
    EXPECT_THAT(inHome(files.listed), ElementsAre("home/Library.localized"));
}

TEST_F(ProjectScan, ALocalizedFileIsReadByThePlainNameToo) {
    makeProject("Library/Beach.qnproject");
    home().writeFile("Library.localized");
    EXPECT_THAT(namesOf(scan(library + ".localized")->childGroups()), ElementsAre("Beach"));
}

TEST_F(ProjectScan, OtherExtensionsAreNotTakenAway) {
    makeProject("Library/Beach.qnproject");
    for (const char* extension : {".LOCALIZED", ".Localized", ".localised", "."})
        EXPECT_TRUE(scan(library + extension)->childGroups().empty()) << extension;
    makeProject("x/Beach.qnproject");
    EXPECT_TRUE(scan(home().path("x/.localized"))->childGroups().empty());
}

// --- Entries -----------------------------------------------------------------------------------------------

TEST_F(ProjectScan, OnlyPackagesWithTheExactExtensionAreProjects) {
    for (const char* folder :
         {"Foo.QNPROJECT", "Foo.Qnproject", "qnproject", "x.qnproject.tar", "x.tar.qnproject",
          "a.b.qnproject", "plain.", "Bundle.app", "two  blanks .qnproject"})
        home().makeFolder(std::string("Library/") + folder);
    home().writeFile("Library/File.qnproject");
    home().writeFile("Library/File");

    EXPECT_EQ(text(scan(library)), R"(Folder home/Library "Library" <home> icon=folder
  Project home/Library/a.b.qnproject "a.b" <home/Library> icon=Reelix-icon-project
  Folder home/Library/plain. "plain." <home/Library> icon=folder
  Folder home/Library/qnproject "qnproject" <home/Library> icon=folder
  Project home/Library/two  blanks .qnproject "two  blanks " <home/Library> icon=Reelix-icon-project
  Folder home/Library/x.qnproject.tar "x.qnproject.tar" <home/Library> icon=folder
  Project home/Library/x.tar.qnproject "x.tar" <home/Library> icon=Reelix-icon-project
)");
}

TEST_F(ProjectScan, OtherPackagesAreNeverEntered) {
    makeProject("Library/Bundle.app/Inside.qnproject");
    makeProject("Library/Foo.QNPROJECT/Inside.qnproject");
    EXPECT_TRUE(scan(library)->childGroups().empty());
    EXPECT_THAT(inHome(files.listed), ElementsAre("home/Library"));
}

TEST_F(ProjectScan, NothingIsLookedForInsideAProjectButItsMovies) {
    makeProject("Library/Outer.qnproject/Inner.qnproject", {"i.mov"});
    makeProject("Library/Outer.qnproject", {"o.mov"});
    makeProject("Library/Outer.qnproject/Movies/Other.qnproject");
    EXPECT_THAT(namesOf(scan(library)->childGroups()), ElementsAre("Outer"));
    EXPECT_THAT(inHome(files.listed), ElementsAre("home/Library", "home/Library/Outer.qnproject/Movies"));
    EXPECT_THAT(inHome(files.opened), ElementsAre("home/Library/Outer.qnproject/Project"));
}

TEST_F(ProjectScan, HiddenEntriesAreSkipped) {
    makeProject("Library/.dot.qnproject");
    makeProject("Library/.qnproject");
    makeProject("Library/.folder/Inside.qnproject");
    makeProject("Library/secret.qnproject");
    makeProject("Library/closed/Inside.qnproject");
    makeProject("Library/Shown.qnproject");
    home().writeFile("Library/.hidden", "secret.qnproject\nclosed\n");
    EXPECT_THAT(namesOf(scan(library)->childGroups()), ElementsAre("Shown"));
    EXPECT_THAT(inHome(files.listed), ElementsAre("home/Library"));
}

TEST_F(ProjectScan, InvisibleCountsBeforeEverythingElse) {
    const std::string package = makeProject("Library/a.qnproject");
    const std::string folder = home().makeFolder("Library/b");
    files.flags[package] = platform::itemIsContainer | platform::itemIsPackage | platform::itemIsInvisible;
    files.flags[folder] = platform::itemIsContainer | platform::itemIsInvisible;
    EXPECT_TRUE(scan(library)->childGroups().empty());
}

TEST_F(ProjectScan, ThePackageFlagCountsBeforeTheContainerFlag) {
    const std::string bare = home().makeFolder("Library/a.qnproject");
    makeProject("Library/b/Inside.qnproject");
    makeProject("Library/c.qnproject/Inside.qnproject");
    files.flags[bare] = platform::itemIsPackage;
    files.flags[home().path("Library/b")] = platform::itemIsPackage | platform::itemIsContainer;
    files.flags[home().path("Library/c.qnproject")] = platform::itemIsContainer;
    EXPECT_EQ(text(scan(library)), R"(Folder home/Library "Library" <home> icon=folder
  Project home/Library/a.qnproject "a" <home/Library> icon=Reelix-icon-project
  Folder home/Library/c.qnproject "c.qnproject" <home/Library> icon=folder
    Project home/Library/c.qnproject/Inside.qnproject "Inside" <home/Library/c.qnproject> icon=Reelix-icon-project
)");
}

TEST_F(ProjectScan, EntriesWithoutNameAndThoseThatHaveGoneAreSkipped) {
    makeProject("Library/a.qnproject");
    files.listings[library] = {"", ".", "..", "gone.qnproject", "a.qnproject", "gone"};
    EXPECT_THAT(namesOf(scan(library)->childGroups()), ElementsAre("a"));
    EXPECT_THAT(inHome(files.listed), ElementsAre("home/Library"));
}

TEST_F(ProjectScan, LinksAreNotEntered) {
    makeProject("Elsewhere/Real.qnproject", {"m.mov"});
    home().makeLink("Library/Linked.qnproject", home().path("Elsewhere/Real.qnproject"));
    home().makeLink("Library/folder", home().path("Elsewhere"));
    home().makeLink("Library/circle", library);
    home().makeLink("Library/dangling.qnproject", "nowhere");
    EXPECT_TRUE(scan(library)->childGroups().empty());
    EXPECT_THAT(inHome(files.listed), ElementsAre("home/Library"));
}

TEST_F(ProjectScan, ALibraryThatIsALinkKeepsItsOwnPath) {
    makeProject("Library/Beach.qnproject", {"m.mov"});
    const std::string link = home().makeLink("Link", library);
    EXPECT_EQ(text(scan(link)), R"(Folder home/Link "Link" <home> icon=folder
  * home/Link/Beach.qnproject/Movies/m.mov "Beach"
  Project home/Link/Beach.qnproject "Beach" <home/Link> icon=Reelix-icon-project
    * home/Link/Beach.qnproject/Movies/m.mov "m"
)");
}

TEST_F(ProjectScan, SpecialFilesAreSkipped) {
    home().makeFifo("Library/Fifo.qnproject");
    home().makeFifo("Library/fifo");
    EXPECT_TRUE(scan(library)->childGroups().empty());
    EXPECT_THAT(files.opened, IsEmpty());
}

TEST_F(ProjectScan, NamesKeepTheirBytes) {
    const std::string odd = "\x01\n\t\x7f \xff\xfe \xc3\x28 %41%00 \xf0\x9f\x8e\xac";
    const std::string package = makeProject("Library/" + odd + ".qnproject", {odd + ".mov"});
    home().makeFolder("Library/" + odd);
    const Group folder = scan(library);
    ASSERT_EQ(folder->childGroups().size(), 2u);
    EXPECT_EQ(folder->childGroups()[0]->name(), odd);
    const Group project = folder->childGroups()[1];
    EXPECT_EQ(project->ID(), package);
    EXPECT_EQ(project->name(), odd);
    ASSERT_EQ(folder->mediaObjects().size(), 1u);
    const Object item = folder->mediaObjects().front();
    EXPECT_EQ(item->ID(), package + "/Movies/" + odd + ".mov");
    EXPECT_EQ(item->name(), odd);
    EXPECT_EQ(item->attributeForKey(vexo::VXReelixProjectPathKey), platform::Value(package));
}

TEST_F(ProjectScan, LongNamesAreKept) {
    const std::string longest = std::string(245, 'x');
    makeProject("Library/" + longest + ".qnproject");
    EXPECT_THAT(namesOf(scan(library)->childGroups()), ElementsAre(longest));
}

TEST_F(ProjectScan, TrailingSlashesOfTheFolderDoNotReachWhatIsInIt) {
    makeProject("Library/Beach.qnproject");
    const Group folder = scan(library + "/");
    EXPECT_EQ(folder->ID(), library + "/");
    EXPECT_EQ(folder->name(), "Library");
    EXPECT_EQ(folder->parentID(), home().path());
    EXPECT_EQ(folder->childGroups().front()->ID(), library + "/Beach.qnproject");
}

TEST_F(ProjectScan, FoldersNestDeeply) {
    constexpr int levels = 300;
    std::string deepest = "Library";
    for (int i = 0; i < levels; ++i)
        deepest += "/d";
    makeProject(deepest + "/Bottom.qnproject", {"m.mov"});

    Group group = scan(library);
    EXPECT_THAT(inHome(idsOf(group->mediaObjects())),
                ElementsAre("home/" + deepest + "/Bottom.qnproject/Movies/m.mov"));
    for (int i = 0; i < levels; ++i) {
        ASSERT_EQ(group->childGroups().size(), 1u);
        EXPECT_EQ(group->childGroups().front()->parentID(), group->ID());
        group = group->childGroups().front();
    }
    EXPECT_THAT(namesOf(group->childGroups()), ElementsAre("Bottom"));
}

TEST_F(ProjectScan, FoldersDeeperThanAPathCanNameAreEmptyOnes) {
    // Made level by level through relative paths, because no absolute path reaches the bottom.
    const auto before = std::filesystem::current_path();
    std::filesystem::current_path(library);
    const std::string name(100, 'n');
    for (int i = 0; i < 60; ++i) {
        ASSERT_EQ(mkdir(name.c_str(), 0700), 0);
        std::filesystem::current_path(name);
    }
    std::filesystem::current_path(before);

    int levels = 0;
    for (Group group = scan(library); !group->childGroups().empty(); group = group->childGroups().front())
        ++levels;
    EXPECT_GT(levels, 30);
    EXPECT_LT(levels, 60);
}

TEST_F(ProjectScan, ManyProjectsAreAllThere) {
    constexpr int count = 300;
    for (int i = 0; i < count; ++i)
        makeProject("Library/" + std::to_string(1000 + i) + ".qnproject", {"m.mov"});
    const Group folder = scan(library);
    EXPECT_EQ(folder->childGroups().size(), std::size_t{count});
    EXPECT_EQ(folder->mediaObjects().size(), std::size_t{count});
    EXPECT_EQ(folder->childGroups().back()->name(), std::to_string(1000 + count - 1));
}

TEST_F(ProjectScan, ACancelLeavesTheGroupsAndTakesTheItemsOfFolders) {
    makeProject("Library/a.qnproject", {"a.mov"});
    makeProject("Library/sub/b.qnproject", {"b.mov"});
    plugin().cancelAfter(0);
    EXPECT_EQ(text(scan(library)), R"(Folder home/Library "Library" <home> icon=folder
  Project home/Library/a.qnproject "a" <home/Library> icon=Reelix-icon-project
    * home/Library/a.qnproject/Movies/a.mov "a"
  Folder home/Library/sub "sub" <home/Library> icon=folder
    Project home/Library/sub/b.qnproject "b" <home/Library/sub> icon=Reelix-icon-project
      * home/Library/sub/b.qnproject/Movies/b.mov "b"
)");
}

// --- Volumes -----------------------------------------------------------------------------------------------

TEST_F(ProjectScan, AVolumeIsScannedUnderItsDisplayName) {
    environment.mounts.list = {{home().path("disk"), "/dev/x", "ext4", "My Disk", true}};
    makeProject("disk/Reelix Projects/Beach.qnproject", {"m.mov"});
    home().writeFile("disk/Reelix Projects/Beach.qnproject/Project", trailerDocument());
    EXPECT_EQ(text(scan("/Volumes/My Disk/Reelix Projects")),
              R"(Folder /Volumes/My Disk/Reelix Projects "Reelix Projects" </Volumes/My Disk> icon=folder
  * /Volumes/My Disk/Reelix Projects/Beach.qnproject/Movies/m.mov "Beach"
  Project /Volumes/My Disk/Reelix Projects/Beach.qnproject "Beach" </Volumes/My Disk/Reelix Projects> icon=Reelix-icon-trailer
    * /Volumes/My Disk/Reelix Projects/Beach.qnproject/Movies/m.mov "m"
)");
}

TEST_F(ProjectScan, AVolumeThatHasGoneIsEmpty) {
    EXPECT_EQ(text(scan("/Volumes/Gone/Reelix Projects")),
              "Folder /Volumes/Gone/Reelix Projects \"Reelix Projects\" </Volumes/Gone> icon=none\n");
}

TEST_F(ProjectScan, AVolumeThatGoesDuringTheScanLeavesWhatWasFound) {
    environment.mounts.list = {{home().path("disk"), "/dev/x", "ext4", "Disk", true}};
    makeProject("disk/Reelix Projects/a/Beach.qnproject", {"m.mov"});
    makeProject("disk/Reelix Projects/b/Rome.qnproject", {"m.mov"});
    files.beforeListing = [&](const std::string& folder) {
        if (folder.ends_with("/b"))
            environment.mounts.list.clear();
    };
    EXPECT_THAT(namesOf(scan("/Volumes/Disk/Reelix Projects")->childGroups()), ElementsAre("a", "b"));
}

}  // namespace
