// Which folders are event libraries, the branch that a reload builds of them, and putting it into the tree.
#include "framework/HostServices.h"
#include "tests/events/EventsTest.h"

namespace testing_support {
namespace {

using reelix::iconCache;
using testing::ElementsAre;
using testing::IsEmpty;
using vexo::VXMediaGroupList;
using vexo::VXMediaGroupRef;

class EventReloadTest : public EventsTest {
  protected:
    std::vector<std::string> searchPaths() {
        platform::Locked monitor(plugin()._monitor);
        plugin()._prepareReelixEventsSearchPaths();
        std::vector<std::string> paths = plugin()._ReelixEventsSearchPaths->snapshot();
        for (std::string& path : paths) {
            if (path.starts_with(home().path()))
                path = "home" + path.substr(home().path().size());
        }
        return paths;
    }
    auto searchPathList() {
        ExposedPlugin& scanned = plugin();
        platform::Locked monitor(scanned._monitor);
        return scanned._ReelixEventsSearchPaths;
    }
    void searchOnly(std::vector<std::string> paths) {
        platform::Locked monitor(plugin()._monitor);
        plugin()._ReelixEventsSearchPaths = std::make_shared<vexo::VXPathList>(std::move(paths));
    }

    // A reload that leaves the tree alone.
    VXMediaGroupRef reload() {
        return plugin()._reloadReelixEvents("parent", /*updateRootMediaGroup=*/false);
    }

    // Installs a root with these children, as a load would have left it.
    VXMediaGroupRef install(const VXMediaGroupList& children) {
        const auto root = plugin().newMediaGroupWithTypeIdentifier(vexo::VXReelixRootGroupTypeIdentifier,
                                                                   std::string(vexo::VXReelix));
        root->setChildGroups(children);
        plugin().setRootMediaGroup(root);
        return root;
    }
    VXMediaGroupRef newGroup(const std::string& name, const vexo::VXGroupTypeIdentifier& type) {
        const auto group = plugin().newMediaGroupWithTypeIdentifier(type, name);
        group->setName(name);
        return group;
    }
    VXMediaGroupRef newProject(const std::string& name) {
        return newGroup(name, vexo::VXReelixProjectGroupTypeIdentifier);
    }
    VXMediaGroupRef newLibrary(const std::string& name) {
        return newGroup(name, vexo::VXReelixEventLibraryGroupTypeIdentifier);
    }
    VXMediaGroupRef newLibraryWithClip(const std::string& name) {
        const auto library = newLibrary(name);
        const auto event = newGroup("event", vexo::VXReelixEventGroupTypeIdentifier);
        event->setMediaObjects({plugin().newMediaObjectWithType(3, "clip", "/clip.mov")});
        library->addChildGroup(event);
        return library;
    }
    // What the root's children are after a new library is installed among the given ones.
    std::vector<std::string> namesAfterInstalling(const VXMediaGroupRef& library,
                                                  const VXMediaGroupList& children) {
        const auto root = install(children);
        plugin().finishReloadReelixEvents(library);
        return names(root->childGroups());
    }
    std::vector<std::string> flatNames() {
        platform::Locked monitor(plugin()._monitor);
        return names(*plugin()._flatEventGroupsList);
    }
};

// --- Search paths ------------------------------------------------------------------------------------------

TEST_F(EventReloadTest, SearchPathsWithoutOtherVolumesAreTheDefaultsAndThoseOfTheStartUpVolume) {
    environment.workspace.setVolumes({"/", "/Network"});
    EXPECT_THAT(searchPaths(), ElementsAre("home/Movies/Reelix Events", "home/Movies/Reelix Events.localized",
                                           "/Reelix Events", "/Reelix Events.localized"));
}

TEST_F(EventReloadTest, SearchPathsWithoutAHomeLackTheDefaults) {
    HostEnvironment homeless;
    homeless.setHomeDirectory(std::nullopt);
    const auto plugin = newPlugin();
    platform::Locked monitor(plugin->_monitor);
    plugin->_prepareReelixEventsSearchPaths();
    EXPECT_THAT(plugin->_ReelixEventsSearchPaths->snapshot(),
                ElementsAre("/Reelix Events", "/Reelix Events.localized"));
}

TEST_F(EventReloadTest, LocalVolumesAreSearchedByTheirDisplayNames) {
    environment.workspace.setVolumes({"/media/usb1", "/", "/mnt/disk"});
    files.displayNames["/media/usb1"] = "Footage";
    files.displayNames["/mnt/disk"] = "Große Platte";
    EXPECT_THAT(
        searchPaths(),
        ElementsAre("home/Movies/Reelix Events", "home/Movies/Reelix Events.localized",
                    "/Volumes/Footage/Reelix Events", "/Volumes/Footage/Reelix Events.localized",
                    "/Volumes/Große Platte/Reelix Events", "/Volumes/Große Platte/Reelix Events.localized",
                    "/Reelix Events", "/Reelix Events.localized"));
}

TEST_F(EventReloadTest, OnlyTheExactPathsOfNetworkAndStartUpVolumeAreLeftOut) {
    environment.workspace.setVolumes({"/Network", "/Network/share", "/network"});
    files.displayNames["/Network/share"] = "Share";
    files.displayNames["/network"] = "Lower";
    EXPECT_THAT(searchPaths(),
                ElementsAre("home/Movies/Reelix Events", "home/Movies/Reelix Events.localized",
                            "/Volumes/Share/Reelix Events", "/Volumes/Share/Reelix Events.localized",
                            "/Volumes/Lower/Reelix Events", "/Volumes/Lower/Reelix Events.localized",
                            "/Reelix Events", "/Reelix Events.localized"));
}

TEST_F(EventReloadTest, RemovableMediaComeLastByTheirMountPoints) {
    environment.workspace.setVolumes({"/", "/media/usb1"});
    environment.workspace.setRemovableMedia({"/media/usb1", "/Network", "/"});
    files.displayNames["/media/usb1"] = "Footage";
    EXPECT_THAT(
        searchPaths(),
        ElementsAre("home/Movies/Reelix Events", "home/Movies/Reelix Events.localized",
                    "/Volumes/Footage/Reelix Events", "/Volumes/Footage/Reelix Events.localized",
                    "/Reelix Events", "/Reelix Events.localized", "/media/usb1/Reelix Events",
                    "/media/usb1/Reelix Events.localized", "/Network/Reelix Events",
                    "/Network/Reelix Events.localized", "/Reelix Events", "/Reelix Events.localized"));
}

TEST_F(EventReloadTest, VolumeThatIsGoneSinceItWasListedIsKnownByItsMountPoint) {
    environment.workspace.setVolumes({"/media/gone"});
    files.displayNames["/media/gone"] = std::nullopt;
    EXPECT_THAT(searchPaths(), testing::Contains("/Volumes/gone/Reelix Events"));
}

TEST_F(EventReloadTest, SearchPathsArePreparedAnew) {
    searchPaths();
    const auto before = searchPathList();
    before->append("/added");
    EXPECT_THAT(searchPaths(), testing::Not(testing::Contains("/added")));
    EXPECT_NE(searchPathList(), before);
}

// --- The branch --------------------------------------------------------------------------------------------

TEST_F(EventReloadTest, WithoutSearchPathsAnswersNilAndEmptiesTheFlatList) {
    EXPECT_EQ(reload(), nullptr);
    EXPECT_THAT(flatNames(), IsEmpty());
}

TEST_F(EventReloadTest, LibrariesThatAreMissingOrEmptyAnswerNil) {
    home().makeFolder("Empty");
    home().makeFolder("Without clips/Event");
    home().writeFile("Without clips/Event/readme.txt");
    searchOnly({home().path("Missing"), home().path("Empty"), home().path("Without clips")});
    EXPECT_EQ(reload(), nullptr);
    EXPECT_THAT(flatNames(), ElementsAre("Event"));
}

TEST_F(EventReloadTest, TreeOfTheNewestFirst) {
    addClip("Beach/a.mov", "2008-07-04 18;30;05");
    addClip("camping/a.mov", "2008-09-04 18;30;05");
    addClip("Long/a.mov", "2007-12-31 00;00;00");
    addClip("Long/b.mov", "2009-01-01 00;00;00");
    addClip("Old/a.mov", "2007-02-02 00;00;00");
    searchPaths();
    EXPECT_EQ(text(reload()),
              R"(EventLibrary Event Library "Event Library" <parent> icon=Reelix-icon-event
  EventCalendar 2009 "2009" <VXReelix> icon=Reelix-icon-calendar year=2009
    Event home/Movies/Reelix Events/Long "Long" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2009
      * home/Movies/Reelix Events/Long/a.mov "Dec 31, 2007, 00:00:00"
      * home/Movies/Reelix Events/Long/b.mov "Jan 1, 2009, 00:00:00"
  EventCalendar 2008 "2008" <VXReelix> icon=Reelix-icon-calendar year=2008
    Event home/Movies/Reelix Events/camping "camping" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2008
      * home/Movies/Reelix Events/camping/a.mov "Sep 4, 2008, 18:30:05"
    Event home/Movies/Reelix Events/Beach "Beach" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2008
      * home/Movies/Reelix Events/Beach/a.mov "Jul 4, 2008, 18:30:05"
  EventCalendar 2007 "2007" <VXReelix> icon=Reelix-icon-calendar year=2007
    Event home/Movies/Reelix Events/Old "Old" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2007
      * home/Movies/Reelix Events/Old/a.mov "Feb 2, 2007, 00:00:00"
)");
}

TEST_F(EventReloadTest, TreeOfTheOldestFirst) {
    sortOldestFirst();
    addClip("Beach/a.mov", "2008-07-04 18;30;05");
    addClip("camping/a.mov", "2008-07-04 18;30;05");
    addClip("Long/a.mov", "2007-12-31 00;00;00");
    addClip("Long/b.mov", "2009-01-01 00;00;00");
    addClip("Old/a.mov", "2007-02-02 00;00;00");
    searchPaths();
    EXPECT_EQ(text(reload()),
              R"(EventLibrary Event Library "Event Library" <parent> icon=Reelix-icon-event
  EventCalendar 2007 "2007" <VXReelix> icon=Reelix-icon-calendar year=2007
    Event home/Movies/Reelix Events/Old "Old" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2007
      * home/Movies/Reelix Events/Old/a.mov "Feb 2, 2007, 00:00:00"
    Event home/Movies/Reelix Events/Long "Long" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2007
      * home/Movies/Reelix Events/Long/a.mov "Dec 31, 2007, 00:00:00"
      * home/Movies/Reelix Events/Long/b.mov "Jan 1, 2009, 00:00:00"
  EventCalendar 2008 "2008" <VXReelix> icon=Reelix-icon-calendar year=2008
    Event home/Movies/Reelix Events/Beach "Beach" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2008
      * home/Movies/Reelix Events/Beach/a.mov "Jul 4, 2008, 18:30:05"
    Event home/Movies/Reelix Events/camping "camping" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2008
      * home/Movies/Reelix Events/camping/a.mov "Jul 4, 2008, 18:30:05"
)");
}

TEST_F(EventReloadTest, YearsFollowTheOrderOfEvents) {
    addClip("A/a.mov", "2007-07-04 18;30;05");
    addClip("B/a.mov", "2009-07-04 18;30;05");
    addClip("C/a.mov", "2008-07-04 18;30;05");
    searchPaths();
    EXPECT_THAT(names(reload()->childGroups()), ElementsAre("2009", "2008", "2007"));
    sortOldestFirst();
    EXPECT_THAT(names(reload()->childGroups()), ElementsAre("2007", "2008", "2009"));
}

TEST_F(EventReloadTest, LibraryGroupHasItsFields) {
    environment.bundle->replacedStrings["ReelixEventLibrary"] = "Ereignismediathek";
    addClip("Trip/a.mov", "2008-07-04 18;30;05");
    searchPaths();
    const auto library = reload();
    EXPECT_EQ(library->typeIdentifier(), vexo::VXReelixEventLibraryGroupTypeIdentifier);
    EXPECT_EQ(library->ID(), "Ereignismediathek");
    EXPECT_EQ(library->name(), "Ereignismediathek");
    EXPECT_EQ(library->parentID(), "parent");
    EXPECT_EQ(library->icon(), iconCache().eventIcon.get());
    EXPECT_THAT(*library->attributes(), IsEmpty());
    EXPECT_EQ(library->path(), std::nullopt);
    EXPECT_EQ(library->ownMediaObjects(), std::nullopt);
    EXPECT_EQ(clipNames(library).size(), 1u);
}

TEST_F(EventReloadTest, YearGroupHasItsFields) {
    addClip("Trip/a.mov", "2008-07-04 18;30;05");
    searchPaths();
    const auto year = reload()->childGroups().front();
    EXPECT_EQ(year->typeIdentifier(), vexo::VXReelixEventCalendarGroupTypeIdentifier);
    EXPECT_EQ(year->ID(), "2008");
    EXPECT_EQ(year->name(), "2008");
    EXPECT_EQ(year->parentID(), "VXReelix");
    EXPECT_EQ(year->icon(), iconCache().calendarIcon.get());
    EXPECT_EQ(*year->attributes(), (platform::Dictionary{{"ReelixEventCreationYear", 2008}}));
    EXPECT_EQ(year->ownMediaObjects(), std::nullopt);
    EXPECT_EQ(clipNames(year).size(), 1u);
}

TEST_F(EventReloadTest, EventsWithoutAYearMakeAYearGroup0Each) {
    addClipMadeAt("A/a.mov", "");
    addClipMadeAt("B/a.mov", "");
    searchPaths();
    const auto library = reload();
    ASSERT_EQ(library->childGroups().size(), 2u);
    for (const VXMediaGroupRef& year : library->childGroups()) {
        EXPECT_EQ(year->ID(), "0");
        EXPECT_EQ(year->name(), "0");
        EXPECT_THAT(*year->attributes(), IsEmpty());
        EXPECT_EQ(year->childGroups().size(), 1u);
    }
}

TEST_F(EventReloadTest, EventOfAYearIsNotFiledUnderAGroupWithoutOne) {
    addClipMadeAt("A/a.mov", "");
    addClip("B/a.mov", "2008-07-04 18;30;05");
    addClip("C/a.mov", "2008-08-04 18;30;05");
    searchPaths();
    std::map<std::string, std::vector<std::string>> eventsByYear;
    for (const VXMediaGroupRef& year : reload()->childGroups())
        eventsByYear[*year->name()] = names(year->childGroups());
    EXPECT_EQ(eventsByYear,
              (std::map<std::string, std::vector<std::string>>{{"0", {"A"}}, {"2008", {"C", "B"}}}));
}

TEST_F(EventReloadTest, YearsMinusOneAndZeroHaveGroupsOfTheirOwnWhenTheOldestComeFirst) {
    sortOldestFirst();
    addClipMadeAt("A/a.mov", "");
    addClipMadeAt("B/a.mov", "");
    addClip("C/a.mov", "0000-08-04 18;30;05");
    searchPaths();
    const auto library = reload();
    EXPECT_THAT(names(library->childGroups()), ElementsAre("-1", "0"));
    EXPECT_THAT(names(library->childGroups()[0]->childGroups()), ElementsAre("A", "B"));
    EXPECT_EQ(library->childGroups()[1]->attributes()->at("ReelixEventCreationYear"), platform::Value(0));
}

// An event without a year stands for no year at all, not for the year 0 that its group is named after.
TEST_F(EventReloadTest, EventOfTheYearZeroIsNotFiledWithAnEventWithoutAYear) {
    sortOldestFirst();
    addClip("A/a.mov", "9999-08-04 18;30;05");
    addClip("B/a.mov", "0000-08-04 18;30;05");
    searchPaths();
    const auto library = reload();
    EXPECT_THAT(names(library->childGroups()), ElementsAre("0", "0"));
    EXPECT_THAT(names(library->childGroups()[0]->childGroups()), ElementsAre("A"));
    EXPECT_THAT(names(library->childGroups()[1]->childGroups()), ElementsAre("B"));
}

// Sorted with the events of other years between them, events that miss a date can keep others apart.
TEST_F(EventReloadTest, EventsOfAYearAreSortedOnceMoreAmongThemselves) {
    sortOldestFirst();
    for (const char* clip : {"Late/a.mov", "Undated/a.mov", "Early/a.mov"})
        addClipMadeAt(clip, "");
    addClip("Late/b.mov", "2003-08-04 18;30;05");
    addClip("Early/b.mov", "2001-08-04 18;30;05");
    addClip("Other year/a.mov", "2000-08-04 18;30;05");
    files.listings[library()] = {"Late", "Other year", "Undated", "Early"};
    searchPaths();
    const auto branch = reload();
    EXPECT_THAT(names(branch->childGroups()), ElementsAre("-1", "2000"));
    EXPECT_THAT(names(branch->childGroups().front()->childGroups()), ElementsAre("Early", "Late", "Undated"));
}

TEST_F(EventReloadTest, EventsOfAllLibrariesShareTheYears) {
    home().writeFile("One/A/clip-2008-07-04 18;30;05.mov");
    home().writeFile("Two/B/clip-2008-08-04 18;30;05.mov");
    home().writeFile("Two/C/readme.txt");
    searchOnly({home().path("One"), home().path("Missing"), home().path("Two")});
    const auto library = reload();
    EXPECT_THAT(names(library->childGroups()), ElementsAre("2008"));
    EXPECT_THAT(names(library->childGroups().front()->childGroups()), ElementsAre("B", "A"));
    EXPECT_EQ(library->childGroups().front()->childGroups().front()->parentID(), home().path("Two"));
    EXPECT_THAT(flatNames(), ElementsAre("A", "B", "C"));
}

TEST_F(EventReloadTest, EventsOfARemovableVolumeThatIsAlsoLocalAreShownTwice) {
    const std::string volume = home().makeFolder("disk");
    home().writeFile("disk/Reelix Events/Trip/clip-2008-07-04 18;30;05.mov");
    environment.mounts.list = {{volume, "/dev/sdx1", "ext4", "Vexo Test Footage"}};
    environment.workspace.setVolumes({"/", volume});
    environment.workspace.setRemovableMedia({volume});
    files.displayNames[volume] = "Vexo Test Footage";
    searchPaths();
    const auto library = reload();
    ASSERT_TRUE(library);
    std::vector<std::string> events;
    for (const VXMediaGroupRef& event : library->childGroups().front()->childGroups())
        events.push_back(*event->ID());
    EXPECT_THAT(events,
                ElementsAre("/Volumes/Vexo Test Footage/Reelix Events/Trip", volume + "/Reelix Events/Trip"));
}

TEST_F(EventReloadTest, MediaGroupsAreTheEventsOfTheLastReload) {
    addClip("A/a.mov");
    home().writeFile(inLibrary("B/readme.txt"));
    searchPaths();
    reload();
    EXPECT_THAT(names(plugin().mediaGroups()), ElementsAre("A", "B"));
    home().remove(inLibrary("A"));
    reload();
    EXPECT_THAT(names(plugin().mediaGroups()), ElementsAre("B"));
}

// --- The pending flag --------------------------------------------------------------------------------------

TEST_F(EventReloadTest, PendingFlagIsClearedBeforeTheScan) {
    home().makeFolder(inLibrary(""));
    searchPaths();
    std::vector<bool> pendingDuringScan;
    files.beforeListing = [&](const std::string&) {
        pendingDuringScan.push_back(plugin()._poolingEventsReload);
    };
    plugin()._poolingEventsReload = true;
    reload();
    EXPECT_THAT(pendingDuringScan, ElementsAre(false, false, false, false));
}

TEST_F(EventReloadTest, PendingFlagIsClearedWhenTheReloadIsCancelled) {
    plugin()._poolingEventsReload = true;
    plugin().cancelAfter(0);
    EXPECT_EQ(reload(), nullptr);
    EXPECT_FALSE(plugin()._poolingEventsReload);
}

TEST_F(EventReloadTest, PendingFlagSetDuringTheReloadStays) {
    searchPaths();
    files.beforeListing = [&](const std::string&) { plugin()._poolingEventsReload = true; };
    reload();
    EXPECT_TRUE(plugin()._poolingEventsReload);
}

// --- Watches -----------------------------------------------------------------------------------------------

// Writes down what it is asked; a folder that a test names is watched already.
class RecordingWatcher final : public vexo::VXPathWatcher {
  public:
    std::vector<std::string> calls;
    std::vector<std::string> watchedAlready;
    const void* observer = nullptr;

    void watchPath(const std::string& path, const vexo::VXPathObserverRef& by) override {
        calls.push_back("watch " + path);
        observer = by.get();
    }
    bool watchPathIsUnique(const std::string& path, const vexo::VXPathObserverRef& by) override {
        calls.push_back("unique " + path);
        observer = by.get();
        return std::find(watchedAlready.begin(), watchedAlready.end(), path) == watchedAlready.end();
    }
    void watchQuery(const std::string&, const vexo::VXPathObserverRef&, vexo::VXPathListRef,
                    unsigned) override {}
};

class EventWatchesTest : public EventReloadTest {
  protected:
    RecordingWatcher watcher;

  private:
    vexo::HostServicesScope scope_{{watcher, vexo::hostServices().imageManager, environment.metadata,
                                    environment.thumbnails, environment.diagnostics}};
};

TEST_F(EventWatchesTest, LibraryIsWatchedWhereItsParentIsNot) {
    searchOnly({"/one/Reelix Events"});
    reload();
    EXPECT_THAT(watcher.calls,
                ElementsAre("unique /one", "unique /one/Reelix Events", "watch /one/Reelix Events"));
    EXPECT_EQ(watcher.observer, static_cast<vexo::VXPathObserver*>(&plugin()));
}

TEST_F(EventWatchesTest, LibraryInAWatchedFolderIsNotWatched) {
    watcher.watchedAlready = {"/one"};
    searchOnly({"/one/Reelix Events"});
    reload();
    EXPECT_THAT(watcher.calls, ElementsAre("unique /one"));
}

TEST_F(EventWatchesTest, WatchedLibraryIsNotWatchedAgain) {
    watcher.watchedAlready = {"/one/Reelix Events"};
    searchOnly({"/one/Reelix Events"});
    reload();
    EXPECT_THAT(watcher.calls, ElementsAre("unique /one", "unique /one/Reelix Events"));
}

TEST_F(EventWatchesTest, EveryLibraryScannedIsWatchedWhateverItHolds) {
    const std::string full = home().makeFolder("full/Reelix Events");
    home().writeFile("full/Reelix Events/Trip/a.mov");
    const std::string empty = home().makeFolder("empty/Reelix Events");
    searchOnly({full, empty, "/Reelix Events"});
    reload();
    EXPECT_THAT(watcher.calls,
                ElementsAre("unique " + home().path("full"), "unique " + full, "watch " + full,
                            "unique " + home().path("empty"), "unique " + empty, "watch " + empty, "unique /",
                            "unique /Reelix Events", "watch /Reelix Events"));
}

TEST_F(EventWatchesTest, CancelledScanWatchesOnlyWhatItScanned) {
    searchOnly({"/one/Reelix Events", "/two/Reelix Events"});
    plugin().cancelAfter(1);
    reload();
    EXPECT_THAT(watcher.calls,
                ElementsAre("unique /one", "unique /one/Reelix Events", "watch /one/Reelix Events"));
}

// --- Installing --------------------------------------------------------------------------------------------

TEST_F(EventReloadTest, NewLibraryIsAddedLastWhereThereWasNone) {
    EXPECT_THAT(namesAfterInstalling(newLibraryWithClip("A new"), {newProject("c"), newProject("B")}),
                ElementsAre("B", "c", "A new"));
}

TEST_F(EventReloadTest, NewLibraryBecomesTheOnlyChildOfARootWithoutChildren) {
    EXPECT_THAT(namesAfterInstalling(newLibraryWithClip("new"), {}), ElementsAre("new"));
}

TEST_F(EventReloadTest, NewLibraryReplacesAnOldOneInTheMiddle) {
    EXPECT_THAT(namesAfterInstalling(newLibraryWithClip("new"),
                                     {newProject("c"), newLibraryWithClip("old"), newProject("B")}),
                ElementsAre("B", "c", "new"));
}

TEST_F(EventReloadTest, NewLibraryReplacesEachOfSeveralOldOnes) {
    EXPECT_THAT(namesAfterInstalling(newLibraryWithClip("new"),
                                     {newLibrary("old"), newProject("b"), newLibrary("older")}),
                ElementsAre("b", "new", "new"));
}

TEST_F(EventReloadTest, NoNewLibraryRemovesTheOldOnes) {
    EXPECT_THAT(
        namesAfterInstalling(nullptr, {newLibraryWithClip("old"), newProject("b"), newLibrary("older")}),
        ElementsAre("b"));
    EXPECT_THAT(namesAfterInstalling(nullptr, {}), IsEmpty());
}

TEST_F(EventReloadTest, NewLibraryWithoutClipsRemovesTheOldOnes) {
    EXPECT_THAT(namesAfterInstalling(newLibrary("new"), {newProject("b"), newLibraryWithClip("old")}),
                ElementsAre("b"));
    EXPECT_THAT(namesAfterInstalling(newLibrary("new"), {}), IsEmpty());
}

TEST_F(EventReloadTest, OldLibraryIsToldByTheTypeObject) {
    static const vexo::VXGroupTypeIdentifier lookalike(vexo::VXReelixEventLibraryGroupTypeIdentifier.text());
    EXPECT_THAT(namesAfterInstalling(newLibraryWithClip("new"), {newGroup("b", lookalike)}),
                ElementsAre("b", "new"));
}

TEST_F(EventReloadTest, InstallingWhileACancelIsPendingChangesNothing) {
    const auto root = install({newProject("c"), newLibrary("old"), newProject("B")});
    plugin().cancelAfter(0);
    plugin().finishReloadReelixEvents(newLibraryWithClip("new"));
    EXPECT_THAT(names(root->childGroups()), ElementsAre("c", "old", "B"));
}

TEST_F(EventReloadTest, InstallingWithoutARootDoesNothing) {
    plugin().finishReloadReelixEvents(newLibraryWithClip("new"));
    EXPECT_EQ(plugin().rootMediaGroup(), nullptr);
}

TEST_F(EventReloadTest, ReloadPutsTheNewBranchIntoTheInstalledRootAndPublishesIt) {
    addClip("A/a.mov", "2008-07-04 18;30;05");
    const auto root = load();
    std::vector<VXMediaGroupRef> published;
    const auto observer = std::make_shared<int>();
    plugin().addTreeObserver(observer, [&](const VXMediaGroupRef& tree) { published.push_back(tree); });
    const auto before = root->childGroups().back();

    addClip("B/b.mov", "2009-07-04 18;30;05");
    const auto answered = plugin()._reloadReelixEvents();

    EXPECT_NE(answered, before);
    EXPECT_THAT(root->childGroups(), ElementsAre(answered));
    EXPECT_THAT(published, ElementsAre(root));
    EXPECT_EQ(tree(), R"(Root VXReelix "Reelix" <none> icon=MBReelixAppIconSmall
  * home/Movies/Reelix Events/B/b.mov "Jul 4, 2009, 18:30:05"
  * home/Movies/Reelix Events/A/a.mov "Jul 4, 2008, 18:30:05"
  EventLibrary Event Library "Event Library" <VXReelix> icon=Reelix-icon-event
    EventCalendar 2009 "2009" <VXReelix> icon=Reelix-icon-calendar year=2009
      Event home/Movies/Reelix Events/B "B" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2009
        * home/Movies/Reelix Events/B/b.mov "Jul 4, 2009, 18:30:05"
    EventCalendar 2008 "2008" <VXReelix> icon=Reelix-icon-calendar year=2008
      Event home/Movies/Reelix Events/A "A" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2008
        * home/Movies/Reelix Events/A/a.mov "Jul 4, 2008, 18:30:05"
)");
}

TEST_F(EventReloadTest, ReloadOfEmptyLibrariesTakesTheBranchOutOfTheRoot) {
    addClip("A/a.mov", "2008-07-04 18;30;05");
    const auto root = load();
    ASSERT_EQ(root->childGroups().size(), 1u);
    home().remove(inLibrary("A"));
    EXPECT_EQ(plugin()._reloadReelixEvents(), nullptr);
    EXPECT_THAT(root->childGroups(), IsEmpty());
    EXPECT_THAT(root->mediaObjects(), IsEmpty());
}

TEST_F(EventReloadTest, ReloadWithoutTheFlagLeavesTheRootAlone) {
    addClip("A/a.mov", "2008-07-04 18;30;05");
    load();
    const std::string before = tree();
    addClip("B/b.mov", "2009-07-04 18;30;05");
    EXPECT_EQ(reload()->childGroups().size(), 2u);
    EXPECT_EQ(tree(), before);
}

TEST_F(EventReloadTest, ReloadBeforeTheFirstLoadAnswersTheBranchWithoutAParent) {
    addClip("A/a.mov", "2008-07-04 18;30;05");
    searchPaths();
    const auto library = plugin()._reloadReelixEvents();
    ASSERT_TRUE(library);
    EXPECT_EQ(library->parentID(), std::nullopt);
    EXPECT_EQ(plugin().rootMediaGroup(), nullptr);
}

// --- Cancelling --------------------------------------------------------------------------------------------

// A reload of two libraries asks whether a cancel is pending before each of the two libraries (questions 1
// and 2), after the scan (3), before each of two events (4, 5) and of two years (6, 7), before the branch is
// installed (8), and before the root takes its children (9).
class CancelledReloadTest : public EventReloadTest {
  protected:
    CancelledReloadTest() {
        home().writeFile("One/A/clip-2009-07-04 18;30;05.mov");
        home().writeFile("Two/B/clip-2008-07-04 18;30;05.mov");
        searchOnly({home().path("One"), home().path("Two")});
        root = install({newLibrary("old")});
        plugin().addTreeObserver(observer_, [this](const VXMediaGroupRef&) { ++publications; });
    }

    // Answers the names of the years, "nil" for no answer.
    std::vector<std::string> reloadCancelledAfter(int questions) {
        plugin().cancelAfter(questions);
        const auto library = plugin()._reloadReelixEvents();
        plugin().neverCancel();
        eventsOfYears.clear();
        if (!library)
            return {"nil"};
        for (const VXMediaGroupRef& year : library->childGroups())
            eventsOfYears.push_back(names(year->childGroups()));
        return names(library->childGroups());
    }

    VXMediaGroupRef root;
    int publications = 0;
    std::vector<std::vector<std::string>> eventsOfYears;

  private:
    const std::shared_ptr<int> observer_ = std::make_shared<int>();
};

TEST_F(CancelledReloadTest, AnswersNilAndStopsTheScanAtOnce) {
    EXPECT_THAT(reloadCancelledAfter(0), ElementsAre("nil"));
    EXPECT_THAT(flatNames(), IsEmpty());
    EXPECT_THAT(reloadCancelledAfter(1), ElementsAre("nil"));
    EXPECT_THAT(flatNames(), ElementsAre("A"));
    EXPECT_THAT(reloadCancelledAfter(2), ElementsAre("nil"));
    EXPECT_THAT(flatNames(), ElementsAre("A", "B"));
}

TEST_F(CancelledReloadTest, AnswersTheEventsFiledSoFar) {
    EXPECT_THAT(reloadCancelledAfter(3), ElementsAre("nil"));
    EXPECT_THAT(reloadCancelledAfter(4), ElementsAre("2009"));
    EXPECT_THAT(reloadCancelledAfter(5), ElementsAre("2009", "2008"));
    EXPECT_THAT(reloadCancelledAfter(6), ElementsAre("2009", "2008"));
}

TEST_F(CancelledReloadTest, LeavesTheEventsFiledSoFarInTheirYears) {
    reloadCancelledAfter(4);
    EXPECT_THAT(eventsOfYears, ElementsAre(ElementsAre("A")));
    for (const int questions : {5, 6, 7}) {
        reloadCancelledAfter(questions);
        EXPECT_THAT(eventsOfYears, ElementsAre(ElementsAre("A"), ElementsAre("B"))) << questions;
    }
}

TEST_F(CancelledReloadTest, LeavesTheRootUntilTheBranchIsInstalled) {
    for (int questions = 0; questions <= 7; ++questions) {
        reloadCancelledAfter(questions);
        EXPECT_THAT(names(root->childGroups()), ElementsAre("old")) << questions;
        EXPECT_EQ(publications, 0) << questions;
    }
}

TEST_F(CancelledReloadTest, KeepsTheChildrenButPublishesTheRootWhenCancelledWhileInstalling) {
    EXPECT_THAT(reloadCancelledAfter(8), ElementsAre("2009", "2008"));
    EXPECT_THAT(names(root->childGroups()), ElementsAre("old"));
    EXPECT_EQ(publications, 1);
}

TEST_F(CancelledReloadTest, IsCompleteWhenTheCancelComesAfterTheLastQuestion) {
    EXPECT_THAT(reloadCancelledAfter(9), ElementsAre("2009", "2008"));
    EXPECT_THAT(names(root->childGroups()), ElementsAre("Event Library"));
    EXPECT_EQ(publications, 1);
}

}  // namespace
}  // namespace testing_support
