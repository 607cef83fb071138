#include <thread>

#include "tests/projects/ProjectsTest.h"

using namespace testing_support;
using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using vexo::VXMediaGroupList;

namespace {

// --- Search paths ------------------------------------------------------------------------------------------

class ProjectSearchPaths : public ProjectsTest {
  protected:
    Strings searchPaths() {
        platform::Locked monitor(plugin()._monitor);
        plugin()._prepareReelixProjectsSearchPaths();
        return inHome(*plugin()._ReelixSearchPaths);
    }
    std::string homeEntry() { return searchPaths().front(); }
};

TEST_F(ProjectSearchPaths, AreNilBeforeTheFirstLoad) {
    platform::Locked monitor(plugin()._monitor);
    EXPECT_EQ(plugin()._ReelixSearchPaths, nullptr);
}

TEST_F(ProjectSearchPaths, WithoutVolumesAreTheHomeFolderAndThoseOfTheStartUpVolume) {
    home().makeFolder("Movies/Reelix Projects");
    EXPECT_THAT(searchPaths(),
                ElementsAre("home/Movies/Reelix Projects", "/Reelix Projects", "/Reelix Projects.localized"));
    EXPECT_FALSE(plugin()._missingReelixDefaultPath);
}

TEST_F(ProjectSearchPaths, ThePlainHomeFolderWinsOverItsLocalizedForm) {
    home().makeFolder("Movies/Reelix Projects");
    home().makeFolder("Movies/Reelix Projects.localized");
    plugin()._missingReelixDefaultPath = true;
    EXPECT_THAT(searchPaths(),
                ElementsAre("home/Movies/Reelix Projects", "/Reelix Projects", "/Reelix Projects.localized"));
    EXPECT_FALSE(plugin()._missingReelixDefaultPath);
}

TEST_F(ProjectSearchPaths, TheLocalizedHomeFolderStandsInForAMissingPlainOne) {
    home().makeFolder("Movies/Reelix Projects.localized");
    plugin()._missingReelixDefaultPath = true;
    EXPECT_THAT(searchPaths(), ElementsAre("home/Movies/Reelix Projects.localized", "/Reelix Projects",
                                           "/Reelix Projects.localized"));
    EXPECT_FALSE(plugin()._missingReelixDefaultPath);
}

TEST_F(ProjectSearchPaths, WithNeitherHomeFolderTheLocalizedFormIsListedAllTheSame) {
    EXPECT_EQ(homeEntry(), "home/Movies/Reelix Projects.localized");
    EXPECT_TRUE(plugin()._missingReelixDefaultPath);
}

TEST_F(ProjectSearchPaths, WithoutAHomeNoHomeFolderIsListed) {
    setHomeDirectory(std::nullopt);
    EXPECT_THAT(searchPaths(), ElementsAre("/Reelix Projects", "/Reelix Projects.localized"));
    EXPECT_TRUE(plugin()._missingReelixDefaultPath);
}

TEST_F(ProjectSearchPaths, WhateverExistsCountsAsTheHomeFolder) {
    home().makeLink("Movies/Reelix Projects", "nowhere");
    EXPECT_EQ(homeEntry(), "home/Movies/Reelix Projects.localized");
    home().remove("Movies/Reelix Projects");
    home().writeFile("Movies/Reelix Projects");
    EXPECT_EQ(homeEntry(), "home/Movies/Reelix Projects");
    EXPECT_FALSE(plugin()._missingReelixDefaultPath);
}

TEST_F(ProjectSearchPaths, AHomeFolderThatIsALinkKeepsItsOwnPath) {
    home().makeFolder("elsewhere");
    home().makeLink("Movies/Reelix Projects", home().path("elsewhere"));
    EXPECT_EQ(homeEntry(), "home/Movies/Reelix Projects");
}

TEST_F(ProjectSearchPaths, LocalVolumesAreNamedByTheirDisplayNames) {
    environment.workspace.setVolumes({"/", home().makeFolder("disk"), home().makeFolder("stick")});
    files.displayNames[home().path("disk")] = "My Disk";
    EXPECT_THAT(searchPaths(),
                ElementsAre("home/Movies/Reelix Projects.localized", "/Volumes/My Disk/Reelix Projects",
                            "/Volumes/My Disk/Reelix Projects.localized", "/Volumes/stick/Reelix Projects",
                            "/Volumes/stick/Reelix Projects.localized", "/Reelix Projects",
                            "/Reelix Projects.localized"));
}

TEST_F(ProjectSearchPaths, OnlyTheVeryPathsOfTheStartUpVolumeAndTheNetworkAreSkipped) {
    environment.workspace.setVolumes({"/Network", "/", "/Network/server", "/network"});
    EXPECT_THAT(searchPaths(),
                ElementsAre("home/Movies/Reelix Projects.localized", "/Volumes/server/Reelix Projects",
                            "/Volumes/server/Reelix Projects.localized", "/Volumes/network/Reelix Projects",
                            "/Volumes/network/Reelix Projects.localized", "/Reelix Projects",
                            "/Reelix Projects.localized"));
}

TEST_F(ProjectSearchPaths, RemovableMediaAreListedLastByTheirMountPointsWithoutAnyTest) {
    environment.workspace.setVolumes({});
    environment.workspace.setRemovableMedia({"/media/a", "/", "/Network", "/media/a/"});
    EXPECT_THAT(searchPaths(), ElementsAre("home/Movies/Reelix Projects.localized", "/Reelix Projects",
                                           "/Reelix Projects.localized", "/media/a/Reelix Projects",
                                           "/media/a/Reelix Projects.localized", "/Reelix Projects",
                                           "/Reelix Projects.localized", "/Network/Reelix Projects",
                                           "/Network/Reelix Projects.localized", "/media/a/Reelix Projects",
                                           "/media/a/Reelix Projects.localized"));
}

TEST_F(ProjectSearchPaths, ARemovableVolumeUnderVolumesIsListedTwice) {
    environment.workspace.setVolumes({"/", "/Volumes/Stick"});
    environment.workspace.setRemovableMedia({"/Volumes/Stick"});
    EXPECT_THAT(searchPaths(),
                ElementsAre("home/Movies/Reelix Projects.localized", "/Volumes/Stick/Reelix Projects",
                            "/Volumes/Stick/Reelix Projects.localized", "/Reelix Projects",
                            "/Reelix Projects.localized", "/Volumes/Stick/Reelix Projects",
                            "/Volumes/Stick/Reelix Projects.localized"));
}

TEST_F(ProjectSearchPaths, ANewListReplacesTheOldOne) {
    searchPaths();
    environment.workspace.setVolumes({"/", "/Volumes/Stick"});
    home().makeFolder("Movies/Reelix Projects");
    EXPECT_THAT(searchPaths(), ElementsAre("home/Movies/Reelix Projects", "/Volumes/Stick/Reelix Projects",
                                           "/Volumes/Stick/Reelix Projects.localized", "/Reelix Projects",
                                           "/Reelix Projects.localized"));
}

TEST_F(ProjectSearchPaths, AreBuiltByTheFirstLoadAndKept) {
    load();
    environment.workspace.setVolumes({"/", "/Volumes/Stick"});
    home().makeFolder("Movies/Reelix Projects");
    load();
    platform::Locked monitor(plugin()._monitor);
    EXPECT_THAT(inHome(*plugin()._ReelixSearchPaths),
                ElementsAre("home/Movies/Reelix Projects.localized", "/Reelix Projects",
                            "/Reelix Projects.localized"));
}

// --- Reloading ---------------------------------------------------------------------------------------------

class ProjectReload : public ProjectsTest {
  protected:
    ProjectReload() {
        plugin().addTreeObserver(environment.bundle,
                                 [this](const Group& root) { published.push_back(root); });
    }

    Group installRoot(const std::vector<Group>& children) {
        const Group root = newGroup(vexo::VXReelixRootGroupTypeIdentifier, "VXReelix");
        for (const Group& child : children)
            root->addChildGroup(child);
        plugin().setRootMediaGroup(root);
        published.clear();
        return root;
    }
    void installApplication() {
        environment.workspace.setApplicationForCreator(
            "rlxm",
            {"com.norvale.ReelixApp", platform::URL::fileURLWithPath(home().writeFile("editor")), ""});
    }

    std::vector<Group> published;  // what the host was handed, in order
};

TEST_F(ProjectReload, WithoutSearchPathsIsEmptyAndLeavesTheRootAlone) {
    const Group root = installRoot({newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "old")});
    plugin()._poolingProjectsReload = true;
    EXPECT_TRUE(plugin()._reloadReelixProjects().empty());
    EXPECT_THAT(namesOf(root->childGroups()), ElementsAre("old"));
    EXPECT_THAT(published, IsEmpty());
    EXPECT_FALSE(plugin()._poolingProjectsReload);
    EXPECT_EQ(flatList(), "");
}

TEST_F(ProjectReload, ClearsItsPendingFlagBeforeItScans) {
    setSearchPaths({home().makeFolder("a")});
    plugin()._poolingProjectsReload = true;
    std::optional<bool> duringScan;
    files.beforeListing = [&](const std::string&) { duringScan = plugin()._poolingProjectsReload.load(); };
    plugin()._reloadReelixProjects(false);
    EXPECT_EQ(duringScan, false);
}

TEST_F(ProjectReload, AnswersTheChildrenOfEveryLibraryInOrder) {
    makeProject("two/b.qnproject");
    makeProject("two/a.qnproject");
    makeProject("one/c.qnproject");
    home().makeFolder("empty");
    setSearchPaths({home().path("two"), home().path("missing"), home().path("empty"), home().path("one")});
    EXPECT_THAT(namesOf(plugin()._reloadReelixProjects(false)), ElementsAre("a", "b", "c"));
    EXPECT_EQ(plugin().rootMediaGroup(), nullptr);
    EXPECT_THAT(published, IsEmpty());
}

TEST_F(ProjectReload, AnswersLaterLibrariesTwiceOnceTheFirstHasTakenThemIn) {
    makeProject("one/a.qnproject");
    makeProject("two/b.qnproject");
    makeProject("three/c.qnproject");
    setSearchPaths({home().path("one"), home().path("two"), home().path("three")});
    installRoot({});
    const VXMediaGroupList groups = plugin()._reloadReelixProjects();
    EXPECT_THAT(namesOf(groups), ElementsAre("a", "b", "c", "b", "c"));
    ASSERT_EQ(groups.size(), 5u);
    EXPECT_EQ(groups[1], groups[3]);
}

TEST_F(ProjectReload, OfEmptyLibrariesIsEmpty) {
    setSearchPaths({home().makeFolder("one"), home().path("missing")});
    EXPECT_TRUE(plugin()._reloadReelixProjects(false).empty());
    EXPECT_EQ(flatList(),
              "Folder home/one \"one\" <home/one> icon=folder\n"
              "Folder home/missing \"missing\" <home/missing> icon=none\n");
}

TEST_F(ProjectReload, ReplacesTheFlatListWhole) {
    makeProject("one/a.qnproject");
    setSearchPaths({home().path("one")});
    plugin()._reloadReelixProjects(false);
    const auto before = plugin().mediaGroups();
    plugin()._reloadReelixProjects(false);
    const auto after = plugin().mediaGroups();
    ASSERT_EQ(before.size(), 1u);
    ASSERT_EQ(after.size(), 1u);
    EXPECT_NE(before.front(), after.front());
    EXPECT_EQ(after.front()->name(), "a");
}

TEST_F(ProjectReload, WatchesEverySearchPathWhetherItExistsOrNot) {
    const std::string existing = home().makeFolder("one");
    const std::string missing = home().path("missing");
    setSearchPaths({existing, missing, existing});
    EXPECT_EQ(environment.watcher.watchedAncestor(existing), std::nullopt);
    plugin()._reloadReelixProjects(false);
    EXPECT_EQ(environment.watcher.watchedAncestor(existing), existing);
    EXPECT_EQ(environment.watcher.watchedAncestor(missing), missing);
}

TEST_F(ProjectReload, OfTheFirstLoadWatchesEveryFolderOfTheSearchList) {
    environment.workspace.setVolumes({"/", "/Volumes/Stick"});
    environment.workspace.setRemovableMedia({"/media/Stick"});
    load();
    platform::Locked monitor(plugin()._monitor);
    ASSERT_EQ(plugin()._ReelixSearchPaths->size(), 7u);
    for (const std::string& folder : *plugin()._ReelixSearchPaths)
        EXPECT_EQ(environment.watcher.watchedAncestor(folder), folder);
}

TEST_F(ProjectReload, AFolderIsWatchedAfterItWasScanned) {
    const std::string folder = home().makeFolder("one");
    setSearchPaths({folder});
    std::optional<std::string> duringScan = "not scanned";
    files.beforeListing = [&](const std::string&) {
        duringScan = environment.watcher.watchedAncestor(folder);
    };
    plugin()._reloadReelixProjects(false);
    EXPECT_EQ(duringScan, std::nullopt);
}

TEST_F(ProjectReload, StopsAtACancelBeforeEachFolder) {
    const Strings folders{home().makeFolder("1"), home().makeFolder("2"), home().makeFolder("3")};
    for (std::size_t questions = 0; questions <= folders.size(); ++questions) {
        dropPlugin();
        setSearchPaths(folders);
        files.listed.clear();
        plugin().cancelAfter(static_cast<int>(questions));
        plugin()._reloadReelixProjects(false);
        EXPECT_EQ(files.listed, Strings(folders.begin(), folders.begin() + static_cast<long>(questions)));
        for (std::size_t i = 0; i < folders.size(); ++i)
            EXPECT_EQ(environment.watcher.watchedAncestor(folders[i]).has_value(), i < questions)
                << questions;
    }
}

TEST_F(ProjectReload, CancelledAnywhereAnswersWhatItHasAndLeavesTheRootAlone) {
    makeProject("1/a.qnproject", {"a.mov"});
    makeProject("1/sub/b.qnproject", {"b.mov"});
    makeProject("2/c.qnproject", {"c.mov"});
    setSearchPaths({home().path("1"), home().path("2")});
    const Group root = installRoot({newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "old")});
    const Strings all{"a", "sub", "c"};
    std::size_t most = 0;
    // The root is updated by the first reload that gets as far as asking whether to update it.
    int questions = 0;
    for (; published.empty() && questions < 100; ++questions) {
        plugin().cancelAfter(questions);
        const Strings names = namesOf(plugin()._reloadReelixProjects());
        if (!published.empty())
            break;
        EXPECT_THAT(namesOf(root->childGroups()), ElementsAre("old")) << questions;
        ASSERT_LE(names.size(), all.size());
        EXPECT_EQ(names, Strings(all.begin(), all.begin() + static_cast<long>(names.size())));
        EXPECT_GE(names.size(), most);
        most = names.size();
    }
    EXPECT_EQ(most, all.size());
    // Each of the two libraries asks once, each of the three projects twice (itself and its movie), the
    // folder twice (itself and its item), and the update of the root once.
    EXPECT_EQ(questions, 2 + 6 + 2 + 1);
}

TEST_F(ProjectReload, BeforeAnyRootExistsScansAllTheSame) {
    makeProject("one/a.qnproject", {"a.mov"});
    makeProject("two/b.qnproject");
    setSearchPaths({home().path("one"), home().path("two")});
    EXPECT_THAT(namesOf(plugin()._reloadReelixProjects()), ElementsAre("a", "b", "b"));
    EXPECT_EQ(plugin().rootMediaGroup(), nullptr);
    EXPECT_THAT(published, IsEmpty());
    EXPECT_EQ(plugin().mediaGroups().size(), 2u);
}

TEST_F(ProjectReload, PutsTheProjectsIntoTheRootSortedByNameWithTheEventsLast) {
    makeProject("one/beach.qnproject", {"m.mov"});
    makeProject("one/Zoo.qnproject");
    home().makeFolder("one/Camp");
    makeProject("two/Alps.qnproject", {"a.mov"});
    setSearchPaths({home().path("one"), home().path("two")});
    const Group events = newGroup(vexo::VXReelixEventLibraryGroupTypeIdentifier, "Aardvark events");
    events->setMediaObjects({movieObject("/clip.mov")});
    const Group root = installRoot({newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "old"), events,
                                    newGroup(vexo::VXReelixFolderGroupTypeIdentifier, "old folder")});
    plugin()._reloadReelixProjects();
    EXPECT_THAT(namesOf(root->childGroups()), ElementsAre("Alps", "beach", "Camp", "Zoo", "Aardvark events"));
    EXPECT_EQ(root->childGroups().back(), events);
    EXPECT_THAT(inHome(idsOf(root->mediaObjects())),
                ElementsAre("home/two/Alps.qnproject/Movies/a.mov", "home/one/beach.qnproject/Movies/m.mov",
                            "/clip.mov"));
    EXPECT_THAT(published, ElementsAre(root));
    EXPECT_EQ(plugin().rootMediaGroup(), root);
}

TEST_F(ProjectReload, PublishesTheRootWithTheMonitorFree) {
    makeProject("one/a.qnproject");
    setSearchPaths({home().path("one")});
    installRoot({});
    std::size_t groups = 0;
    // With the monitor held, the other thread would wait for ever.
    plugin().addTreeObserver(environment.bundle, [&](const Group&) {
        std::thread([&] { groups = plugin().mediaGroups().size(); }).join();
    });
    plugin()._reloadReelixProjects();
    EXPECT_EQ(groups, 1u);
}

TEST_F(ProjectReload, ReadersOfTheFlatListWaitForTheEndOfAScan) {
    makeProject("one/a.qnproject");
    makeProject("one/b.qnproject");
    makeProject("two/c.qnproject");
    setSearchPaths({home().path("one"), home().path("two")});
    plugin();
    std::thread reader;
    std::size_t groups = 0;
    files.beforeListing = [&](const std::string&) {
        if (!reader.joinable())
            reader = std::thread([&] { groups = plugin().mediaGroups().size(); });
    };
    plugin()._reloadReelixProjects(false);
    reader.join();
    EXPECT_EQ(groups, 3u);
}

TEST_F(ProjectReload, OfTheSameLibraryGivesTheSameTreeOfNewGroups) {
    makeProject("Movies/Reelix Projects/a.qnproject", {"a.mov"});
    makeProject("Movies/Reelix Projects/b/c.qnproject", {"c.mov"});
    load();
    const std::string before = tree();
    const auto groups = plugin().rootMediaGroup()->childGroups();
    plugin()._reloadReelixProjects();
    EXPECT_EQ(tree(), before);
    EXPECT_NE(plugin().rootMediaGroup()->childGroups().front(), groups.front());
}

TEST_F(ProjectReload, ShowsWhatChanged) {
    makeProject("Movies/Reelix Projects/a.qnproject", {"a.mov"});
    makeProject("Movies/Reelix Projects/b.qnproject");
    load();
    home().remove("Movies/Reelix Projects/a.qnproject");
    makeProject("Movies/Reelix Projects/b.qnproject", {"b.mov"});
    home().writeFile("Movies/Reelix Projects/b.qnproject/Project", trailerDocument());
    plugin()._reloadReelixProjects();
    EXPECT_EQ(tree(), R"(Root VXReelix "Reelix" <none> icon=MBReelixAppIconSmall
  * home/Movies/Reelix Projects/b.qnproject/Movies/b.mov "b"
  Project home/Movies/Reelix Projects/b.qnproject "b" <home/Movies/Reelix Projects> icon=Reelix-icon-trailer
    * home/Movies/Reelix Projects/b.qnproject/Movies/b.mov "b"
)");
}

// --- Finishing ---------------------------------------------------------------------------------------------

TEST_F(ProjectReload, FinishingKeepsEveryTypeThatNoScanOfProjectsMakes) {
    const Group root = installRoot({newGroup(vexo::VXReelixEventCalendarGroupTypeIdentifier, "year"),
                                    newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "project"),
                                    newGroup(vexo::VXReelixProjectLibraryGroupTypeIdentifier, "library"),
                                    newGroup(vexo::VXReelixEventGroupTypeIdentifier, "event"),
                                    newGroup(vexo::VXReelixFolderGroupTypeIdentifier, "folder"),
                                    newGroup(vexo::VXReelixOldReelixProjectsGroupTypeIdentifier, "old")});
    const Group merged = newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "merged");
    merged->addChildGroup(newGroup(vexo::VXReelixFolderGroupTypeIdentifier, "new"));
    plugin().finishReloadReelixProjects(merged);
    EXPECT_THAT(namesOf(root->childGroups()), ElementsAre("event", "library", "new", "old", "year"));
    EXPECT_THAT(published, IsEmpty());
}

TEST_F(ProjectReload, FinishingKeepsTheOrderOfEqualNames) {
    const Group root = installRoot({newGroup(vexo::VXReelixEventGroupTypeIdentifier, "same")});
    const Group kept = root->childGroups().front();
    const Group merged = newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "merged");
    const Group first = newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "Same");
    const Group second = newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "SAME");
    merged->addChildGroups({first, second});
    plugin().finishReloadReelixProjects(merged);
    ASSERT_EQ(root->childGroups().size(), 3u);
    EXPECT_EQ(root->childGroups()[0], kept);
    EXPECT_EQ(root->childGroups()[1], first);
    EXPECT_EQ(root->childGroups()[2], second);
}

TEST_F(ProjectReload, NothingFoundLeavesTheProjectsWhileTheApplicationIsMissing) {
    setSearchPaths({home().makeFolder("one")});
    const Group root = installRoot({newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "old")});
    plugin()._reloadReelixProjects();
    EXPECT_THAT(namesOf(root->childGroups()), ElementsAre("old"));
    EXPECT_THAT(published, ElementsAre(root));  // the host is handed the tree all the same
}

TEST_F(ProjectReload, NothingFoundTakesTheProjectsAwayOnceTheApplicationIsThere) {
    installApplication();
    setSearchPaths({home().makeFolder("one")});
    const Group root = installRoot({newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "old")});
    plugin()._reloadReelixProjects();
    EXPECT_TRUE(root->childGroups().empty());
    EXPECT_TRUE(root->mediaObjects().empty());
    EXPECT_THAT(published, ElementsAre(root));
}

TEST_F(ProjectReload, NoProjectsButEventsTakeTheProjectsAwayWithoutTheApplication) {
    setSearchPaths({home().makeFolder("one")});
    const Group root = installRoot({newGroup(vexo::VXReelixProjectGroupTypeIdentifier, "old"),
                                    newGroup(vexo::VXReelixEventLibraryGroupTypeIdentifier, "events")});
    plugin()._reloadReelixProjects();
    EXPECT_THAT(namesOf(root->childGroups()), ElementsAre("events"));
}

// --- Volumes -----------------------------------------------------------------------------------------------

TEST_F(ProjectReload, APlainFolderOnAVolumeIsScannedForBothOfItsEntries) {
    environment.workspace.setVolumes({"/", home().makeFolder("Disk")});
    environment.mounts.list = {{home().path("Disk"), "/dev/x", "ext4", "Disk", false}};
    makeProject("Disk/Reelix Projects/Beach.qnproject", {"m.mov"});
    EXPECT_EQ(text(load()), R"(Root VXReelix "Reelix" <none> icon=MBReelixAppIconSmall
  * /Volumes/Disk/Reelix Projects/Beach.qnproject/Movies/m.mov "Beach"
  * /Volumes/Disk/Reelix Projects/Beach.qnproject/Movies/m.mov "Beach"
  Project /Volumes/Disk/Reelix Projects/Beach.qnproject "Beach" </Volumes/Disk/Reelix Projects> icon=Reelix-icon-project
    * /Volumes/Disk/Reelix Projects/Beach.qnproject/Movies/m.mov "m"
  Project /Volumes/Disk/Reelix Projects/Beach.qnproject "Beach" </Volumes/Disk/Reelix Projects> icon=Reelix-icon-project
    * /Volumes/Disk/Reelix Projects/Beach.qnproject/Movies/m.mov "m"
)");
}

TEST_F(ProjectReload, ALocalizedFolderOnAVolumeIsScannedOnce) {
    environment.workspace.setVolumes({"/", home().makeFolder("Disk")});
    environment.mounts.list = {{home().path("Disk"), "/dev/x", "ext4", "Disk", false}};
    makeProject("Disk/Reelix Projects.localized/Beach.qnproject");
    EXPECT_THAT(namesOf(load()->childGroups()), ElementsAre("Beach"));
}

TEST_F(ProjectReload, ARemovableVolumeShowsItsProjectsForEachOfItsFourEntries) {
    environment.workspace.setVolumes({"/", home().makeFolder("Stick")});
    environment.workspace.setRemovableMedia({home().path("Stick")});
    environment.mounts.list = {{home().path("Stick"), "/dev/x", "vfat", "Stick", true}};
    makeProject("Stick/Reelix Projects/Beach.qnproject");
    Strings ids;
    for (const Group& child : load()->childGroups())
        ids.push_back(inHome(child->ID().value()));
    EXPECT_THAT(ids, ElementsAre("/Volumes/Stick/Reelix Projects/Beach.qnproject",
                                 "/Volumes/Stick/Reelix Projects/Beach.qnproject",
                                 "home/Stick/Reelix Projects/Beach.qnproject",
                                 "home/Stick/Reelix Projects/Beach.qnproject"));
}

TEST_F(ProjectReload, ADisplayNameThatNoVolumeHasFindsNothing) {
    environment.workspace.setVolumes({"/", home().makeFolder("disk")});
    files.displayNames[home().path("disk")] = "Other";
    makeProject("disk/Reelix Projects/Beach.qnproject");
    EXPECT_TRUE(load()->childGroups().empty());
    EXPECT_EQ(environment.watcher.watchedAncestor("/Volumes/Other/Reelix Projects"),
              "/Volumes/Other/Reelix Projects");
}

TEST_F(ProjectReload, ProjectsOfAVolumeThatHasGoneGo) {
    environment.workspace.setVolumes({"/", home().makeFolder("Disk")});
    environment.mounts.list = {{home().path("Disk"), "/dev/x", "ext4", "Disk", false}};
    makeProject("Disk/Reelix Projects.localized/Beach.qnproject", {"m.mov"});
    makeProject("Movies/Reelix Projects/Home.qnproject", {"h.mov"});
    const Group root = load();
    EXPECT_THAT(namesOf(root->childGroups()), ElementsAre("Home", "Beach"));
    environment.mounts.list.clear();
    plugin()._reloadReelixProjects();
    EXPECT_THAT(namesOf(root->childGroups()), ElementsAre("Home"));
    EXPECT_EQ(root->mediaObjects().size(), 1u);
}

}  // namespace
