// The order of events in the suite's preferences, and the reload that a change of it leads to.
#include <atomic>
#include <thread>

#include "platform/Services.h"
#include "platform/UserDefaults.h"
#include "tests/core/SmallLibrary.h"

namespace reelix {
namespace {

using platform::RunLoopMode;
using std::chrono::nanoseconds;
using std::chrono::seconds;
using testing::ElementsAre;
using testing::IsEmpty;
using testing_support::ExposedPlugin;
using testing_support::VirtualDispatcher;

using Request = VirtualDispatcher::Request;
using Place = VirtualDispatcher::Place;

class PreferencesTest : public testing_support::SmallLibraryTest {
  protected:
    void checkInBackground() {
        inBackground([this] { plugin()._checkReelixPreferences(); });
    }
    // The years of the event library in the order of the tree.
    std::vector<std::string> years() {
        std::vector<std::string> names;
        for (const auto& child : plugin().rootMediaGroup()->childGroups()) {
            if (child->typeIdentifier() != vexo::VXReelixEventLibraryGroupTypeIdentifier)
                continue;
            for (const auto& year : child->childGroups())
                names.push_back(year->name().value_or("<none>"));
        }
        return names;
    }
    // How often the tree is published from now on.
    void countPublishing() {
        plugin().addTreeObserver(observer_, [this](const auto&) { ++published; });
    }

    // What a check leads to: nothing, or one reload.
    void expectOrderStaysAndNothingIsScheduled() {
        EXPECT_TRUE(plugin()._mostRecentEventFirst);
        EXPECT_FALSE(plugin()._poolingEventsReload);
        EXPECT_THAT(environment.dispatcher.requests(), IsEmpty());
    }

    int published = 0;

  private:
    const std::shared_ptr<int> observer_ = std::make_shared<int>();
};

// --- What is stored ----------------------------------------------------------------------------------------

TEST_F(PreferencesTest, WithoutTheSuitesPreferencesTheNewestEventsComeFirst) {
    expectOrderStaysAndNothingIsScheduled();
}

TEST_F(PreferencesTest, WithoutTheReelixDictionaryTheOrderStays) {
    environment.userDefaults.storeDomain(std::string(vexo::VXSuitePrefsDomainName),
                                         {{"dateSortReverse", false}});
    expectOrderStaysAndNothingIsScheduled();
}

TEST_F(PreferencesTest, WithoutTheKeyTheOrderStays) {
    storeReelixPreferences(platform::Dictionary{{"dateSort", platform::Value(false)}});
    expectOrderStaysAndNothingIsScheduled();
}

TEST_F(PreferencesTest, AReelixEntryThatIsNoDictionaryLeavesTheOrder) {
    storeReelixPreferences("dateSortReverse");
    expectOrderStaysAndNothingIsScheduled();
}

TEST_F(PreferencesTest, AnOrderThatIsNoBooleanLeavesTheOrder) {
    storeEventOrder(platform::Array{false});
    expectOrderStaysAndNothingIsScheduled();
}

TEST_F(PreferencesTest, AnotherDomainDoesNotCount) {
    environment.userDefaults.storeDomain(
        "com.vexo.browser", {{"Reelix", platform::Dictionary{{"dateSortReverse", platform::Value(false)}}}});
    expectOrderStaysAndNothingIsScheduled();
}

TEST_F(PreferencesTest, TheOrderThatIsTheDefaultSchedulesNothing) {
    storeEventOrder(true);
    expectOrderStaysAndNothingIsScheduled();
}

TEST_F(PreferencesTest, NumbersAndTextsAreTakenForTheirTruth) {
    for (const platform::Value& no : {platform::Value(0), platform::Value(0.0), platform::Value("NO")}) {
        storeEventOrder(no);
        EXPECT_FALSE(newPlugin()->_mostRecentEventFirst);
    }
    for (const platform::Value& yes : {platform::Value(1), platform::Value("YES"), platform::Value("1")}) {
        storeEventOrder(yes);
        EXPECT_TRUE(newPlugin()->_mostRecentEventFirst);
    }
}

TEST_F(PreferencesTest, EditsByOtherProgramsAreSeen) {
    plugin();
    storeEventOrder(false);
    EXPECT_TRUE(plugin()._mostRecentEventFirst);
    plugin()._checkReelixPreferences();
    EXPECT_FALSE(plugin()._mostRecentEventFirst);
}

// --- The reload --------------------------------------------------------------------------------------------

TEST_F(PreferencesTest, TheOldestFirstAtStartSchedulesOneReloadOnTheMainRunLoopInBothModes) {
    storeEventOrder(false);
    EXPECT_FALSE(plugin()._mostRecentEventFirst);
    EXPECT_TRUE(plugin()._poolingEventsReload);
    EXPECT_THAT(environment.dispatcher.requests(),
                ElementsAre(Request{
                    .place = Place::mainRunLoop,
                    .delay = seconds(5),
                    .modes = {RunLoopMode::kCFRunLoopCommonModes, RunLoopMode::NSModalPanelRunLoopMode}}));
}

TEST_F(PreferencesTest, TheReloadRunsFiveSecondsLaterAndTakesItsFlagBack) {
    storeEventOrder(false);
    plugin();
    environment.dispatcher.advance(seconds(5) - nanoseconds(1));
    EXPECT_TRUE(plugin()._poolingEventsReload);
    environment.dispatcher.advance(nanoseconds(1));
    EXPECT_FALSE(plugin()._poolingEventsReload);
    EXPECT_EQ(environment.dispatcher.pendingCount(), 0u);
}

TEST_F(PreferencesTest, OffTheMainThreadTheReloadRunsInTheBackground) {
    storeEventOrder(false);
    inBackground([this] { plugin(); });
    EXPECT_THAT(environment.dispatcher.requests(),
                ElementsAre(Request{.place = Place::background},
                            Request{.place = Place::background, .delay = seconds(5)}));
}

TEST_F(PreferencesTest, ALaterCheckOnTheMainThreadUsesItsRunLoopToo) {
    plugin();
    storeEventOrder(false);
    plugin()._checkReelixPreferences();
    EXPECT_EQ(environment.dispatcher.requests().back().place, Place::mainRunLoop);
    EXPECT_EQ(environment.dispatcher.requests().back().delay, seconds(5));
}

TEST_F(PreferencesTest, AChangeOfTheOrderIsShownByTheReloadAndNotBefore) {
    makeEvent("Beach", 2007);
    makeEvent("Zoo", 2009);
    load();
    countPublishing();
    storeEventOrder(false);
    checkInBackground();
    EXPECT_THAT(years(), ElementsAre("2009", "2007"));
    environment.dispatcher.advance(seconds(5));
    EXPECT_THAT(years(), ElementsAre("2007", "2009"));
    EXPECT_EQ(published, 1);
}

TEST_F(PreferencesTest, TwoChangesWithinFiveSecondsAreOneReloadWithTheLastOrder) {
    makeEvent("Beach", 2007);
    makeEvent("Zoo", 2009);
    load();
    countPublishing();
    storeEventOrder(false);
    checkInBackground();
    environment.dispatcher.advance(seconds(3));
    storeEventOrder(true);
    checkInBackground();
    EXPECT_EQ(environment.dispatcher.pendingCount(), 1u);
    EXPECT_TRUE(plugin()._mostRecentEventFirst);

    environment.dispatcher.advance(seconds(2));
    EXPECT_EQ(published, 1);
    EXPECT_THAT(years(), ElementsAre("2009", "2007"));
    environment.dispatcher.advance(seconds(60));
    EXPECT_EQ(published, 1);
}

TEST_F(PreferencesTest, AChangeDuringAnyPendingEventReloadIsLeftToIt) {
    plugin()._poolingEventsReload = true;
    storeEventOrder(false);
    plugin()._checkReelixPreferences();
    EXPECT_FALSE(plugin()._mostRecentEventFirst);
    EXPECT_THAT(environment.dispatcher.requests(), IsEmpty());
}

TEST_F(PreferencesTest, AChangeAfterTheReloadSchedulesAnother) {
    storeEventOrder(false);
    plugin();
    environment.dispatcher.advance(seconds(5));
    storeEventOrder(true);
    plugin()._checkReelixPreferences();
    EXPECT_EQ(environment.dispatcher.pendingCount(), 1u);
    EXPECT_TRUE(plugin()._poolingEventsReload);
}

TEST_F(PreferencesTest, AnUnchangedOrderSchedulesNoSecondReload) {
    storeEventOrder(false);
    plugin();
    environment.dispatcher.advance(seconds(5));
    plugin()._checkReelixPreferences();
    EXPECT_EQ(environment.dispatcher.pendingCount(), 0u);
}

// Preferences that tell whether two threads ever read them at once.
class CrowdedDefaults final : public platform::UserDefaults {
  public:
    explicit CrowdedDefaults(platform::UserDefaults& defaults) : defaults_(defaults) {}
    void synchronize() override {
        ++readers_;
        if (testing_support::happensSoon([this] { return readers_ > 1; }))
            wasCrowded = true;
        defaults_.synchronize();
    }
    std::optional<platform::Dictionary> persistentDomainForName(std::string_view name) override {
        auto domain = defaults_.persistentDomainForName(name);
        --readers_;
        return domain;
    }
    std::optional<platform::Value> objectForKey(std::string_view key) override {
        return defaults_.objectForKey(key);
    }

    std::atomic<bool> wasCrowded = false;

  private:
    platform::UserDefaults& defaults_;
    std::atomic<int> readers_ = 0;
};

TEST_F(PreferencesTest, ChecksOnManyThreadsComeOneAfterAnotherAndScheduleOneReload) {
    ExposedPlugin& reelix = plugin();
    storeEventOrder(false);
    CrowdedDefaults defaults(environment.userDefaults);
    const platform::Services& services = platform::services();
    const platform::ServicesScope scope(platform::Services{services.fileManager, services.workspace, defaults,
                                                           services.dispatcher, services.notificationCenter,
                                                           services.systemLog});
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i)
        threads.emplace_back([&reelix] { reelix._checkReelixPreferences(); });
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_FALSE(defaults.wasCrowded);
    EXPECT_THAT(environment.dispatcher.requests(),
                ElementsAre(Request{.place = Place::background, .delay = seconds(5)}));
}

}  // namespace
}  // namespace reelix
