#include "events/EventOrder.h"

#include "core/ReelixConstants.h"

namespace reelix::ReelixSupport {
namespace {

using vexo::VXMediaGroupRef;

template <typename T>
ComparisonResult compareNumbers(const T& a, const T& b) {
    if (a < b)
        return ComparisonResult::ascending;
    return b < a ? ComparisonResult::descending : ComparisonResult::same;
}

// What the comparisons look at.
struct EventKeys {
    explicit EventKeys(const vexo::VXMediaGroup& group) : attributes(group.attributes()) {}

    std::optional<double> year() const {
        const platform::Value* value = platform::find(*attributes, VXReelixEventCreationYear);
        return value ? value->doubleValue() : std::nullopt;
    }
    platform::DateRef date(std::string_view key) const {
        const platform::Value* value = platform::find(*attributes, key);
        return value ? value->date() : nullptr;
    }

    const std::shared_ptr<const platform::Dictionary> attributes;
};

// A missing date compares as same.
ComparisonResult compareDates(const platform::DateRef& a, const platform::DateRef& b) {
    if (!a || !b)
        return ComparisonResult::same;
    return compareNumbers(a->secondsSinceReferenceDate(), b->secondsSinceReferenceDate());
}

ComparisonResult compareNames(const vexo::VXMediaGroup& a, const vexo::VXMediaGroup& b) {
    const auto nameOfA = a.name();
    const auto nameOfB = b.name();
    if (!nameOfA || !nameOfB)
        return ComparisonResult::same;
    return platform::caseInsensitiveCompare(*nameOfA, *nameOfB);
}

bool isEventLibrary(const VXMediaGroupRef& group) {
    return group->typeIdentifier() == vexo::VXReelixEventLibraryGroupTypeIdentifier;
}

}  // namespace

ComparisonResult _eventComparisonByYearOldestFirst(const VXMediaGroupRef& a, const VXMediaGroupRef& b) {
    const EventKeys keysOfA(*a);
    const EventKeys keysOfB(*b);
    if (!keysOfA.year() || !keysOfB.year())
        return ComparisonResult::same;
    if (const auto byYear = compareNumbers(*keysOfA.year(), *keysOfB.year());
        byYear != ComparisonResult::same)
        return byYear;

    const auto oldestOfA = keysOfA.date(VXReelixEventOldestClipDate);
    const auto oldestOfB = keysOfB.date(VXReelixEventOldestClipDate);
    if (!oldestOfA || !oldestOfB)
        return ComparisonResult::same;
    if (const auto byDate = compareDates(oldestOfA, oldestOfB); byDate != ComparisonResult::same)
        return byDate;
    return compareNames(*a, *b);
}

ComparisonResult _eventComparisonByYearNewestFirst(const VXMediaGroupRef& a, const VXMediaGroupRef& b) {
    const EventKeys keysOfA(*a);
    const EventKeys keysOfB(*b);
    if (!keysOfA.year() || !keysOfB.year())
        return ComparisonResult::same;
    if (const auto byYear = compareNumbers(*keysOfA.year(), *keysOfB.year());
        byYear != ComparisonResult::same)
        return platform::opposite(byYear);

    if (!keysOfA.date(VXReelixEventOldestClipDate) || !keysOfB.date(VXReelixEventOldestClipDate))
        return ComparisonResult::same;
    const auto byDate =
        compareDates(keysOfA.date(VXReelixEventNewestClipDate), keysOfB.date(VXReelixEventNewestClipDate));
    if (byDate != ComparisonResult::same)
        return platform::opposite(byDate);
    return compareNames(*a, *b);
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
