#include "events/EventOrder.h"

#include "core/StableSort.h"
#include "tests/events/EventsTest.h"

namespace testing_support {
namespace {

using platform::ComparisonResult;
using vexo::VXMediaGroup;
using vexo::VXMediaGroupRef;
namespace order = reelix::ReelixSupport;

constexpr auto ascending = ComparisonResult::ascending;
constexpr auto same = ComparisonResult::same;
constexpr auto descending = ComparisonResult::descending;

// What an event is compared by; dates as seconds. A nil is a missing attribute.
struct Event {
    std::optional<std::string> name;
    std::optional<int> year = {};
    std::optional<double> oldest = {};
    std::optional<double> newest = {};
};

VXMediaGroupRef group(const Event& event,
                      const vexo::VXGroupTypeIdentifier& type = vexo::VXReelixEventGroupTypeIdentifier) {
    auto made = std::make_shared<VXMediaGroup>(type, "ID");
    made->setName(event.name);
    platform::Dictionary attributes;
    if (event.year)
        attributes.insert_or_assign("ReelixEventCreationYear", *event.year);
    if (event.oldest)
        attributes.insert_or_assign("ReelixEventOldestClipDate",
                                    platform::Date::sinceReferenceDate(*event.oldest));
    if (event.newest)
        attributes.insert_or_assign("ReelixEventNewestClipDate",
                                    platform::Date::sinceReferenceDate(*event.newest));
    made->setAttributes(std::move(attributes));
    return made;
}

ComparisonResult oldestFirst(const Event& a, const Event& b) {
    return order::_eventComparisonByYearOldestFirst(group(a), group(b));
}

ComparisonResult newestFirst(const Event& a, const Event& b) {
    return order::_eventComparisonByYearNewestFirst(group(a), group(b));
}

ComparisonResult alphabetically(const Event& a, const Event& b) {
    return order::_eventComparisonAlphabetically(group(a), group(b));
}

template <typename Comparison>
std::string sortedNames(const std::vector<VXMediaGroupRef>& groups, Comparison comparison) {
    std::string names;
    for (const VXMediaGroupRef& each : reelix::stableSorted(groups, comparison))
        names += (names.empty() ? "" : ", ") + each->name().value_or("<none>");
    return names;
}

std::vector<VXMediaGroupRef> groups(std::initializer_list<Event> events) {
    std::vector<VXMediaGroupRef> made;
    for (const Event& event : events)
        made.push_back(group(event));
    return made;
}

TEST(OldestFirst, EarlierYearsComeFirstWhateverTheDates) {
    EXPECT_EQ(oldestFirst({"a", 2008, 9, 9}, {"b", 2009, 1, 1}), ascending);
    EXPECT_EQ(oldestFirst({"a", 2009, 1, 1}, {"b", 2008, 9, 9}), descending);
    EXPECT_EQ(oldestFirst({"a", -1}, {"b", 0}), ascending);
}

TEST(OldestFirst, InAYearTheEarlierOldestClipComesFirst) {
    EXPECT_EQ(oldestFirst({"b", 2008, 1, 9}, {"a", 2008, 2, 3}), ascending);
    EXPECT_EQ(oldestFirst({"b", 2008, 2, 3}, {"a", 2008, 1, 9}), descending);
    EXPECT_EQ(oldestFirst({"b", 2008, 1.25}, {"a", 2008, 1.5}), ascending);
}

TEST(OldestFirst, EqualOldestClipsAreOrderedByNameIgnoringCase) {
    EXPECT_EQ(oldestFirst({"beach", 2008, 1, 9}, {"Camping", 2008, 1, 2}), ascending);
    EXPECT_EQ(oldestFirst({"Camping", 2008, 1}, {"beach", 2008, 1}), descending);
    EXPECT_EQ(oldestFirst({"BEACH", 2008, 1}, {"beach", 2008, 1}), same);
}

TEST(OldestFirst, EventsWithoutAYearAreTheSameAsAll) {
    EXPECT_EQ(oldestFirst({"a", {}, 1, 1}, {"b", 2008, 2, 2}), same);
    EXPECT_EQ(oldestFirst({"a", 2008, 1, 1}, {"b", {}, 2, 2}), same);
    EXPECT_EQ(oldestFirst({"a"}, {"b"}), same);
}

TEST(OldestFirst, EventsOfAYearWithoutAnOldestClipAreTheSame) {
    EXPECT_EQ(oldestFirst({"a", 2008, {}, 1}, {"b", 2008, 2, 2}), same);
    EXPECT_EQ(oldestFirst({"a", 2008, 1, 1}, {"b", 2008, {}, 2}), same);
    EXPECT_EQ(oldestFirst({"a", 2008, {}, 1}, {"b", 2009, {}, 2}), ascending);
}

TEST(NewestFirst, LaterYearsComeFirstWhateverTheDates) {
    EXPECT_EQ(newestFirst({"a", 2009, 1, 1}, {"b", 2008, 9, 9}), ascending);
    EXPECT_EQ(newestFirst({"a", 2008, 9, 9}, {"b", 2009, 1, 1}), descending);
}

TEST(NewestFirst, InAYearTheLaterNewestClipComesFirst) {
    EXPECT_EQ(newestFirst({"b", 2008, 1, 9}, {"a", 2008, 2, 3}), ascending);
    EXPECT_EQ(newestFirst({"b", 2008, 2, 3}, {"a", 2008, 1, 9}), descending);
}

TEST(NewestFirst, EqualNewestClipsAreOrderedByNameFromAToZ) {
    EXPECT_EQ(newestFirst({"beach", 2008, 1, 5}, {"Camping", 2008, 2, 5}), ascending);
    EXPECT_EQ(newestFirst({"Camping", 2008, 1, 5}, {"beach", 2008, 2, 5}), descending);
    EXPECT_EQ(newestFirst({"BEACH", 2008, 1, 5}, {"beach", 2008, 2, 5}), same);
}

TEST(NewestFirst, EventsWithoutAYearAreTheSameAsAll) {
    EXPECT_EQ(newestFirst({"a", {}, 1, 1}, {"b", 2008, 2, 2}), same);
    EXPECT_EQ(newestFirst({"a", 2008, 1, 1}, {"b", {}, 2, 2}), same);
}

TEST(NewestFirst, TheOldestClipMustBePresentThoughTheNewestIsCompared) {
    EXPECT_EQ(newestFirst({"a", 2008, {}, 1}, {"b", 2008, 1, 2}), same);
    EXPECT_EQ(newestFirst({"a", 2008, 1, 1}, {"b", 2008, {}, 2}), same);
}

TEST(NewestFirst, AMissingNewestClipLeavesTheNameToDecide) {
    EXPECT_EQ(newestFirst({"b", 2008, 1, {}}, {"a", 2008, 1, 2}), descending);
    EXPECT_EQ(newestFirst({"a", 2008, 1, {}}, {"b", 2008, 1, 2}), ascending);
}

TEST(Alphabetically, NamesDecideIgnoringCase) {
    EXPECT_EQ(alphabetically({"beach"}, {"Camping"}), ascending);
    EXPECT_EQ(alphabetically({"Camping"}, {"beach"}), descending);
    EXPECT_EQ(alphabetically({"Beach"}, {"bEACH"}), same);
}

TEST(Alphabetically, AMissingNameIsTheSameAsAll) {
    EXPECT_EQ(alphabetically({std::nullopt}, {"a"}), same);
    EXPECT_EQ(alphabetically({"a"}, {std::nullopt}), same);
}

TEST(Alphabetically, NamesBeyondASCIICompareWithoutCase) {
    EXPECT_EQ(alphabetically({"ÉTÉ"}, {"été"}), same);
    EXPECT_EQ(alphabetically({"\u00e9"}, {"e\u0301"}), same);  // composed and decomposed
    EXPECT_EQ(alphabetically({"ЛЕТО"}, {"лето"}), same);
    EXPECT_EQ(alphabetically({"ähre"}, {"ÖL"}), ascending);
    EXPECT_EQ(alphabetically({"\xff"}, {"a"}), descending);  // bytes that are no text do no harm
}

TEST(RootChildren, TheEventLibraryIsLastAndOthersAreOrderedByName) {
    const std::vector<VXMediaGroupRef> children{
        group({"banana"}, vexo::VXReelixProjectGroupTypeIdentifier),
        group({"Aardvark"}, vexo::VXReelixEventLibraryGroupTypeIdentifier),
        group({"Cherry"}, vexo::VXReelixFolderGroupTypeIdentifier),
        group({"apple"}, vexo::VXReelixProjectGroupTypeIdentifier)};
    EXPECT_EQ(sortedNames(children, order::_ReelixRootGroupComparison), "apple, banana, Cherry, Aardvark");
}

TEST(RootChildren, OfTwoEventLibrariesEachComesAfterTheOther) {
    const auto first = group({"a"}, vexo::VXReelixEventLibraryGroupTypeIdentifier);
    const auto second = group({"b"}, vexo::VXReelixEventLibraryGroupTypeIdentifier);
    EXPECT_EQ(order::_ReelixRootGroupComparison(first, second), descending);
    EXPECT_EQ(order::_ReelixRootGroupComparison(second, first), descending);
    EXPECT_EQ(order::_ReelixRootGroupComparison(first, first), descending);
}

TEST(RootChildren, EventLibrariesAreToldByTheTypeObjectAndNotItsText) {
    const vexo::VXGroupTypeIdentifier lookalike(vexo::VXReelixEventLibraryGroupTypeIdentifier.text());
    EXPECT_EQ(order::_ReelixRootGroupComparison(group({"a"}, lookalike), group({"b"})), ascending);
    EXPECT_EQ(order::_ReelixRootGroupComparison(group({"a"}), group({"b"}, lookalike)), ascending);
}

TEST(RootChildren, AMissingNameIsTheSameAsAllButTheEventLibrary) {
    const auto nameless = group({std::nullopt});
    EXPECT_EQ(order::_ReelixRootGroupComparison(nameless, group({"a"})), same);
    EXPECT_EQ(order::_ReelixRootGroupComparison(group({"a"}), nameless), same);
    EXPECT_EQ(order::_ReelixRootGroupComparison(
                  nameless, group({std::nullopt}, vexo::VXReelixEventLibraryGroupTypeIdentifier)),
              ascending);
}

TEST(SortedEvents, OldestFirst) {
    EXPECT_EQ(sortedNames(groups({{"late", 2009, 1, 1},
                                  {"Camping", 2008, 5, 5},
                                  {"winter", 2008, 1, 9},
                                  {"beach", 2008, 5, 7},
                                  {"early", 2007, 9, 9}}),
                          order::_eventComparisonByYearOldestFirst),
              "early, winter, beach, Camping, late");
}

TEST(SortedEvents, NewestFirst) {
    EXPECT_EQ(sortedNames(groups({{"early", 2007, 9, 9},
                                  {"Camping", 2008, 5, 7},
                                  {"winter", 2008, 1, 9},
                                  {"beach", 2008, 6, 7},
                                  {"late", 2009, 1, 1}}),
                          order::_eventComparisonByYearNewestFirst),
              "late, winter, beach, Camping, early");
}

TEST(SortedEvents, AreThoseThatTheComparisonsSort) {
    std::vector<VXMediaGroupRef> events;
    for (int i = 0; i < 60; ++i) {
        const auto year = i % 7 == 0 ? std::nullopt : std::optional(2000 + i * 5 % 4);
        const auto oldest = i % 5 == 0 ? std::nullopt : std::optional(i * 7 % 3);
        events.push_back(group({std::to_string(i * 31 % 60), year, oldest, i * 11 % 3}));
    }
    const auto sorted = [&events](order::EventOrder by) {
        std::vector<VXMediaGroupRef> result;
        for (const order::OrderedEvent& each : order::sortedByYear({events.begin(), events.end()}, by))
            result.push_back(each.event);
        return result;
    };
    EXPECT_EQ(sorted(order::EventOrder::oldestFirst),
              reelix::stableSorted(events, order::_eventComparisonByYearOldestFirst));
    EXPECT_EQ(sorted(order::EventOrder::newestFirst),
              reelix::stableSorted(events, order::_eventComparisonByYearNewestFirst));
}

TEST(SortedEvents, EventsWithoutAYearAreAllKept) {
    std::vector<VXMediaGroupRef> events;
    for (int i = 0; i < 50; ++i)
        events.push_back(group({std::to_string(i), i % 3 == 0 ? std::nullopt : std::optional(2000 + i % 7)}));
    for (const auto& sorted : {reelix::stableSorted(events, order::_eventComparisonByYearOldestFirst),
                               reelix::stableSorted(events, order::_eventComparisonByYearNewestFirst)})
        EXPECT_THAT(sorted, testing::UnorderedElementsAreArray(events));
}

}  // namespace
}  // namespace testing_support
