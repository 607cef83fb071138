#include "host/VXMediaManager.h"
#include "tests/projects/ProjectsTest.h"

using namespace testing_support;
using testing::ElementsAre;
using testing::IsEmpty;
using vexo::VXMediaObjectList;

namespace {

// --- Finding the movies of a project -----------------------------------------------------------------------

class RenderedMovies : public ProjectsTest {
  protected:
    const std::string package = home().makeFolder("A.qnproject");

    Strings movies() { return inHome(plugin()._renderedMoviesPathsForProjectPath(package)); }
};

TEST_F(RenderedMovies, AreTheFilesOfThreeExtensionsInListingOrder) {
    makeProject("A.qnproject",
                {"b.mov", "a.m4v", "c.3gp", "d.mp4", "e.avi", "mov", "f.mov.txt", "g.txt.mov"});
    files.listings[package + "/Movies"] = {"g.txt.mov", "f.mov.txt", "mov",   "e.avi",
                                           "d.mp4",     "c.3gp",     "a.m4v", "b.mov"};
    EXPECT_THAT(movies(), ElementsAre("home/A.qnproject/Movies/g.txt.mov", "home/A.qnproject/Movies/c.3gp",
                                      "home/A.qnproject/Movies/a.m4v", "home/A.qnproject/Movies/b.mov"));
}

TEST_F(RenderedMovies, ExtensionsAreComparedWithTheirCase) {
    makeProject("A.qnproject", {"a.MOV", "b.Mov", "c.M4V", "d.3GP", "e.mov "});
    EXPECT_THAT(movies(), IsEmpty());
    const Group project = scan(home().path())->childGroups().front();
    EXPECT_EQ(plugin()._representingMediaObjectForProject(project), nullptr);
}

TEST_F(RenderedMovies, HiddenFilesCountAndNamesOfNothingButAnExtensionDoNot) {
    makeProject("A.qnproject", {"._clip.mov", ".mov", "a.", "..mov"});
    home().writeFile("A.qnproject/Movies/.hidden", "._clip.mov\n");
    EXPECT_THAT(movies(), ElementsAre("home/A.qnproject/Movies/..mov", "home/A.qnproject/Movies/._clip.mov"));
}

TEST_F(RenderedMovies, FoldersBelowAreNotSearched) {
    makeProject("A.qnproject", {"Old/a.mov"});
    home().writeFile("A.qnproject/b.mov");
    EXPECT_THAT(movies(), IsEmpty());
}

TEST_F(RenderedMovies, ThereAreNoneWithoutTheirFolder) {
    EXPECT_THAT(movies(), IsEmpty());
    EXPECT_THAT(files.listed, IsEmpty());
    home().makeFolder("A.qnproject/Movies");
    EXPECT_THAT(movies(), IsEmpty());
    EXPECT_THAT(plugin()._renderedMoviesPathsForProjectPath(home().path("missing")), IsEmpty());
}

TEST_F(RenderedMovies, TheFolderMayBeALinkAndMustBeAFolder) {
    home().writeFile("elsewhere/m.mov");
    home().makeLink("A.qnproject/Movies", home().path("elsewhere"));
    EXPECT_THAT(movies(), ElementsAre("home/A.qnproject/Movies/m.mov"));

    home().writeFile("B.qnproject/Movies");
    EXPECT_THAT(plugin()._renderedMoviesPathsForProjectPath(home().path("B.qnproject")), IsEmpty());
    home().makeLink("C.qnproject/Movies", "nowhere");
    EXPECT_THAT(plugin()._renderedMoviesPathsForProjectPath(home().path("C.qnproject")), IsEmpty());
    home().makeFifo("D.qnproject/Movies");
    EXPECT_THAT(plugin()._renderedMoviesPathsForProjectPath(home().path("D.qnproject")), IsEmpty());
}

TEST_F(RenderedMovies, ThePreviewFileIsTheFirstOfThem) {
    EXPECT_EQ(plugin()._previewFileForProjectPath(package), std::nullopt);
    home().makeFolder("A.qnproject/Movies");
    EXPECT_EQ(plugin()._previewFileForProjectPath(package), std::nullopt);
    makeProject("A.qnproject", {"a.avi", "b.mov", "c.3gp"});
    EXPECT_EQ(plugin()._previewFileForProjectPath(package), package + "/Movies/b.mov");
    files.listings[package + "/Movies"] = {"a.avi", "c.3gp", "b.mov"};
    EXPECT_EQ(plugin()._previewFileForProjectPath(package), package + "/Movies/c.3gp");
    files.listings[package + "/Movies"] = {"a.avi", "a.MOV"};
    EXPECT_EQ(plugin()._previewFileForProjectPath(package), std::nullopt);
}

// --- Duration ----------------------------------------------------------------------------------------------

class ProjectDuration : public ProjectsTest {
  protected:
    std::optional<platform::Value> durationAfterwards(const Object& object) {
        plugin()._durationOfReelixProjectAtPath(object);
        const platform::Dictionary attributes = object->attributes();
        const platform::Value* duration = platform::find(attributes, vexo::VXMediaObjectDurationKey);
        return duration ? std::optional(*duration) : std::nullopt;
    }
};

TEST_F(ProjectDuration, IsTheSecondsThatTheMovieStates) {
    environment.metadata.setMovie("/m.mov", {1, 1}, 12.5);
    EXPECT_EQ(durationAfterwards(movieObject("/m.mov")), platform::Value(12.5));
}

TEST_F(ProjectDuration, IsAlwaysAFloatingPointNumber) {
    environment.metadata.set("/m.mov", {{std::string(vexo::kMDItemDurationSeconds), 3}});
    EXPECT_EQ(durationAfterwards(movieObject("/m.mov")), platform::Value(3.0));
}

TEST_F(ProjectDuration, ReplacesTheOneBefore) {
    environment.metadata.setMovie("/m.mov", {1, 1}, 12.5);
    const Object object = movieObject("/m.mov");
    object->setAttribute(1.0, vexo::VXMediaObjectDurationKey);
    EXPECT_EQ(durationAfterwards(object), platform::Value(12.5));
}

TEST_F(ProjectDuration, IsNotSetWithoutAPathOrAMovie) {
    EXPECT_EQ(durationAfterwards(movieObject("/unknown.mov")), std::nullopt);
    EXPECT_EQ(durationAfterwards(plugin().newMediaObjectWithType(3, "name", "ID")), std::nullopt);
    environment.metadata.set("/odd.mov",
                             {{std::string(vexo::kMDItemDurationSeconds), platform::Array{"no number"}}});
    EXPECT_EQ(durationAfterwards(movieObject("/odd.mov")), std::nullopt);
}

// --- The best movie ----------------------------------------------------------------------------------------

class BestMovie : public ProjectsTest {
  protected:
    Object sized(const std::string& name, double width, double height) {
        return movieObject(home().path(name), platform::Size{width, height});
    }
    Object file(const std::string& name, std::size_t bytes) {
        return movieObject(home().writeFile(name, std::string(bytes, 'x')));
    }
    Object byDimensions(const VXMediaObjectList& list) {
        return plugin()._highestQualityClipByDimensions(list);
    }
    Object byFileSize(const VXMediaObjectList& list) { return plugin()._highestQualityClipByFileSize(list); }
};

TEST_F(BestMovie, OfNothingIsNothing) {
    EXPECT_EQ(byDimensions({}), nullptr);
    EXPECT_EQ(byFileSize({}), nullptr);
    EXPECT_EQ(plugin()._highestQualityClip({}), nullptr);
}

TEST_F(BestMovie, OfOneIsTheOne) {
    const Object only = sized("a", 0, 0);
    EXPECT_EQ(byDimensions({only}), only);
    const Object emptyFile = file("b", 0);
    EXPECT_EQ(byFileSize({emptyFile}), emptyFile);
}

TEST_F(BestMovie, IsTheWidest) {
    const Object small = sized("a", 1280, 720);
    const Object large = sized("b", 1920, 1080);
    EXPECT_EQ(byDimensions({small, large}), large);
    EXPECT_EQ(byDimensions({large, small}), large);
    EXPECT_EQ(plugin()._highestQualityClip({small, large}), large);
}

TEST_F(BestMovie, OfEqualWidthIsTheFirstWhateverTheHeights) {
    const Object low = sized("a", 1280, 720);
    const Object high = sized("b", 1280, 960);
    EXPECT_EQ(byDimensions({low, high}), low);
    EXPECT_EQ(byDimensions({high, low}), high);
}

TEST_F(BestMovie, WiderByAFractionWinsAndHigherNeverDoes) {
    const Object high = sized("a", 100, 1000);
    const Object wide = sized("b", 100.5, 1);
    EXPECT_EQ(byDimensions({high, wide}), wide);
}

TEST_F(BestMovie, OneMovieWithoutASizeAnywhereDisqualifiesWidths) {
    const Object small = sized("a", 1280, 720);
    const Object large = sized("b", 1920, 1080);
    const Object unsized = movieObject(home().path("c"));
    EXPECT_EQ(byDimensions({unsized, small, large}), nullptr);
    EXPECT_EQ(byDimensions({small, unsized, large}), nullptr);
    EXPECT_EQ(byDimensions({small, large, unsized}), nullptr);
}

TEST_F(BestMovie, IsTheLargestFileWhenOneLacksASize) {
    const Object large = file("a", 300);
    const Object wide = file("b", 200);
    const Object unsized = file("c", 100);
    large->setAttribute(platform::Size{10, 10}, vexo::VXMediaObjectResolutionKey);
    wide->setAttribute(platform::Size{20, 20}, vexo::VXMediaObjectResolutionKey);
    EXPECT_EQ(plugin()._highestQualityClip({unsized, wide, large}), large);
    EXPECT_EQ(plugin()._highestQualityClip({wide, large}), wide);
}

TEST_F(BestMovie, TakesItsSizeFromTheFileMetadata) {
    const Object small = plugin().newMediaObjectWithType(3, "a", "/a");
    const Object large = plugin().newMediaObjectWithType(3, "b", "/b");
    environment.metadata.setMovie("/a", {640, 480});
    environment.metadata.setMovie("/b", {1920, 1080});
    small->setSpotlightProperties(vexo::VXMediaObject::spotlightProperties("/a"));
    large->setSpotlightProperties(vexo::VXMediaObject::spotlightProperties("/b"));
    EXPECT_EQ(byDimensions({small, large}), large);
}

TEST_F(BestMovie, OfEqualFileSizeIsTheFirst) {
    const Object first = file("a", 100);
    const Object second = file("b", 100);
    const Object smaller = file("c", 99);
    EXPECT_EQ(byFileSize({smaller, first, second}), first);
    EXPECT_EQ(byFileSize({second, first, smaller}), second);
}

TEST_F(BestMovie, FilesWhoseSizeCannotBeReadAreNoCandidates) {
    const Object missing = movieObject(home().path("missing.mov"));
    const Object pathless = plugin().newMediaObjectWithType(3, "name", "ID");
    const Object folder = movieObject(home().makeFolder("folder.mov"));
    const Object small = file("a", 1);
    EXPECT_EQ(byFileSize({missing, pathless, folder, small}), small);
    EXPECT_EQ(byFileSize({small, missing, pathless, folder}), small);
    EXPECT_EQ(byFileSize({missing, pathless, folder}), nullptr);
    EXPECT_EQ(plugin()._highestQualityClip({missing, pathless}), nullptr);
}

TEST_F(BestMovie, ByWidthIsTheOneFoundBeforeACancel) {
    const VXMediaObjectList list{sized("a", 1, 1), sized("b", 2, 1), sized("c", 3, 1)};
    const std::vector<Object> best{nullptr, list[0], list[1], list[2], list[2]};
    for (int questions = 0; questions < 5; ++questions) {
        plugin().cancelAfter(questions);
        EXPECT_EQ(byDimensions(list), best[static_cast<std::size_t>(questions)]) << questions;
    }
}

TEST_F(BestMovie, ByWidthIsNothingWhenAMovieWithoutASizeWasSeenBeforeACancel) {
    const VXMediaObjectList list{sized("a", 1, 1), movieObject("/b"), sized("c", 3, 1)};
    const std::vector<Object> best{nullptr, list[0], nullptr, nullptr};
    for (int questions = 0; questions < 4; ++questions) {
        plugin().cancelAfter(questions);
        EXPECT_EQ(byDimensions(list), best[static_cast<std::size_t>(questions)]) << questions;
    }
}

TEST_F(BestMovie, ByFileSizeIsTheOneFoundBeforeACancel) {
    const VXMediaObjectList list{file("a", 1), file("b", 2), file("c", 3)};
    const std::vector<Object> best{nullptr, list[0], list[1], list[2], list[2]};
    for (int questions = 0; questions < 5; ++questions) {
        plugin().cancelAfter(questions);
        EXPECT_EQ(byFileSize(list), best[static_cast<std::size_t>(questions)]) << questions;
    }
}

// --- Representatives ---------------------------------------------------------------------------------------

class Representative : public ProjectsTest {
  protected:
    const std::string package = makeProject("Library/Beach.qnproject", {"small.mov", "tall.mov"});
    const std::string small = package + "/Movies/small.mov";
    const std::string tall = package + "/Movies/tall.mov";

    Representative() { environment.metadata.setMovie(tall, {1920, 1080.5}); }
    Group project() { return scan(home().path("Library"))->childGroups().front(); }
};

TEST_F(Representative, IsAnItemOfItsOwnForTheBestMovie) {
    const Group beach = project();
    const Object item = plugin()._representingMediaObjectForProject(beach);
    ASSERT_TRUE(item);
    EXPECT_NE(item, beach->mediaObjects()[1]);
    EXPECT_EQ(item->mediaType(), 3);
    EXPECT_EQ(item->mediaSourceType(), 2);
    EXPECT_EQ(item->ID(), tall);
    EXPECT_EQ(item->path(), tall);
    EXPECT_EQ(item->name(), "Beach");
    EXPECT_EQ(item->spotlightProperties()->valueForKey(vexo::kMDItemPixelHeight), platform::Value(1080.5));
    const platform::Dictionary attributes{{"VXReelixProjectPathKey", package},
                                          {"VXMediaObjectResolutionKey", platform::Size{1920, 1080.5}},
                                          {"VXMediaObjectResolutionStringKey", "{1920, 1080.5}"},
                                          {"VXReelixProjectFormatVersion", "7"},
                                          {"VXReelixProjectRepresentative", true}};
    EXPECT_EQ(platform::Value(item->attributes()), platform::Value(attributes));
}

TEST_F(Representative, HasTheThumbnailOfTheBestMovieAsItsIcon) {
    const Group beach = project();
    const Object best = beach->mediaObjects()[1];
    ASSERT_NE(best->thumbnailImage(), nullptr);
    EXPECT_EQ(plugin()._representingMediaObjectForProject(beach)->icon(), best->thumbnailImage());

    const auto thumbnail = plugin().iconNamed(reelix::MBReelixIcon);
    best->setThumbnailImage(thumbnail);
    EXPECT_EQ(plugin()._representingMediaObjectForProject(beach)->icon(), thumbnail);
}

TEST_F(Representative, HasNoResolutionWhereTheMovieHasNone) {
    environment.metadata.set(small, {});
    environment.metadata.set(tall, {});
    home().writeFile("Library/Beach.qnproject/Movies/tall.mov", "the larger file");
    const Object item = plugin()._representingMediaObjectForProject(project());
    EXPECT_EQ(item->ID(), tall);
    const platform::Dictionary attributes{{"VXReelixProjectPathKey", package},
                                          {"VXReelixProjectFormatVersion", "7"},
                                          {"VXReelixProjectRepresentative", true}};
    EXPECT_EQ(platform::Value(item->attributes()), platform::Value(attributes));
}

TEST_F(Representative, LeavesTheRenderedMoviesAsTheyWere) {
    const Group beach = project();
    plugin()._representingMediaObjectForProject(beach);
    for (const Object& movie : beach->mediaObjects()) {
        EXPECT_EQ(movie->attributes().count("VXReelixProjectRepresentative"), 0u);
        EXPECT_NE(movie->name(), "Beach");
        EXPECT_EQ(movie->icon(), reelix::iconCache().smallApplicationIcon.get());
    }
}

TEST_F(Representative, IsNoneForAProjectWithoutMovies) {
    makeProject("Library/A.qnproject");
    home().makeFolder("Library/B.qnproject/Movies/folder.mov");
    const auto projects = scan(home().path("Library"))->childGroups();
    EXPECT_EQ(plugin()._representingMediaObjectForProject(projects[0]), nullptr);
    EXPECT_EQ(plugin()._representingMediaObjectForProject(projects[1]), nullptr);
}

TEST_F(Representative, OnceRegisteredIsFoundAgainAndOnlyRenamed) {
    const Group beach = project();
    const Object item = plugin()._representingMediaObjectForProject(beach);
    const Group root = newGroup(vexo::VXReelixRootGroupTypeIdentifier, "root");
    root->setMediaObjects({item});
    plugin().setRootMediaGroup(root);
    const platform::Value before(item->attributes());

    beach->setName("Seaside");
    environment.metadata.setMovie(tall, {3840, 2160});
    EXPECT_EQ(plugin()._representingMediaObjectForProject(beach), item);
    EXPECT_EQ(item->name(), "Seaside");
    EXPECT_EQ(platform::Value(item->attributes()), before);
}

TEST_F(Representative, AnyItemRegisteredForTheMovieBecomesTheRepresentative) {
    const Object stranger = plugin().newMediaObjectWithType(3, "stranger", tall);
    const Group root = newGroup(vexo::VXReelixRootGroupTypeIdentifier, "root");
    root->setMediaObjects({stranger});
    plugin().setRootMediaGroup(root);
    EXPECT_EQ(plugin()._representingMediaObjectForProject(project()), stranger);
    EXPECT_EQ(stranger->name(), "Beach");
    const platform::Dictionary attributes{{"VXReelixProjectRepresentative", true}};
    EXPECT_EQ(platform::Value(stranger->attributes()), platform::Value(attributes));
}

TEST_F(Representative, OfTheFirstLoadIsThatOfTheSecondWhileMoviesKeepTheirNames) {
    makeProject("Movies/Reelix Projects/Beach.qnproject", {"m.mov"});
    makeProject("Movies/Reelix Projects/Trips/Rome.qnproject", {"r.mov"});
    const Group first = load();
    const auto items = first->mediaObjects();
    ASSERT_EQ(items.size(), 2u);
    const std::string tree = text(first);

    const Group second = load();
    EXPECT_NE(first, second);
    ASSERT_EQ(second->mediaObjects().size(), 2u);
    EXPECT_EQ(second->mediaObjects()[0], items[0]);
    EXPECT_EQ(second->mediaObjects()[1], items[1]);
    EXPECT_EQ(text(second), tree);
    EXPECT_EQ(tree, R"(Root VXReelix "Reelix" <none> icon=MBReelixAppIconSmall
  * home/Movies/Reelix Projects/Beach.qnproject/Movies/m.mov "Beach"
  * home/Movies/Reelix Projects/Trips/Rome.qnproject/Movies/r.mov "Rome"
  Project home/Movies/Reelix Projects/Beach.qnproject "Beach" <home/Movies/Reelix Projects> icon=Reelix-icon-project
    * home/Movies/Reelix Projects/Beach.qnproject/Movies/m.mov "m"
  Folder home/Movies/Reelix Projects/Trips "Trips" <home/Movies/Reelix Projects> icon=folder
    * home/Movies/Reelix Projects/Trips/Rome.qnproject/Movies/r.mov "Rome"
    Project home/Movies/Reelix Projects/Trips/Rome.qnproject "Rome" <home/Movies/Reelix Projects/Trips> icon=Reelix-icon-project
      * home/Movies/Reelix Projects/Trips/Rome.qnproject/Movies/r.mov "r"
)");
}

// --- The items of folders ----------------------------------------------------------------------------------

class FolderItems : public ProjectsTest {
  protected:
    Group folderOf(const std::vector<Group>& children) {
        const Group folder = newGroup(vexo::VXReelixFolderGroupTypeIdentifier, "folder");
        for (const Group& child : children)
            folder->addChildGroup(child);
        return folder;
    }
    Group projectOf(const std::string& name) {
        const Group project = newGroup(vexo::VXReelixProjectGroupTypeIdentifier, name);
        project->setMediaObjects({movieObject("/" + name, platform::Size{1, 1})});
        return project;
    }
    Group groupWithItems(const vexo::VXGroupTypeIdentifier& type, const Strings& ids) {
        const Group group = newGroup(type, "group");
        VXMediaObjectList items;
        for (const std::string& id : ids)
            items = items.appending(movieObject(id, platform::Size{1, 1}));
        group->setMediaObjects(items);
        return group;
    }
    Strings itemsOf(const Group& folder) {
        plugin()._createReelixProjectsFolderMediaObjects(folder);
        return idsOf(folder->mediaObjects());
    }
};

TEST_F(FolderItems, AreRepresentativesAndTheItemsOfFoldersInOrder) {
    const Group folder =
        folderOf({projectOf("b"), groupWithItems(vexo::VXReelixFolderGroupTypeIdentifier, {"/x", "/y"}),
                  projectOf("a")});
    EXPECT_THAT(itemsOf(folder), ElementsAre("/b", "/x", "/y", "/a"));
    EXPECT_NE(folder->mediaObjects()[0], folder->childGroups()[0]->mediaObjects()[0]);
    EXPECT_EQ(folder->mediaObjects()[1], folder->childGroups()[1]->mediaObjects()[0]);
}

TEST_F(FolderItems, AreNoneOfAProjectLibrary) {
    EXPECT_THAT(itemsOf(folderOf({groupWithItems(vexo::VXReelixProjectLibraryGroupTypeIdentifier, {"/x"})})),
                IsEmpty());
}

TEST_F(FolderItems, AreTheRepresentativeOfAChildOfAnyOtherType) {
    EXPECT_THAT(itemsOf(folderOf({groupWithItems(vexo::VXReelixEventGroupTypeIdentifier, {"/x", "/y"})})),
                ElementsAre("/x"));
}

TEST_F(FolderItems, LeaveOutProjectsWithoutAUsableMovie) {
    EXPECT_THAT(
        itemsOf(folderOf({groupWithItems(vexo::VXReelixProjectGroupTypeIdentifier, {}), projectOf("a"),
                          newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "never given any")})),
        ElementsAre("/a"));
}

TEST_F(FolderItems, OfAnEmptyFolderAreNone) {
    const Group folder = folderOf({});
    EXPECT_THAT(itemsOf(folder), IsEmpty());
    EXPECT_TRUE(folder->ownMediaObjects());
}

TEST_F(FolderItems, HoldWhatIsAnywhereBelow) {
    makeProject("Library/a/b/Deep.qnproject", {"d.mov", "e.mov"});
    makeProject("Library/a/Middle.qnproject", {"m.mov"});
    makeProject("Library/Top.qnproject", {"t.mov"});
    const Group library = scan(home().path("Library"));
    EXPECT_THAT(
        inHome(idsOf(library->mediaObjects())),
        ElementsAre("home/Library/Top.qnproject/Movies/t.mov", "home/Library/a/Middle.qnproject/Movies/m.mov",
                    "home/Library/a/b/Deep.qnproject/Movies/d.mov"));
}

TEST_F(FolderItems, EndAtACancelBeforeAnyElement) {
    const Group folder = folderOf({groupWithItems(vexo::VXReelixFolderGroupTypeIdentifier, {"/1", "/2"}),
                                   groupWithItems(vexo::VXReelixFolderGroupTypeIdentifier, {}),
                                   groupWithItems(vexo::VXReelixFolderGroupTypeIdentifier, {"/3"})});
    // A question for each child and for each item of a child.
    const std::vector<Strings> found{
        {}, {}, {"/1"}, {"/1", "/2"}, {"/1", "/2"}, {"/1", "/2"}, {"/1", "/2", "/3"}};
    for (std::size_t questions = 0; questions < found.size(); ++questions) {
        plugin().cancelAfter(static_cast<int>(questions));
        EXPECT_EQ(itemsOf(folder), found[questions]) << questions;
    }
}

TEST_F(FolderItems, EndAtACancelBeforeAProject) {
    const Group folder = folderOf({projectOf("a"), projectOf("b")});
    // Two questions a project: one for the child, one for its only movie.
    const std::vector<Strings> found{{}, {}, {"/a"}, {"/a"}, {"/a", "/b"}};
    for (std::size_t questions = 0; questions < found.size(); ++questions) {
        plugin().cancelAfter(static_cast<int>(questions));
        EXPECT_EQ(itemsOf(folder), found[questions]) << questions;
    }
}

}  // namespace
