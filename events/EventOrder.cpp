#include "events/EventOrder.h"

#include "core/ReelixConstants.h"
#include "core/StableSort.h"

namespace reelix::ReelixSupport {
namespace {

using vexo::VXMediaGroupRef;

template <typename T>
ComparisonResult compareNumbers(const T& a, const T& b) {
    if (a < b)
        return ComparisonResult::ascending;
    return b < a ? ComparisonResult::descending : ComparisonResult::same;
}

std::optional<double> secondsOfDate(const platform::Dictionary& attributes, std::string_view key) {
    const platform::Value* value = platform::find(attributes, key);
    const platform::DateRef date = value ? value->date() : nullptr;
    return date ? std::optional(date->secondsSinceReferenceDate()) : std::nullopt;
}

// A missing date compares as same.
ComparisonResult compareDates(const std::optional<double>& a, const std::optional<double>& b) {
    return a && b ? compareNumbers(*a, *b) : ComparisonResult::same;
}

ComparisonResult compareNames(const vexo::VXMediaGroup& a, const vexo::VXMediaGroup& b) {
    const auto nameOfA = a.name();
    const auto nameOfB = b.name();
    if (!nameOfA || !nameOfB)
        return ComparisonResult::same;
    return platform::caseInsensitiveCompare(*nameOfA, *nameOfB);
}

ComparisonResult compareOldestFirst(const OrderedEvent& a, const OrderedEvent& b) {
    if (!a.year || !b.year)
        return ComparisonResult::same;
    if (const auto byYear = compareNumbers(*a.year, *b.year); byYear != ComparisonResult::same)
        return byYear;
    if (!a.oldest || !b.oldest)
        return ComparisonResult::same;
    if (const auto byDate = compareDates(a.oldest, b.oldest); byDate != ComparisonResult::same)
        return byDate;
    return compareNames(*a.event, *b.event);
}

ComparisonResult compareNewestFirst(const OrderedEvent& a, const OrderedEvent& b) {
    if (!a.year || !b.year)
        return ComparisonResult::same;
    if (const auto byYear = compareNumbers(*a.year, *b.year); byYear != ComparisonResult::same)
        return platform::opposite(byYear);
    if (!a.oldest || !b.oldest)
        return ComparisonResult::same;
    if (const auto byDate = compareDates(a.newest, b.newest); byDate != ComparisonResult::same)
        return platform::opposite(byDate);
    return compareNames(*a.event, *b.event);
}

bool isEventLibrary(const VXMediaGroupRef& group) {
    return group->typeIdentifier() == vexo::VXReelixEventLibraryGroupTypeIdentifier;
}

}  // namespace

ComparisonResult _eventComparisonByYearOldestFirst(const VXMediaGroupRef& a, const VXMediaGroupRef& b) {
    return compareOldestFirst(OrderedEvent(a), OrderedEvent(b));
}

ComparisonResult _eventComparisonByYearNewestFirst(const VXMediaGroupRef& a, const VXMediaGroupRef& b) {
    return compareNewestFirst(OrderedEvent(a), OrderedEvent(b));
}

OrderedEvent::OrderedEvent(VXMediaGroupRef group) : event(std::move(group)) {
    const auto attributes = event->attributes();
    if (const platform::Value* value = platform::find(*attributes, VXReelixEventCreationYear))
        year = value->doubleValue();
    oldest = secondsOfDate(*attributes, VXReelixEventOldestClipDate);
    newest = secondsOfDate(*attributes, VXReelixEventNewestClipDate);
}

std::vector<OrderedEvent> sortedByYear(std::vector<OrderedEvent> events, EventOrder order) {
    std::vector<OrderedEvent*> inOrder;
    inOrder.reserve(events.size());
    for (OrderedEvent& event : events)
        inOrder.push_back(&event);
    const auto compare = order == EventOrder::newestFirst ? compareNewestFirst : compareOldestFirst;
    inOrder =
        stableSorted(inOrder, [&](const OrderedEvent* a, const OrderedEvent* b) { return compare(*a, *b); });
    std::vector<OrderedEvent> sorted;
    sorted.reserve(events.size());
    for (OrderedEvent* event : inOrder)
        sorted.push_back(std::move(*event));
    return sorted;
}

vexo::VXMediaGroupList groupsOf(const std::vector<OrderedEvent>& events) {
    std::vector<VXMediaGroupRef> groups;
    groups.reserve(events.size());
    for (const OrderedEvent& event : events)
        groups.push_back(event.event);
    return vexo::VXMediaGroupList(std::move(groups));
}

ComparisonResult _eventComparisonAlphabetically(const VXMediaGroupRef& a, const VXMediaGroupRef& b) {
    return compareNames(*a, *b);
}

ComparisonResult _ReelixRootGroupComparison(const VXMediaGroupRef& a, const VXMediaGroupRef& b) {
    if (isEventLibrary(a))
        return ComparisonResult::descending;
    if (isEventLibrary(b))
        return ComparisonResult::ascending;
    return compareNames(*a, *b);
}

}  // namespace reelix::ReelixSupport
