#include <atomic>
#include <thread>

#include "platform/PropertyList.h"
#include "tests/projects/ProjectsTest.h"
#include "tests/support/Program.h"

using namespace testing_support;
using platform::Array;
using platform::Dictionary;
using platform::Value;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;

namespace {

constexpr const char* projectsType = "VXReelixProjectsPboardType";

class ProjectPasteboard : public ProjectsTest {
  protected:
    // --- Groups and items made by hand ---------------------------------------------------------------------

    Object movie(const std::string& path) { return movieObject(path); }
    Object movieWithoutPath(const std::string& name) {
        return plugin().newMediaObjectWithType(vexo::VXMediaTypeMovie, name, name);
    }
    Object itemOfProject(const std::string& projectPath) {
        const Object item = movie(projectPath + "/Movies/m.mov");
        item->setAttribute(projectPath, vexo::VXReelixProjectPathKey);
        return item;
    }
    Group project(const std::string& path, const std::vector<Object>& movies) {
        return groupOfType(vexo::VXReelixProjectGroupTypeIdentifier, path, movies);
    }
    Group folder(const std::string& path, const std::vector<Group>& children = {}) {
        const Group group = groupOfType(vexo::VXReelixFolderGroupTypeIdentifier, path, {});
        group->setChildGroups(vexo::VXMediaGroupList(children));
        return group;
    }
    Group groupOfType(const vexo::VXGroupTypeIdentifier& type, const std::string& path,
                      const std::vector<Object>& mediaObjects) {
        const Group group = plugin().newMediaGroupWithTypeIdentifier(type, path);
        group->setPath(path);
        group->setMediaObjects(vexo::VXMediaObjectList(mediaObjects));
        return group;
    }
    Group install(const std::vector<Group>& children) {
        const Group root = newGroup(vexo::VXReelixRootGroupTypeIdentifier, "root");
        root->setChildGroups(vexo::VXMediaGroupList(children));
        plugin().setRootMediaGroup(root);
        return root;
    }
    // A project of that name in the default library, with movies in the order of their names.
    std::string makeLibraryProject(const std::string& name, const Strings& movies) {
        return makeProject("Movies/Reelix Projects/" + name + ".qnproject", movies);
    }

    // --- What was written ----------------------------------------------------------------------------------

    bool writeGroups(const std::vector<Group>& groups) {
        return plugin().writeMediaGroups(groups, pasteboard);
    }
    bool writeObjects(const std::vector<Object>& objects) {
        return plugin().writeMediaObjects(objects, pasteboard);
    }
    std::string uriList() const {
        const auto value = pasteboard.valueForType("text/uri-list");
        return value ? *value->string() : "nothing";
    }
    std::string uriListOf(const Strings& paths) const {
        std::string list;
        for (const std::string& path : paths)
            list += platform::URL::fileURLWithPath(path).absoluteString() + "\r\n";
        return list;
    }
    std::optional<Value> propertyList() const { return pasteboard.valueForType(projectsType); }
    // The projects written, in order.
    Array projectList() const {
        const auto value = propertyList();
        const Value* list = value ? platform::find(*value->dictionary(), "ProjectList") : nullptr;
        return list ? *list->array() : Array();
    }
    Strings projectPaths() const {
        Strings paths;
        for (const Value& entry : projectList())
            paths.push_back(*platform::find(*entry.dictionary(), "ProjectPath")->string());
        return paths;
    }
    static Array versionsOf(const Value& projectEntry) {
        return *platform::find(*projectEntry.dictionary(), "RenderedVersions")->array();
    }
    static Strings moviesOf(const Value& projectEntry) {
        Strings paths;
        for (const Value& version : versionsOf(projectEntry))
            paths.push_back(*platform::find(*version.dictionary(), "Path")->string());
        return paths;
    }
    // The only version of the only project.
    Dictionary onlyVersion() const { return *versionsOf(projectList().at(0)).at(0).dictionary(); }

    platform::Pasteboard pasteboard;
};

using SupportedPasteboardTypes = ProjectPasteboard;
using WritingGroups = ProjectPasteboard;
using WritingItems = ProjectPasteboard;
using ProjectsForPaths = ProjectPasteboard;
using RenderedVersion = ProjectPasteboard;
using ProjectEntry = ProjectPasteboard;

TEST_F(SupportedPasteboardTypes, AreAListOfOneListOfOneType) {
    EXPECT_EQ(Value(plugin().supportedPasteboardTypes()),
              Value(Array{Value(Array{"VXReelixProjectsPboardType"})}));
}

// --- Groups ------------------------------------------------------------------------------------------------

TEST_F(WritingGroups, OtherProgramsGetAProjectsFirstMovieAndReceiversOfProjectsAll) {
    const std::string package = makeLibraryProject("Film", {"a.mov", "b.mov", "c.mov"});
    environment.metadata.setMovie(package + "/Movies/b.mov", {1920, 1080});  // the best is not the first
    const Group film = load()->childGroups()[0];

    EXPECT_TRUE(writeGroups({film}));
    EXPECT_EQ(uriList(), uriListOf({package + "/Movies/a.mov"}));
    ASSERT_EQ(projectList().size(), 1u);
    EXPECT_THAT(moviesOf(projectList()[0]),
                ElementsAre(package + "/Movies/a.mov", package + "/Movies/b.mov", package + "/Movies/c.mov"));
}

TEST_F(WritingGroups, LeavesTheGroupsThemselvesAsTheyAre) {
    const Group film = project(home().makeFolder("Film.qnproject"), {movie("/a.mov"), movie("/b.mov")});
    writeGroups({film});
    EXPECT_EQ(film->mediaObjects().size(), 2u);
}

TEST_F(WritingGroups, AProjectOfOneMovieIsWrittenAsThat) {
    const std::string package = home().makeFolder("Film.qnproject");
    EXPECT_TRUE(writeGroups({project(package, {movie("/a.mov")})}));
    EXPECT_EQ(uriList(), uriListOf({"/a.mov"}));
    EXPECT_THAT(moviesOf(projectList().at(0)), ElementsAre("/a.mov"));
}

TEST_F(WritingGroups, AProjectWithoutMoviesLeavesAnEmptyPropertyList) {
    const std::string package = makeLibraryProject("Film", {});
    EXPECT_TRUE(writeGroups({load()->childGroups()[0]}));
    EXPECT_EQ(uriList(), uriListOf({package}));
    EXPECT_EQ(propertyList(), Value(Dictionary{}));
}

TEST_F(WritingGroups, AProjectIsWrittenEvenWhereTheHostHasNothingToWrite) {
    EXPECT_TRUE(writeGroups({newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "without a path")}));
    EXPECT_THAT(pasteboard.types(), ElementsAre(projectsType));
    EXPECT_EQ(propertyList(), Value(Dictionary{}));
}

TEST_F(WritingGroups, KeepsTheirOrderAndTakesOnlyProjectsForProjects) {
    const Group first = project(home().makeFolder("First.qnproject"), {movie("/1.mov"), movie("/2.mov")});
    const Group second = project(home().makeFolder("Second.qnproject"), {movie("/3.mov")});
    const Group event = groupOfType(vexo::VXReelixEventGroupTypeIdentifier, "/event", {movie("/clip.mov")});
    EXPECT_TRUE(writeGroups({second, folder("/folder"), first, event}));
    EXPECT_EQ(uriList(), uriListOf({"/3.mov", "/folder", "/1.mov", "/event"}));
    EXPECT_THAT(projectPaths(), ElementsAre(home().path("Second.qnproject"), home().path("First.qnproject")));
}

TEST_F(WritingGroups, AProjectGivenTwiceIsWrittenTwice) {
    const Group film = project("/Film.qnproject", {movie("/a.mov")});
    EXPECT_TRUE(writeGroups({film, film}));
    EXPECT_THAT(projectPaths(), ElementsAre("/Film.qnproject", "/Film.qnproject"));
}

TEST_F(WritingGroups, WithoutAProjectIsTheHostsAlone) {
    const auto library =
        groupOfType(vexo::VXReelixProjectLibraryGroupTypeIdentifier, "/library", {movie("/a")});
    EXPECT_TRUE(writeGroups({library, folder("/folder")}));
    EXPECT_EQ(uriList(), uriListOf({"/library", "/folder"}));
    EXPECT_FALSE(propertyList());
}

TEST_F(WritingGroups, WithoutAProjectAndWithoutAPathIsNothing) {
    EXPECT_FALSE(writeGroups({newGroup(vexo::VXReelixEventCalendarGroupTypeIdentifier, "2008")}));
    EXPECT_FALSE(writeGroups({}));
    EXPECT_THAT(pasteboard.types(), IsEmpty());
}

TEST_F(WritingGroups, ATypeThatOnlyReadsLikeThatOfProjectsIsNotTheirs) {
    static const vexo::VXGroupTypeIdentifier lookalike(vexo::VXReelixProjectGroupTypeIdentifier.text());
    const Group film = groupOfType(lookalike, home().makeFolder("F.qnproject"), {movie("/a"), movie("/b")});
    EXPECT_TRUE(writeGroups({film}));
    EXPECT_EQ(uriList(), uriListOf({"/a", "/b"}));
    EXPECT_FALSE(propertyList());
}

TEST_F(WritingGroups, TheTypeOfProjectsFollowsThoseOfTheHost) {
    writeGroups({project("/Film.qnproject", {movie("/a.mov")})});
    EXPECT_THAT(pasteboard.types(),
                ElementsAre("text/uri-list", "x-special/gnome-copied-files", "text/plain", projectsType));
}

// --- Items -------------------------------------------------------------------------------------------------

TEST_F(WritingItems, ARenderedMovieBringsItsWholeProject) {
    const std::string package = makeLibraryProject("Film", {"a.mov", "b.mov"});
    const Object rendered = load()->childGroups()[0]->mediaObjects()[1];
    EXPECT_TRUE(writeObjects({rendered}));
    EXPECT_EQ(uriList(), uriListOf({package + "/Movies/b.mov"}));
    ASSERT_THAT(projectPaths(), ElementsAre(package));
    EXPECT_THAT(moviesOf(projectList()[0]),
                ElementsAre(package + "/Movies/a.mov", package + "/Movies/b.mov"));
}

TEST_F(WritingItems, ARepresentativeAndARenderedMovieBringTheirProjectTwice) {
    const std::string package = makeLibraryProject("Film", {"a.mov", "b.mov"});
    const Group root = load();
    EXPECT_TRUE(writeObjects({root->mediaObjects()[0], root->childGroups()[0]->mediaObjects()[1]}));
    EXPECT_THAT(projectPaths(), ElementsAre(package, package));
    EXPECT_EQ(projectList()[0], projectList()[1]);
}

TEST_F(WritingItems, ProjectsComeInTheOrderOfTheTreeEachAsOftenAsItsItems) {
    install({project("/A", {movie("/a")}), project("/B", {movie("/b")}), project("/C", {movie("/c")})});
    EXPECT_TRUE(writeObjects({itemOfProject("/C"), itemOfProject("/A"), itemOfProject("/C"),
                              itemOfProject("/A"), itemOfProject("/C")}));
    EXPECT_THAT(projectPaths(), ElementsAre("/A", "/A", "/C", "/C", "/C"));
}

TEST_F(WritingItems, WithoutAProjectAreTheHostsAlone) {
    install({project("/A", {movie("/a")})});
    EXPECT_TRUE(writeObjects({movie("/clip.mov")}));
    EXPECT_EQ(uriList(), uriListOf({"/clip.mov"}));
    EXPECT_FALSE(propertyList());
}

TEST_F(WritingItems, WithoutAProjectAndWithoutAPathAreNothing) {
    EXPECT_FALSE(writeObjects({movieWithoutPath("a")}));
    EXPECT_FALSE(writeObjects({}));
    EXPECT_THAT(pasteboard.types(), IsEmpty());
}

TEST_F(WritingItems, OneOfAProjectIsEnough) {
    install({project("/A", {movie("/a")})});
    EXPECT_TRUE(writeObjects({movie("/clip.mov"), itemOfProject("/A"), movie("/other.mov")}));
    EXPECT_EQ(uriList(), uriListOf({"/clip.mov", "/A/Movies/m.mov", "/other.mov"}));
    EXPECT_THAT(projectPaths(), ElementsAre("/A"));
}

TEST_F(WritingItems, OfAProjectAreWrittenEvenWhereTheHostHasNothingToWrite) {
    install({project("/A", {movie("/a")})});
    const Object item = movieWithoutPath("a");
    item->setAttribute("/A", vexo::VXReelixProjectPathKey);
    EXPECT_TRUE(writeObjects({item}));
    EXPECT_THAT(pasteboard.types(), ElementsAre(projectsType));
    EXPECT_THAT(projectPaths(), ElementsAre("/A"));
}

// A clip names its event where an item of a project names that.
TEST_F(WritingItems, AnEventClipLeavesAnEmptyPropertyList) {
    const std::string clip =
        home().writeFile("Movies/Reelix Events/Trip/clip-2008-07-01 12;00;00.mov", "clip");
    makeLibraryProject("Film", {"a.mov"});
    load();
    const Object item = plugin().mediaObjectForID(clip);
    ASSERT_TRUE(item);
    ASSERT_EQ(item->attributeForKey(vexo::VXReelixProjectPathKey),
              Value(home().path("Movies/Reelix Events/Trip")));
    EXPECT_TRUE(writeObjects({item}));
    EXPECT_EQ(uriList(), uriListOf({clip}));
    EXPECT_EQ(propertyList(), Value(Dictionary{}));
}

TEST_F(WritingItems, WhoseProjectIsNoLongerInTheTreeLeaveAnEmptyPropertyList) {
    install({project("/B", {movie("/b")})});
    EXPECT_TRUE(writeObjects({itemOfProject("/A")}));
    EXPECT_EQ(propertyList(), Value(Dictionary{}));
}

TEST_F(WritingItems, BeforeThereIsATreeLeaveAnEmptyPropertyList) {
    EXPECT_TRUE(writeObjects({itemOfProject("/A")}));
    EXPECT_EQ(propertyList(), Value(Dictionary{}));
}

// --- Finding projects --------------------------------------------------------------------------------------

TEST_F(ProjectsForPaths, AreFoundDepthFirstAParentBeforeItsChildren) {
    // A whole library has the type of a project too.
    const Group library = project("/Library", {movie("/x")});
    const Group inner = project("/Library/Inner", {movie("/y")});
    library->setChildGroups({folder("/Library/Folder", {inner})});
    const Group last = project("/Last", {movie("/z")});
    install({library, last});
    EXPECT_THAT(plugin().projectGroupsForPaths({"/Last", "/Library/Inner", "/Library"}),
                ElementsAre(library, inner, last));
}

TEST_F(ProjectsForPaths, AreRepeatedAsOftenAsTheirPath) {
    const Group a = project("/A", {});
    const Group b = project("/B", {});
    install({a, b});
    EXPECT_THAT(plugin().projectGroupsForPaths({"/B", "/A", "/B", "/B"}), ElementsAre(a, b, b, b));
}

TEST_F(ProjectsForPaths, AreEachFoundWhereSeveralHaveOnePath) {
    const Group first = project("/A", {});
    const Group second = project("/A", {});
    install({first, folder("/F", {second})});
    EXPECT_THAT(plugin().projectGroupsForPaths({"/A"}), ElementsAre(first, second));
}

TEST_F(ProjectsForPaths, AreProjectsOfExactlyThatPathAlone) {
    install({folder("/A"), project("/A/", {}), project("/a", {}),
             newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "/A")});
    EXPECT_THAT(plugin().projectGroupsForPaths({"/A", ""}), IsEmpty());
}

TEST_F(ProjectsForPaths, AreNoneForNoPath) {
    install({project("/A", {})});
    EXPECT_THAT(plugin().projectGroupsForPaths({}), IsEmpty());
}

TEST_F(ProjectsForPaths, FollowWhatWasFoundBefore) {
    const Group before = project("/B", {});
    const Group a = project("/A", {});
    std::vector<Group> results{before};
    plugin().projectGroupsForPaths({"/A"}, a, results);
    EXPECT_THAT(results, ElementsAre(before, a));
}

// --- Entries -----------------------------------------------------------------------------------------------

TEST_F(ProjectEntry, HoldsPathNameAndVersions) {
    const Group film = project("/Film.qnproject", {movie("/a.mov")});
    film->setName("Film");
    EXPECT_EQ(
        Value(plugin().dictionaryWithProjects({film})),
        Value(Dictionary{{"ProjectList",
                          Array{Dictionary{{"ProjectName", "Film"},
                                           {"ProjectPath", "/Film.qnproject"},
                                           {"RenderedVersions",
                                            Array{Dictionary{{"Name", "/a.mov"}, {"Path", "/a.mov"}}}}}}}}));
}

TEST_F(ProjectEntry, OfAGroupWithoutANameHasNone) {
    writeGroups({project("/Film.qnproject", {movie("/a.mov")})});
    EXPECT_EQ(platform::find(*projectList().at(0).dictionary(), "ProjectName"), nullptr);
}

TEST_F(ProjectEntry, IsMissingWithoutAPath) {
    const Group film = newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "Film");
    film->setMediaObjects({movie("/a.mov")});
    EXPECT_EQ(plugin().dictionaryWithProjects({film}), Dictionary());
}

TEST_F(ProjectEntry, IsMissingWithoutAVersion) {
    EXPECT_EQ(plugin().dictionaryWithProjects({project("/A", {}), project("/B", {movieWithoutPath("b")})}),
              Dictionary());
}

TEST_F(ProjectEntry, IsMissingWhileOthersStay) {
    writeGroups({project("/A", {}), project("/B", {movie("/b")}), project("/C", {movieWithoutPath("c")}),
                 project("/D", {movie("/d")})});
    EXPECT_THAT(projectPaths(), ElementsAre("/B", "/D"));
}

TEST_F(ProjectEntry, LeavesOutMoviesWithoutAPathAndKeepsTheOrderOfTheOthers) {
    writeGroups({project("/A", {movie("/z"), movieWithoutPath("x"), movie("/a"), movie("/z")})});
    EXPECT_THAT(moviesOf(projectList().at(0)), ElementsAre("/z", "/a", "/z"));
}

TEST_F(ProjectEntry, OnAVolumeHasTheRealPathsOfItsMovies) {
    environment.mounts.list = {{home().path("disk"), "/dev/x", "ext4", "My Disk", false}};
    writeGroups({project("/Volumes/My Disk/A.qnproject", {movie("/Volumes/My Disk/A.qnproject/Movies/a.mov"),
                                                          movie("/Volumes/Gone/b.mov")})});
    EXPECT_THAT(projectPaths(), ElementsAre("/Volumes/My Disk/A.qnproject"));
    EXPECT_THAT(moviesOf(projectList().at(0)), ElementsAre(home().path("disk/A.qnproject/Movies/a.mov")));
}

TEST_F(RenderedVersion, WithoutSizeAndLengthHasNeither) {
    writeGroups({project("/A", {movie("/a.mov")})});
    EXPECT_EQ(onlyVersion(), (Dictionary{{"Name", "/a.mov"}, {"Path", "/a.mov"}}));
}

TEST_F(RenderedVersion, HasItsSizeAsText) {
    writeGroups({project("/A", {movieObject("/a.mov", platform::Size{1920, 1080.5})})});
    EXPECT_EQ(onlyVersion(),
              (Dictionary{{"Dimensions", "{1920, 1080.5}"}, {"Name", "/a.mov"}, {"Path", "/a.mov"}}));
}

TEST_F(RenderedVersion, HasItsLengthAsTheNumberThatItIs) {
    for (const Value& duration : {Value(12), Value(12.0), Value(0.5)}) {
        const Object item = movie("/a.mov");
        item->setAttribute(duration, vexo::VXMediaObjectDurationKey);
        writeGroups({project("/A", {item})});
        EXPECT_EQ(onlyVersion(),
                  (Dictionary{{"Duration", duration}, {"Name", "/a.mov"}, {"Path", "/a.mov"}}));
    }
}

TEST_F(RenderedVersion, HasSizeAndLengthFromTheFile) {
    const std::string package = makeLibraryProject("Film", {"a.mov"});
    environment.metadata.setMovie(package + "/Movies/a.mov", {640, 360}, 2.5);
    writeGroups({load()->childGroups()[0]});
    const Dictionary version = onlyVersion();
    EXPECT_EQ(version.at("Dimensions"), Value("{640, 360}"));
    EXPECT_EQ(version.at("Duration"), Value(2.5));
}

// --- Other readers -----------------------------------------------------------------------------------------

TEST_F(ProjectPasteboard, PythonFindsEveryFileWhateverItIsCalled) {
    const Strings names{"plain",     "a b",       "100%41",          "#1?",   "line\nbreak", "]]>&lt;",
                        "\xFF\xC3(", "bell\x07!", "gr\u00FC\u00DFe", "\uFFFE"};
    Strings movies;
    for (const std::string& name : names)
        movies.push_back(name + ".mov");
    for (const std::string& name : names)
        makeLibraryProject(name, movies);
    const vexo::VXMediaGroupList projects = load()->childGroups();
    ASSERT_TRUE(writeGroups({projects.begin(), projects.end()}));

    const auto bytes = platform::dataWithPropertyList(*propertyList(), platform::PropertyListFormat::xml);
    const std::string file =
        home().writeFile("list.plist", {reinterpret_cast<const char*>(bytes.data()), bytes.size()});
    const Outcome outcome = runProgram(
        "python3", {"-c",
                    "import os, plistlib, sys\n"
                    "found = 0\n"
                    "for project in plistlib.load(open(sys.argv[1], 'rb'))['ProjectList']:\n"
                    "    assert os.path.isdir(project['ProjectPath']), project\n"
                    "    for version in project['RenderedVersions']:\n"
                    "        with open(version['Path'], 'rb') as movie: assert movie.read() == b'movie'\n"
                    "        assert version['Dimensions'] == '{1280, 720}'\n"
                    "        assert type(version['Duration']) is float and version['Duration'] == 10\n"
                    "        found += 1\n"
                    "print(found)\n",
                    file});
    EXPECT_EQ(outcome.output, "100\n") << outcome.errors;
}

// --- Threads -----------------------------------------------------------------------------------------------

TEST_F(ProjectPasteboard, IsWrittenWhileReloadsReplaceTheTree) {
    const std::string package = makeLibraryProject("Film", {"a.mov", "b.mov"});
    const Group root = load();
    const Object item = root->childGroups()[0]->mediaObjects()[0];
    std::atomic<bool> isDone = false;
    std::thread reloads([&] {
        while (!isDone)
            plugin()._reloadReelixProjects();
    });
    for (int turn = 0; turn < 50; ++turn) {
        platform::Pasteboard drag;
        const vexo::VXMediaGroupList children = root->childGroups();
        const std::vector<Group> groups(children.begin(), children.end());
        EXPECT_TRUE(plugin().writeMediaObjects({item}, drag));
        EXPECT_TRUE(plugin().writeMediaGroups(groups, drag));
    }
    isDone = true;
    reloads.join();
    EXPECT_TRUE(writeObjects({item}));
    EXPECT_THAT(projectPaths(), ElementsAre(package));
}

}  // namespace
