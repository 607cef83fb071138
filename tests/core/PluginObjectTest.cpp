// The plug-in object: what it answers of itself, what making it does, and what goes with it.
#include <set>
#include <thread>

#include "tests/core/SmallLibrary.h"

extern "C" const vexo::VXPrincipalClass* VXPluginPrincipalClass(const char* className);

namespace reelix {
namespace {

using platform::Locked;
using testing::ElementsAre;
using testing::IsEmpty;
using testing_support::ExposedPlugin;

class PluginObjectTest : public testing_support::SmallLibraryTest {
  protected:
    static constexpr const char* priorityKey = "MediaBrowserThreadPriorityFolderMediaManager";

    // The priority of a plug-in that is made while the user's default has a value.
    double priorityWith(const platform::Value& userDefault) {
        environment.userDefaults.setForProcess(priorityKey, userDefault);
        return newPlugin()->loadThreadPriority();
    }
    std::vector<std::string> namesOf(const VXReelixPlugin::Groups& groups) {
        std::vector<std::string> names;
        for (const auto& group : groups)
            names.push_back(group->name().value_or("<none>"));
        return names;
    }
};

// --- Identity ----------------------------------------------------------------------------------------------

TEST_F(PluginObjectTest, SaysWhatItIs) {
    EXPECT_FALSE(VXReelixPlugin::isManagedMediaSource());
    EXPECT_EQ(plugin().rootMediaGroupTitle(), "Reelix");
    EXPECT_EQ(plugin().mediaTypesSupported(), 4u);
    EXPECT_EQ(plugin().uniqueID(), "Reelix Media Manager");
    EXPECT_THAT(environment.log.lines(), IsEmpty());
}

TEST_F(PluginObjectTest, TheTitleIsNotTranslated) {
    environment.bundle->replacedStrings["Reelix"] = "Another";
    EXPECT_EQ(plugin().rootMediaGroupTitle(), "Reelix");
}

TEST_F(PluginObjectTest, TheDeprecatedDisplayNameLogsAndAnswersTheTitle) {
    EXPECT_EQ(plugin().displayName(), "Reelix");
    EXPECT_THAT(environment.log.lines(),
                ElementsAre("Call to deprecated method VXReelixPlugin::displayName. Please update your code "
                            "to use VXReelixPlugin:rootMediaGroupTitle:"));
}

TEST_F(PluginObjectTest, TheDeprecatedDisplayImageLogsAndAnswersTheRootIcon) {
    const platform::ImageRef icon = plugin().displayImage();
    EXPECT_NE(icon, nullptr);
    EXPECT_EQ(icon, plugin().rootMediaGroupIcon());
    EXPECT_THAT(environment.log.lines(),
                ElementsAre("Call to deprecated method VXReelixPlugin::displayImage. Please update your code "
                            "to use VXReelixPlugin:rootMediaGroupIcon:"));
}

TEST_F(PluginObjectTest, TheModuleMakesThePrincipalClassByName) {
    const vexo::VXPrincipalClass* principalClass = VXPluginPrincipalClass("VXReelixPlugin");
    ASSERT_NE(principalClass, nullptr);
    EXPECT_FALSE(principalClass->isManagedMediaSource());
    EXPECT_EQ(principalClass->versionNumber, 507.3);
    EXPECT_STREQ(principalClass->versionString, "@(#)PROGRAM:Reelix  PROJECT:Vexo-507.3\n");
    const auto made = principalClass->newObject(environment.bundle);
    ASSERT_NE(made, nullptr);
    EXPECT_EQ(made->uniqueID(), "Reelix Media Manager");
    EXPECT_TRUE(made->autoReloadEnabled());
}

TEST_F(PluginObjectTest, TheModuleKnowsNoOtherClass) {
    EXPECT_EQ(VXPluginPrincipalClass("VXMediaManager"), nullptr);
    EXPECT_EQ(VXPluginPrincipalClass(""), nullptr);
}

TEST(ReelixConstantsTest, NamesAreThoseThatOthersKnow) {
    EXPECT_EQ(Reelix_icon_calendar, "Reelix-icon-calendar");
    EXPECT_EQ(Reelix_icon_event, "Reelix-icon-event");
    EXPECT_EQ(Reelix_icon_project, "Reelix-icon-project");
    EXPECT_EQ(Reelix_icon_trailer, "Reelix-icon-trailer");
    EXPECT_EQ(List_Icons_Library, "List-Icons-Library");
    EXPECT_EQ(MBReelixAppIconSmall, "MBReelixAppIconSmall");
    EXPECT_EQ(MBReelixIcon, "MBReelixIcon");
    EXPECT_EQ(ReelixApplicationName, "Reelix");
    EXPECT_EQ(ReelixEventsFolderName, "Reelix Events");
    EXPECT_EQ(ReelixProjectsFolderName, "Reelix Projects");
    EXPECT_EQ(ReelixProjectsFolderNameLoc, "Reelix Projects.localized");
    EXPECT_EQ(VXReelixEventCreationYear, "ReelixEventCreationYear");
    EXPECT_EQ(VXReelixEventOldestClipDate, "ReelixEventOldestClipDate");
    EXPECT_EQ(VXReelixEventNewestClipDate, "ReelixEventNewestClipDate");
    EXPECT_EQ(vxMBReelixPluginVersionNumber, 507.3);
}

TEST(ReelixConstantsTest, TheHostsConstantsAreDistinct) {
    const std::vector<const vexo::VXGroupTypeIdentifier*> types{
        &vexo::VXReelixRootGroupTypeIdentifier,
        &vexo::VXReelixProjectGroupTypeIdentifier,
        &vexo::VXReelixProjectLibraryGroupTypeIdentifier,
        &vexo::VXReelixFolderGroupTypeIdentifier,
        &vexo::VXReelixOldReelixProjectsGroupTypeIdentifier,
        &vexo::VXReelixEventLibraryGroupTypeIdentifier,
        &vexo::VXReelixEventCalendarGroupTypeIdentifier,
        &vexo::VXReelixEventGroupTypeIdentifier};
    std::set<std::string> texts;
    for (const auto* type : types) {
        texts.insert(type->text());
        EXPECT_EQ(
            std::count_if(types.begin(), types.end(), [&](const auto* other) { return *type == *other; }), 1);
    }
    EXPECT_EQ(texts.size(), types.size());

    const std::vector<std::string_view> keys{vexo::VXMediaObjectDurationKey,
                                             vexo::VXMediaObjectResolutionKey,
                                             vexo::VXMediaObjectResolutionStringKey,
                                             vexo::VXReelixProjectPathKey,
                                             vexo::VXReelixProjectFormatVersion,
                                             vexo::VXReelixProjectRepresentative,
                                             vexo::VXPluginDefaultLoadingStringKey,
                                             vexo::VXPluginDefaultNoDataStringKey,
                                             vexo::VXSuitePrefsDomainName,
                                             vexo::VXSuitePrefsPath,
                                             vexo::VXReelix};
    EXPECT_EQ(std::set<std::string_view>(keys.begin(), keys.end()).size(), keys.size());
}

TEST(ReelixConstantsTest, TypesWithTheSameTextAreStillDifferent) {
    static const vexo::VXGroupTypeIdentifier copy{vexo::VXReelixEventGroupTypeIdentifier.text()};
    EXPECT_FALSE(copy == vexo::VXReelixEventGroupTypeIdentifier);
}

// --- Making the object -------------------------------------------------------------------------------------

TEST_F(PluginObjectTest, ANewObjectHasLocksAndNoLists) {
    ExposedPlugin& made = plugin();
    EXPECT_NE(made._appIconLock, nullptr);
    EXPECT_NE(made._updatePreferencesLock, nullptr);
    EXPECT_TRUE(made._mostRecentEventFirst);
    EXPECT_FALSE(made._poolingProjectsReload);
    EXPECT_FALSE(made._poolingEventsReload);
    EXPECT_FALSE(made._missingReelixDefaultPath);
    EXPECT_EQ(made._ReelixAppVersionString, std::nullopt);
    EXPECT_THAT(made.cachedIcons, IsEmpty());
    Locked monitor(made._monitor);
    EXPECT_EQ(made._ReelixSearchPaths, nullptr);
    EXPECT_EQ(made._ReelixEventsSearchPaths, nullptr);
    EXPECT_EQ(made._flatEventGroupsList, nullptr);
    EXPECT_EQ(made._flatProjectGroupsList, nullptr);
}

TEST_F(PluginObjectTest, ANewObjectAsksToBeReloadedButDoesNotBeginByItself) {
    EXPECT_TRUE(plugin().needsReload());
    EXPECT_TRUE(plugin().autoReloadEnabled());
    EXPECT_TRUE(plugin().firstTimeCallingLoadData());
    EXPECT_FALSE(plugin().isLoading());
    EXPECT_EQ(plugin().rootMediaGroup(), nullptr);
    EXPECT_THAT(environment.dispatcher.requests(), IsEmpty());
}

TEST_F(PluginObjectTest, LoadsRunAtNormalPriorityWhereTheUserHasNoDefault) {
    EXPECT_EQ(plugin().loadThreadPriority(), 0.5);
}

TEST_F(PluginObjectTest, ThePriorityInTheUsersDefaultsIsTakenFromZeroToOneInclusive) {
    EXPECT_EQ(priorityWith(0.0), 0.0);
    EXPECT_EQ(priorityWith(1.0), 1.0);
    EXPECT_EQ(priorityWith(0.25), 0.25);
    EXPECT_EQ(priorityWith(0), 0.0);
    EXPECT_EQ(priorityWith(1), 1.0);
}

TEST_F(PluginObjectTest, APriorityOutsideOfZeroToOneIsLeftAlone) {
    EXPECT_EQ(priorityWith(1.5), 0.5);
    EXPECT_EQ(priorityWith(-0.1), 0.5);
    EXPECT_EQ(priorityWith(std::nextafter(1.0, 2.0)), 0.5);
    EXPECT_EQ(priorityWith(-std::numeric_limits<double>::denorm_min()), 0.5);
    EXPECT_EQ(priorityWith(std::numeric_limits<double>::infinity()), 0.5);
    EXPECT_EQ(priorityWith(std::numeric_limits<double>::quiet_NaN()), 0.5);
    EXPECT_EQ(priorityWith(2), 0.5);
}

TEST_F(PluginObjectTest, APriorityGivenAsTextCountsByTheNumberItBeginsWith) {
    EXPECT_EQ(priorityWith("0.75"), 0.75);
    EXPECT_EQ(priorityWith(" 0.75 of it"), 0.75);
    EXPECT_EQ(priorityWith("1.5"), 0.5);
    EXPECT_EQ(priorityWith("high"), 0.0);
    EXPECT_EQ(priorityWith(""), 0.0);
}

TEST_F(PluginObjectTest, APriorityOfAnotherKindIsLeftAlone) {
    EXPECT_EQ(priorityWith(platform::Array{0.25}), 0.5);
    EXPECT_EQ(priorityWith(platform::Dictionary{}), 0.5);
    EXPECT_EQ(priorityWith(platform::Data{}), 0.5);
}

TEST_F(PluginObjectTest, ALoadRunsAtThePriorityInTheUsersDefaults) {
    environment.userDefaults.setForProcess(priorityKey, 0.125);
    plugin().loadData();
    EXPECT_EQ(environment.dispatcher.requests().back().priority, 0.125);
}

// --- Lists -------------------------------------------------------------------------------------------------

TEST_F(PluginObjectTest, ThereIsNoApplicationVersion) {
    EXPECT_EQ(plugin().ReelixApplicationVersion(), std::nullopt);
    load();
    EXPECT_EQ(plugin().ReelixApplicationVersion(), std::nullopt);
}

TEST_F(PluginObjectTest, ThereAreNoMediaGroupsBeforeALoad) {
    EXPECT_THAT(plugin().mediaGroups(), IsEmpty());
    EXPECT_THAT(plugin().ReelixFolders(), IsEmpty());
    EXPECT_THAT(plugin().movieGroups(), IsEmpty());
}

TEST_F(PluginObjectTest, MediaGroupsAreTheEventsOnlyUntilProjectsWereScanned) {
    makeEvent("Beach", 2008);
    ExposedPlugin& reelix = plugin();
    {
        Locked monitor(reelix._monitor);
        reelix._prepareReelixEventsSearchPaths();
    }
    reelix._reloadReelixEvents(std::nullopt, /*updateRootMediaGroup=*/false);
    EXPECT_THAT(namesOf(reelix.mediaGroups()), ElementsAre("Beach"));
}

TEST_F(PluginObjectTest, MediaGroupsAreTheProjectsOnlyUntilEventsWereScanned) {
    makeProject("Trip");
    ExposedPlugin& reelix = plugin();
    {
        Locked monitor(reelix._monitor);
        reelix._prepareReelixProjectsSearchPaths();
        reelix._ReelixSearchPaths->resize(1);  // leaves out the empty libraries of the start-up volume
    }
    reelix._reloadReelixProjects(/*updateRoot=*/false);
    EXPECT_THAT(namesOf(reelix.mediaGroups()), ElementsAre("Trip"));
}

TEST_F(PluginObjectTest, EventsComeBeforeProjectsAmongTheMediaGroups) {
    makeProject("A trip");
    makeEvent("Zoo", 2008);
    load();
    ExposedPlugin& reelix = plugin();
    VXReelixPlugin::Groups expected;
    {
        Locked monitor(reelix._monitor);
        expected = *reelix._flatEventGroupsList;
        expected.insert(expected.end(), reelix._flatProjectGroupsList->begin(),
                        reelix._flatProjectGroupsList->end());
    }
    EXPECT_EQ(reelix.mediaGroups(), expected);
    EXPECT_EQ(reelix.ReelixFolders(), expected);
    EXPECT_EQ(reelix.movieGroups(), expected);
    // The libraries at the top of the start-up volume are empty and known by their placeholders.
    EXPECT_THAT(namesOf(expected), ElementsAre("Zoo", "A trip", "Reelix Projects", "Reelix Projects"));
}

TEST_F(PluginObjectTest, MediaGroupsAreTheCallersOwnList) {
    makeEvent("Beach", 2008);
    load();
    const std::size_t count = plugin().mediaGroups().size();
    plugin().mediaGroups().clear();
    EXPECT_EQ(plugin().mediaGroups().size(), count);
}

TEST_F(PluginObjectTest, MediaGroupsNeverShowAScanHalfDone) {
    for (const char* name : {"A", "B", "C"}) {
        makeProject(name);
        makeEvent(name, 2008);
    }
    load();
    ExposedPlugin& reelix = plugin();
    const std::size_t expected = reelix.mediaGroups().size();
    ASSERT_EQ(expected, 8u);

    std::atomic<int> running = 3;
    const auto scanning = [&running](const std::function<void()>& scan) {
        return std::thread([&running, scan] {
            for (int i = 0; i < 10; ++i)
                scan();
            --running;
        });
    };
    std::thread threads[] = {
        scanning([&] { reelix._reloadReelixProjects(); }),
        scanning([&] { reelix._reloadReelixEvents(); }),
        scanning([&] { reelix.performLoadData(); }),
    };
    while (running > 0)
        EXPECT_EQ(reelix.mediaGroups().size(), expected);
    for (std::thread& thread : threads)
        thread.join();
}

// --- The end of the object ---------------------------------------------------------------------------------

TEST_F(PluginObjectTest, TheIconsGoWithTheObject) {
    plugin();
    IconCache& icons = iconCache();
    const IconSlot* slots[] = {
        &icons.smallApplicationIcon, &icons.projectIcon,  &icons.trailerIcon, &icons.spareProjectIcon,
        &icons.spareTrailerIcon,     &icons.calendarIcon, &icons.eventIcon,   &icons.reelixIcon};
    for (const IconSlot* slot : slots)
        EXPECT_NE(slot->get(), nullptr);
    dropPlugin();
    for (const IconSlot* slot : slots)
        EXPECT_EQ(slot->get(), nullptr);
}

TEST_F(PluginObjectTest, FourDefaultPathsGoWithTheObjectAndTheLocalizedProjectPathStays) {
    plugin()._oldReelixDefaultPath();
    plugin()._ReelixDefaultPath();
    plugin()._ReelixDefaultPath2();
    plugin()._ReelixDefaultEventsFolderPath();
    plugin()._ReelixDefaultEventsFolderPath2();
    dropPlugin();
    const DefaultPathCache& paths = defaultPathCache();
    EXPECT_EQ(paths.oldDefaultPath.get(), std::nullopt);
    EXPECT_EQ(paths.defaultPath.get(), std::nullopt);
    EXPECT_EQ(paths.defaultPath2.get(), home().path("Movies/Reelix Projects.localized"));
    EXPECT_EQ(paths.defaultEventsFolderPath.get(), std::nullopt);
    EXPECT_EQ(paths.defaultEventsFolderPath2.get(), std::nullopt);
}

TEST_F(PluginObjectTest, ALaterObjectFindsFourPathsAnewAndTakesTheLocalizedProjectPathOver) {
    plugin()._ReelixDefaultPath2();
    dropPlugin();
    environment.setHomeDirectory("/elsewhere");
    EXPECT_EQ(plugin()._oldReelixDefaultPath(), "/elsewhere/Movies");
    EXPECT_EQ(plugin()._ReelixDefaultPath(), "/elsewhere/Movies/Reelix Projects");
    EXPECT_EQ(plugin()._ReelixDefaultPath2(), home().path("Movies/Reelix Projects.localized"));
    EXPECT_EQ(plugin()._ReelixDefaultEventsFolderPath(), "/elsewhere/Movies/Reelix Events");
    EXPECT_EQ(plugin()._ReelixDefaultEventsFolderPath2(), "/elsewhere/Movies/Reelix Events.localized");
}

TEST_F(PluginObjectTest, ALaterObjectLoadsTheIconsAnew) {
    plugin();
    const platform::ImageRef before = iconCache().eventIcon.get();
    dropPlugin();
    plugin();
    const platform::ImageRef after = iconCache().eventIcon.get();
    EXPECT_NE(after, nullptr);
    EXPECT_NE(after, before);
}

TEST_F(PluginObjectTest, ALaterObjectLoadsTheSameTree) {
    makeProject("Trip");
    makeEvent("Beach", 2008);
    load();
    const std::string before = tree();
    dropPlugin();
    load();
    EXPECT_EQ(tree(), before);
}

TEST_F(PluginObjectTest, APendingReloadKeepsTheObjectUntilItHasRun) {
    storeEventOrder(false);
    std::weak_ptr<ExposedPlugin> watched = newPlugin();
    ASSERT_FALSE(watched.expired());
    environment.dispatcher.advance(std::chrono::seconds(5) - std::chrono::nanoseconds(1));
    EXPECT_FALSE(watched.expired());
    EXPECT_NE(iconCache().eventIcon.get(), nullptr);
    environment.dispatcher.advance(std::chrono::nanoseconds(1));
    EXPECT_TRUE(watched.expired());
    EXPECT_EQ(iconCache().eventIcon.get(), nullptr);
}

TEST_F(PluginObjectTest, AMountAfterTheEndOfTheObjectReachesNobody) {
    plugin().loadData();
    environment.dispatcher.runDueBlocks();
    dropPlugin();
    const std::size_t before = environment.dispatcher.requests().size();
    environment.workspace.mount("/media/disk");
    EXPECT_EQ(environment.dispatcher.requests().size(), before);
}

}  // namespace
}  // namespace reelix
