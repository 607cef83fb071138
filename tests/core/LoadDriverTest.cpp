// Loading: what is watched, the root group with its branches and items, and what is said while there is
// nothing to show.
#include <atomic>
#include <fstream>
#include <sstream>
#include <thread>

#include "framework/HostServices.h"
#include "tests/core/SmallLibrary.h"

namespace reelix {
namespace {

using platform::Locked;
using testing::ElementsAre;
using testing::IsEmpty;
using testing_support::ExposedPlugin;
using testing_support::VirtualDispatcher;
using vexo::VXMediaGroupRef;
using vexo::VXMediaObjectRef;

constexpr std::string_view projectQuery =
    "(kMDItemKind = '*Reelix Project*'cd) && (kMDItemFSName = '*.qnproject'c)";
constexpr std::string_view eventQuery = "(kMDItemContentType = 'com.norvale.framecast-movie')";

// The path watcher of the environment, with a record of what was registered.
class RecordingWatcher final : public vexo::VXPathWatcher {
  public:
    struct Query {
        std::string query;
        vexo::VXPathObserverRef observer;
        vexo::VXPathListRef scope;
        std::vector<std::string> scopeThen;
        unsigned runMode;
    };

    explicit RecordingWatcher(vexo::VXPathWatcher& watcher) : watcher_(watcher) {}

    void watchPath(const std::string& path, const vexo::VXPathObserverRef& observer) override {
        calls.push_back("watch " + path);
        if (onWatch)
            onWatch();
        watcher_.watchPath(path, observer);
    }
    bool watchPathIsUnique(const std::string& path, const vexo::VXPathObserverRef& observer) override {
        return watcher_.watchPathIsUnique(path, observer);
    }
    void watchQuery(const std::string& query, const vexo::VXPathObserverRef& observer,
                    vexo::VXPathListRef queryScope, unsigned queryRunMode) override {
        calls.push_back("query " + query);
        queries.push_back({query, observer, queryScope, queryScope->snapshot(), queryRunMode});
        if (onQuery)
            onQuery();
        watcher_.watchQuery(query, observer, std::move(queryScope), queryRunMode);
    }

    std::vector<std::string> calls;
    std::vector<Query> queries;
    std::function<void()> onWatch;
    std::function<void()> onQuery;

  private:
    vexo::VXPathWatcher& watcher_;
};

class LoadDriverTest : public testing_support::SmallLibraryTest {
  protected:
    LoadDriverTest() { useRecordingWatcher(); }

    // A home set later brings the environment's own watcher back.
    void setHome(std::optional<std::string> homeDirectory) {
        watcherScope_.reset();
        environment.setHomeDirectory(std::move(homeDirectory));
        useRecordingWatcher();
    }
    std::string inHome(const std::string& relative) { return home().path(relative); }

    VXMediaGroupRef newGroup(const vexo::VXGroupTypeIdentifier& type, std::optional<std::string> ID) {
        return plugin().newMediaGroupWithTypeIdentifier(type, std::move(ID));
    }
    VXMediaObjectRef newItem(const std::string& path) {
        const auto item = plugin().newMediaObjectWithType(vexo::VXMediaTypeMovie, "an item", path);
        item->setPath(path);
        item->setSpotlightProperties(vexo::VXMediaObject::spotlightProperties(path));
        return item;
    }
    // A group of a type with one item of its own.
    VXMediaGroupRef newGroupWithItem(const vexo::VXGroupTypeIdentifier& type, const std::string& itemPath) {
        const auto group = newGroup(type, "group of " + itemPath);
        group->setName("named " + itemPath);
        group->setMediaObjects({newItem(itemPath)});
        return group;
    }
    static std::vector<VXMediaObjectRef> itemsOf(const VXMediaGroupRef& group) {
        const auto items = group->mediaObjects();
        return {items.begin(), items.end()};
    }

    // A project's package with a document from the samples.
    std::string makePackage(const std::string& name, const std::string& sample) {
        std::ifstream file(VEXO_SAMPLES_DIR "/archives/" + sample, std::ios::binary);
        std::stringstream content;
        content << file.rdbuf();
        EXPECT_FALSE(content.str().empty());
        home().writeFile("Movies/Reelix Projects/" + name + ".qnproject/Project", content.str());
        return inHome("Movies/Reelix Projects/" + name + ".qnproject");
    }

    std::optional<RecordingWatcher> watcher;

  private:
    void useRecordingWatcher() {
        const vexo::HostServices& services = vexo::hostServices();
        watcher.emplace(environment.watcher);
        watcherScope_.emplace(vexo::HostServices{*watcher, services.imageManager, services.metadata,
                                                 services.thumbnails, services.diagnostics});
    }

    std::optional<vexo::HostServicesScope> watcherScope_;
};

// --- loadData ----------------------------------------------------------------------------------------------

TEST_F(LoadDriverTest, TheFirstRequestWatchesThePreferencesAndTheDefaultProjectFolder) {
    const std::string preferences = home().writeFile(".config/vexo/com.vexo.suite.plist");
    plugin().loadData();
    EXPECT_THAT(watcher->calls,
                ElementsAre("watch " + preferences, "watch " + inHome("Movies/Reelix Projects")));
}

TEST_F(LoadDriverTest, PreferencesThatDoNotExistAreNotWatched) {
    plugin().loadData();
    EXPECT_THAT(watcher->calls, ElementsAre("watch " + inHome("Movies/Reelix Projects")));
}

TEST_F(LoadDriverTest, WithoutAHomeTheFirstRequestWatchesNothing) {
    setHome(std::nullopt);
    plugin().loadData();
    EXPECT_THAT(watcher->calls, IsEmpty());
}

TEST_F(LoadDriverTest, LaterRequestsWatchNothingMore) {
    plugin().loadData();
    home().writeFile(".config/vexo/com.vexo.suite.plist");
    watcher->calls.clear();
    plugin().loadData();
    EXPECT_THAT(watcher->calls, IsEmpty());
}

TEST_F(LoadDriverTest, TheHostsOwnPartOfARequestComesLast) {
    bool wasFirst = false;
    bool wasLoading = true;
    watcher->onWatch = [&] {
        wasFirst = plugin().firstTimeCallingLoadData();
        wasLoading = plugin().isLoading();
    };
    plugin().loadData();
    EXPECT_TRUE(wasFirst);
    EXPECT_FALSE(wasLoading);
    EXPECT_FALSE(plugin().firstTimeCallingLoadData());
    EXPECT_TRUE(plugin().isLoading());
}

TEST_F(LoadDriverTest, EveryRequestLoads) {
    for (int i = 0; i < 2; ++i) {
        plugin().loadData();
        const VXMediaGroupRef before = plugin().rootMediaGroup();
        environment.dispatcher.runDueBlocks();
        EXPECT_NE(plugin().rootMediaGroup(), before);
    }
}

TEST_F(LoadDriverTest, MountsAreHeardOfOnceHoweverManyRequestsThereWere) {
    plugin();
    environment.workspace.mount("/media/before");
    EXPECT_THAT(environment.dispatcher.requests(), IsEmpty());

    plugin().loadData();
    environment.dispatcher.runDueBlocks();
    plugin().loadData();
    environment.dispatcher.runDueBlocks();
    const std::size_t before = environment.dispatcher.requests().size();
    environment.workspace.mount("/media/disk");
    ASSERT_EQ(environment.dispatcher.requests().size(), before + 1);
    EXPECT_EQ(environment.dispatcher.requests().back().place, VirtualDispatcher::Place::ownThread);
}

// --- performLoadData ---------------------------------------------------------------------------------------

TEST_F(LoadDriverTest, TheRootGroupHasItsFields) {
    makeProject("Trip");
    const VXMediaGroupRef root = plugin().performLoadData();
    EXPECT_EQ(root->typeIdentifier(), vexo::VXReelixRootGroupTypeIdentifier);
    EXPECT_EQ(root->ID(), "VXReelix");
    EXPECT_EQ(root->name(), "Reelix");
    EXPECT_EQ(root->parentID(), std::nullopt);
    EXPECT_NE(root->icon(), nullptr);
    EXPECT_EQ(root->icon(), iconCache().smallApplicationIcon.get());
    EXPECT_FALSE(root->dynamicMediaObjects());
    EXPECT_EQ(root->path(), std::nullopt);
    EXPECT_THAT(*root->attributes(), IsEmpty());
}

TEST_F(LoadDriverTest, TheRootGroupIsLeftToTheHostToInstall) {
    EXPECT_NE(plugin().performLoadData(), nullptr);
    EXPECT_EQ(plugin().rootMediaGroup(), nullptr);
}

TEST_F(LoadDriverTest, TheRootGroupIsMadeAfreshByEveryLoad) {
    EXPECT_NE(load(), load());
}

TEST_F(LoadDriverTest, AWholeLibraryIsOneTree) {
    makeProject("Trip");
    makeEvent("Beach", 2008);
    makeEvent("Zoo", 2009);
    load();
    EXPECT_EQ(tree(), R"(Root VXReelix "Reelix" <none> icon=MBReelixAppIconSmall
  * home/Movies/Reelix Projects/Trip.qnproject/Movies/Trip.mov "Trip"
  * home/Movies/Reelix Events/Zoo/clip-2009-07-01 12;00;00.mov "Jul 1, 2009, 12:00:00"
  * home/Movies/Reelix Events/Beach/clip-2008-07-01 12;00;00.mov "Jul 1, 2008, 12:00:00"
  Project home/Movies/Reelix Projects/Trip.qnproject "Trip" <home/Movies/Reelix Projects> icon=Reelix-icon-project
    * home/Movies/Reelix Projects/Trip.qnproject/Movies/Trip.mov "Trip"
  EventLibrary Event Library "Event Library" <VXReelix> icon=Reelix-icon-event
    EventCalendar 2009 "2009" <VXReelix> icon=Reelix-icon-calendar year=2009
      Event home/Movies/Reelix Events/Zoo "Zoo" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2009
        * home/Movies/Reelix Events/Zoo/clip-2009-07-01 12;00;00.mov "Jul 1, 2009, 12:00:00"
    EventCalendar 2008 "2008" <VXReelix> icon=Reelix-icon-calendar year=2008
      Event home/Movies/Reelix Events/Beach "Beach" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2008
        * home/Movies/Reelix Events/Beach/clip-2008-07-01 12;00;00.mov "Jul 1, 2008, 12:00:00"
)");
}

TEST_F(LoadDriverTest, AnEmptyHomeIsARootWithoutChildrenAndWithAnEmptyListOfItems) {
    const VXMediaGroupRef root = load();
    EXPECT_EQ(tree(), "Root VXReelix \"Reelix\" <none> icon=MBReelixAppIconSmall\n");
    ASSERT_TRUE(root->ownMediaObjects().has_value());
    EXPECT_TRUE(root->ownMediaObjects()->empty());
}

TEST_F(LoadDriverTest, WithoutEventFoldersTheRootHasItsProjectsOnly) {
    const std::string movie = makeProject("Trip");
    const VXMediaGroupRef root = load();
    ASSERT_EQ(root->childGroups().size(), 1u);
    EXPECT_EQ(root->childGroups()[0]->typeIdentifier(), vexo::VXReelixProjectGroupTypeIdentifier);
    ASSERT_EQ(root->mediaObjects().size(), 1u);
    EXPECT_EQ(root->mediaObjects()[0]->ID(), movie);
}

TEST_F(LoadDriverTest, WithoutProjectsTheRootHasItsEventLibraryOnly) {
    const std::string clip = makeEvent("Beach", 2008);
    const VXMediaGroupRef root = load();
    ASSERT_EQ(root->childGroups().size(), 1u);
    EXPECT_EQ(root->childGroups()[0]->typeIdentifier(), vexo::VXReelixEventLibraryGroupTypeIdentifier);
    EXPECT_EQ(root->childGroups()[0]->parentID(), "VXReelix");
    ASSERT_EQ(root->mediaObjects().size(), 1u);
    EXPECT_EQ(root->mediaObjects()[0]->ID(), clip);
}

TEST_F(LoadDriverTest, TheEventLibraryComesAfterTheProjects) {
    makeEvent("Beach", 2008);
    makeProject("Zoo");
    const VXMediaGroupRef root = load();
    ASSERT_EQ(root->childGroups().size(), 2u);
    EXPECT_EQ(root->childGroups()[0]->name(), "Zoo");
    EXPECT_EQ(root->childGroups()[1]->typeIdentifier(), vexo::VXReelixEventLibraryGroupTypeIdentifier);
}

TEST_F(LoadDriverTest, ALoadWhoseCancelIsPendingStillAnswersARoot) {
    makeProject("Trip");
    makeEvent("Beach", 2008);
    plugin().cancelAfter(0);
    const VXMediaGroupRef root = plugin().performLoadData();
    ASSERT_NE(root, nullptr);
    EXPECT_TRUE(root->childGroups().empty());
}

TEST_F(LoadDriverTest, AWholeLoadExcludesReadersOfTheLists) {
    makeProject("Trip");
    makeEvent("Beach", 2008);
    ExposedPlugin& reelix = plugin();
    std::atomic<bool> hasRead = false;
    std::size_t groups = 0;
    std::thread reader;
    watcher->onQuery = [&] {
        if (reader.joinable())
            return;
        reader = std::thread([&] {
            groups = reelix.mediaGroups().size();
            hasRead = true;
        });
        EXPECT_FALSE(testing_support::happensSoon([&] { return hasRead.load(); }));
    };
    reelix.performLoadData();
    reader.join();
    EXPECT_EQ(groups, 4u);  // the event, the project and the two empty libraries of the start-up volume
}

TEST_F(LoadDriverTest, TheSearchPathsAreMadeByTheFirstLoadAndKept) {
    load();
    const auto before = plugin().libraryLocations();
    const vexo::VXPathListRef events = watcher->queries.back().scope;
    environment.workspace.setVolumes({"/", "/media/disk"});
    home().makeFolder("Movies/Reelix Projects");
    load();
    const auto after = plugin().libraryLocations();
    EXPECT_EQ(after[0].paths, before[0].paths);
    EXPECT_EQ(after[1].paths, before[1].paths);
    EXPECT_EQ(watcher->queries.back().scope, events);
}

TEST_F(LoadDriverTest, ListsOfFoldersThatAreThereAreNotMadeAgain) {
    const std::string folder = home().makeFolder("other");
    home().writeFile("other/Beach/clip-2008-07-01 12;00;00.mov");
    ExposedPlugin& reelix = plugin();
    {
        Locked monitor(reelix._monitor);
        reelix._ReelixSearchPaths = std::make_unique<std::vector<std::string>>();
        reelix._ReelixEventsSearchPaths = std::make_shared<vexo::VXPathList>(std::vector{folder});
    }
    const VXMediaGroupRef root = load();
    ASSERT_EQ(root->mediaObjects().size(), 1u);
    EXPECT_EQ(root->mediaObjects()[0]->ID(), folder + "/Beach/clip-2008-07-01 12;00;00.mov");
}

TEST_F(LoadDriverTest, TheLocationsAreThoseOfTheListsAndNoneBeforeTheFirstLoad) {
    EXPECT_THAT(plugin().libraryLocations(), IsEmpty());
    load();
    const auto locations = plugin().libraryLocations();
    ASSERT_EQ(locations.size(), 2u);
    EXPECT_EQ(locations[0].kind, "projects");
    EXPECT_THAT(locations[0].paths, ElementsAre(inHome("Movies/Reelix Projects.localized"),
                                                "/Reelix Projects", "/Reelix Projects.localized"));
    EXPECT_EQ(locations[1].kind, "events");
    EXPECT_THAT(locations[1].paths,
                ElementsAre(inHome("Movies/Reelix Events"), inHome("Movies/Reelix Events.localized"),
                            "/Reelix Events", "/Reelix Events.localized"));
}

// --- Queries -----------------------------------------------------------------------------------------------

// The event libraries come first, because a second thread lists them while the projects are scanned.
TEST_F(LoadDriverTest, TheQueriesAreRegisteredBeforeTheLibrariesAreScannedAndWatched) {
    load();
    EXPECT_THAT(
        watcher->calls,
        ElementsAre("query " + std::string(projectQuery), "query " + std::string(eventQuery),
                    "watch " + inHome("Movies/Reelix Events"),
                    "watch " + inHome("Movies/Reelix Events.localized"), "watch /Reelix Events",
                    "watch /Reelix Events.localized", "watch " + inHome("Movies/Reelix Projects.localized"),
                    "watch /Reelix Projects", "watch /Reelix Projects.localized"));
}

TEST_F(LoadDriverTest, TheProjectQuerySearchesTheTwoDefaultFoldersOnly) {
    environment.workspace.setVolumes({"/", "/media/disk"});
    load();
    const RecordingWatcher::Query& query = watcher->queries.at(0);
    EXPECT_EQ(query.query, projectQuery);
    EXPECT_EQ(query.observer.get(), &plugin());
    EXPECT_EQ(query.runMode, 4u);
    EXPECT_THAT(query.scopeThen,
                ElementsAre(inHome("Movies/Reelix Projects"), inHome("Movies/Reelix Projects.localized")));
}

TEST_F(LoadDriverTest, WithoutAHomeTheProjectQuerySearchesNothing) {
    setHome(std::nullopt);
    load();
    EXPECT_THAT(watcher->queries.at(0).scopeThen, IsEmpty());
}

TEST_F(LoadDriverTest, TheScopeOfTheProjectQueryEndsAtTheFirstMissingPath) {
    plugin()._ReelixDefaultPath2();
    dropPlugin();
    setHome(std::nullopt);
    ASSERT_TRUE(plugin()._ReelixDefaultPath2().has_value());  // known from the object before
    load();
    EXPECT_THAT(watcher->queries.at(0).scopeThen, IsEmpty());
}

TEST_F(LoadDriverTest, TheEventQuerySharesTheListOfEventFolders) {
    load();
    const RecordingWatcher::Query& query = watcher->queries.at(1);
    EXPECT_EQ(query.query, eventQuery);
    EXPECT_EQ(query.observer.get(), &plugin());
    EXPECT_EQ(query.runMode, 4u);
    ExposedPlugin& reelix = plugin();
    Locked monitor(reelix._monitor);
    EXPECT_EQ(query.scope, reelix._ReelixEventsSearchPaths);
    reelix._ReelixEventsSearchPaths->append("/Volumes/Disk/Reelix Events");
    EXPECT_TRUE(query.scope->contains("/Volumes/Disk/Reelix Events"));
}

TEST_F(LoadDriverTest, QueriesOfRepeatedLoadsAreOneRegistrationEach) {
    for (int i = 0; i < 3; ++i)
        load();
    EXPECT_EQ(watcher->queries.size(), 6u);
    const auto registered = environment.watcher.queries();
    ASSERT_EQ(registered.size(), 2u);
    EXPECT_EQ(registered[0].query, projectQuery);
    EXPECT_EQ(registered[1].query, eventQuery);
}

// --- Items of the root group -------------------------------------------------------------------------------

TEST_F(LoadDriverTest, AProjectGivesTheRootItsRepresentative) {
    const auto project = newGroupWithItem(vexo::VXReelixProjectGroupTypeIdentifier, inHome("a.mov"));
    environment.metadata.setMovie(inHome("a.mov"), {1280, 720});
    const auto root = newGroup(vexo::VXReelixRootGroupTypeIdentifier, "VXReelix");
    root->addChildGroup(project);
    plugin()._setMediaObjectsForRootMediaGroup(root);
    const auto items = itemsOf(root);
    ASSERT_EQ(items.size(), 1u);
    EXPECT_NE(items[0], project->mediaObjects()[0]);
    EXPECT_EQ(items[0]->name(), project->name());
    EXPECT_EQ(items[0]->attributeForKey(vexo::VXReelixProjectRepresentative), platform::Value(true));
}

TEST_F(LoadDriverTest, AProjectWithoutAMovieGivesTheRootNothing) {
    const auto root = newGroup(vexo::VXReelixRootGroupTypeIdentifier, "VXReelix");
    root->addChildGroup(newGroup(vexo::VXReelixProjectGroupTypeIdentifier, inHome("Empty.qnproject")));
    plugin()._setMediaObjectsForRootMediaGroup(root);
    EXPECT_THAT(itemsOf(root), IsEmpty());
}

TEST_F(LoadDriverTest, AProjectLibraryGivesTheRootNothing) {
    const auto root = newGroup(vexo::VXReelixRootGroupTypeIdentifier, "VXReelix");
    root->addChildGroup(newGroupWithItem(vexo::VXReelixProjectLibraryGroupTypeIdentifier, "/a.mov"));
    plugin()._setMediaObjectsForRootMediaGroup(root);
    EXPECT_THAT(itemsOf(root), IsEmpty());
}

TEST_F(LoadDriverTest, GroupsOfEveryOtherTypeGiveTheRootAllTheirItemsInOrder) {
    const auto root = newGroup(vexo::VXReelixRootGroupTypeIdentifier, "VXReelix");
    std::vector<VXMediaObjectRef> expected;
    for (const auto* type :
         {&vexo::VXReelixFolderGroupTypeIdentifier, &vexo::VXReelixEventLibraryGroupTypeIdentifier,
          &vexo::VXReelixOldReelixProjectsGroupTypeIdentifier,
          &vexo::VXReelixEventCalendarGroupTypeIdentifier, &vexo::VXReelixEventGroupTypeIdentifier,
          &vexo::VXReelixRootGroupTypeIdentifier}) {
        const auto child = newGroup(*type, type->text());
        for (const char* name : {"/b.mov", "/a.mov"}) {
            expected.push_back(newItem(type->text() + std::string(name)));
            child->setMediaObjects(child->mediaObjects().appending(expected.back()));
        }
        root->addChildGroup(child);
    }
    plugin()._setMediaObjectsForRootMediaGroup(root);
    EXPECT_EQ(itemsOf(root), expected);
}

TEST_F(LoadDriverTest, TypesAreToldApartByIdentityAndNotByText) {
    static const vexo::VXGroupTypeIdentifier copy{vexo::VXReelixProjectLibraryGroupTypeIdentifier.text()};
    const auto root = newGroup(vexo::VXReelixRootGroupTypeIdentifier, "VXReelix");
    root->addChildGroup(newGroupWithItem(copy, "/a.mov"));
    plugin()._setMediaObjectsForRootMediaGroup(root);
    EXPECT_EQ(itemsOf(root).size(), 1u);
}

TEST_F(LoadDriverTest, ItemsOfTheRootGoByTheOrderOfItsChildren) {
    environment.metadata.setMovie("/project.mov", {1280, 720});
    const auto root = newGroup(vexo::VXReelixRootGroupTypeIdentifier, "VXReelix");
    root->addChildGroup(newGroupWithItem(vexo::VXReelixFolderGroupTypeIdentifier, "/folder.mov"));
    root->addChildGroup(newGroupWithItem(vexo::VXReelixProjectGroupTypeIdentifier, "/project.mov"));
    root->addChildGroup(newGroupWithItem(vexo::VXReelixEventLibraryGroupTypeIdentifier, "/clip.mov"));
    plugin()._setMediaObjectsForRootMediaGroup(root);
    std::vector<std::string> IDs;
    for (const auto& item : itemsOf(root))
        IDs.push_back(item->ID());
    EXPECT_THAT(IDs, ElementsAre("/folder.mov", "/project.mov", "/clip.mov"));
}

TEST_F(LoadDriverTest, ANewListReplacesTheOldOneEvenWhenItIsEmpty) {
    const auto root = newGroup(vexo::VXReelixRootGroupTypeIdentifier, "VXReelix");
    root->setMediaObjects({newItem("/old.mov")});
    plugin()._setMediaObjectsForRootMediaGroup(root);
    ASSERT_TRUE(root->ownMediaObjects().has_value());
    EXPECT_THAT(itemsOf(root), IsEmpty());
}

TEST_F(LoadDriverTest, NoRootIsNoMatter) {
    plugin()._setMediaObjectsForRootMediaGroup(nullptr);
}

// --- The application ---------------------------------------------------------------------------------------

TEST_F(LoadDriverTest, AnApplicationThatTheDesktopDoesNotKnowIsNotInstalled) {
    EXPECT_FALSE(plugin().canLoadData());
    EXPECT_FALSE(plugin().appInstalled());
}

TEST_F(LoadDriverTest, AnInstalledApplicationLetsDataLoad) {
    installApplication(home().writeFile("reelix"));
    EXPECT_TRUE(plugin().canLoadData());
    EXPECT_TRUE(plugin().appInstalled());
}

TEST_F(LoadDriverTest, ARemovedApplicationIsStillInstalledButLoadsNoData) {
    installApplication(home().writeFile("reelix"));
    home().remove("reelix");
    EXPECT_FALSE(plugin().canLoadData());
    EXPECT_TRUE(plugin().appInstalled());
}

TEST_F(LoadDriverTest, AnApplicationWithoutAPathIsInstalledButLoadsNoData) {
    installApplication(std::nullopt);
    EXPECT_FALSE(plugin().canLoadData());
    EXPECT_TRUE(plugin().appInstalled());
}

TEST_F(LoadDriverTest, AnApplicationOfAnotherCreatorDoesNotCount) {
    environment.workspace.setApplicationForCreator(
        "hook", {"com.norvale.ReelixApp", platform::URL::fileURLWithPath(home().path()), "reelix"});
    EXPECT_FALSE(plugin().canLoadData());
    EXPECT_FALSE(plugin().appInstalled());
}

// --- Messages ----------------------------------------------------------------------------------------------

TEST_F(LoadDriverTest, WhileLoadingThereIsAMessage) {
    EXPECT_EQ(plugin().defaultLoadingMessage(), std::nullopt);
    plugin().loadData();
    EXPECT_EQ(plugin().defaultLoadingMessage(), "Loading…");
    environment.dispatcher.runDueBlocks();
    EXPECT_EQ(plugin().defaultLoadingMessage(), std::nullopt);
}

TEST_F(LoadDriverTest, MessagesThatTheBundleLacksAreNil) {
    environment.bundle->replacedStrings["VXPluginDefaultLoadingStringKey"] = std::nullopt;
    environment.bundle->replacedStrings["VXPluginDefaultNoDataStringKey"] = std::nullopt;
    EXPECT_EQ(plugin().defaultNoDataMessage(load()), std::nullopt);
    plugin().loadData();
    EXPECT_EQ(plugin().defaultLoadingMessage(), std::nullopt);
}

TEST_F(LoadDriverTest, AnEmptyRootSaysThatNothingWasFound) {
    EXPECT_EQ(plugin().defaultNoDataMessage(load()), "No Reelix projects or events were found.");
}

TEST_F(LoadDriverTest, ARootWithChildrenHasNoMessage) {
    makeProject("Trip");
    EXPECT_EQ(plugin().defaultNoDataMessage(load()), std::nullopt);
}

TEST_F(LoadDriverTest, AnEmptyRootThatIsNotTheCurrentOneHasNoMessage) {
    load();
    EXPECT_EQ(plugin().defaultNoDataMessage(plugin().performLoadData()), std::nullopt);
}

TEST_F(LoadDriverTest, NoGroupHasNoMessage) {
    EXPECT_EQ(plugin().defaultNoDataMessage(nullptr), std::nullopt);
    load();
    EXPECT_EQ(plugin().defaultNoDataMessage(nullptr), std::nullopt);
}

TEST_F(LoadDriverTest, ATrailerSaysThatItWasNeverRendered) {
    const auto trailer =
        newGroup(vexo::VXReelixProjectGroupTypeIdentifier, makePackage("Trailer", "with-trailer.plist"));
    EXPECT_EQ(plugin().defaultNoDataMessage(trailer),
              "This trailer has no movie to play yet. Open it in Reelix and share it to render the movie.");
}

TEST_F(LoadDriverTest, AProjectThatIsNoTrailerSaysThatItWasNeverRendered) {
    const std::string text =
        "This project has no movie to play yet. Open it in Reelix and share it to render the movie.";
    const auto project =
        newGroup(vexo::VXReelixProjectGroupTypeIdentifier, makePackage("Film", "without-trailer.plist"));
    EXPECT_EQ(plugin().defaultNoDataMessage(project), text);
    const auto missing = newGroup(vexo::VXReelixProjectGroupTypeIdentifier, inHome("Missing.qnproject"));
    EXPECT_EQ(plugin().defaultNoDataMessage(missing), text);
}

TEST_F(LoadDriverTest, AProjectHasAMessageWhetherItHasMoviesOrNot) {
    const auto project = newGroupWithItem(vexo::VXReelixProjectGroupTypeIdentifier, "/a.mov");
    EXPECT_TRUE(plugin().defaultNoDataMessage(project).has_value());
}

TEST_F(LoadDriverTest, GroupsOfEveryOtherTypeHaveNoMessage) {
    load();
    for (const auto* type :
         {&vexo::VXReelixProjectLibraryGroupTypeIdentifier, &vexo::VXReelixFolderGroupTypeIdentifier,
          &vexo::VXReelixOldReelixProjectsGroupTypeIdentifier, &vexo::VXReelixEventLibraryGroupTypeIdentifier,
          &vexo::VXReelixEventCalendarGroupTypeIdentifier, &vexo::VXReelixEventGroupTypeIdentifier,
          &vexo::VXReelixRootGroupTypeIdentifier})
        EXPECT_EQ(plugin().defaultNoDataMessage(newGroup(*type, "VXReelix")), std::nullopt) << type->text();
}

}  // namespace
}  // namespace reelix
