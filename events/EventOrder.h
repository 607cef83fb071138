// The orders of event groups and of the root group's children: operations that the category ReelixSupport
// adds to VXMediaGroup, the receiver first. Callable from any thread.
#pragma once

#include <optional>
#include <vector>

#include "host/VXMediaGroup.h"
#include "platform/Text.h"

namespace reelix::ReelixSupport {

using platform::ComparisonResult;

// _eventComparisonByYearOldestFirst:; by year, then by oldest clip, then by name. Events that lack a year or
// a date compare as same with every event at that point.
ComparisonResult _eventComparisonByYearOldestFirst(const vexo::VXMediaGroupRef& a,
                                                   const vexo::VXMediaGroupRef& b);

// _eventComparisonByYearNewestFirst:; latest year first, then latest newest clip first, then by name from A
// to Z. That the oldest dates must be present although the newest are compared is deliberate, and so is the
// order of names.
ComparisonResult _eventComparisonByYearNewestFirst(const vexo::VXMediaGroupRef& a,
                                                   const vexo::VXMediaGroupRef& b);

enum class EventOrder { oldestFirst, newestFirst };

// An event with what the two comparisons above look at, asked of it once, and not of two events again and
// again.
struct OrderedEvent {
    explicit OrderedEvent(vexo::VXMediaGroupRef group);

    vexo::VXMediaGroupRef event;
    std::optional<double> year;
    std::optional<double> oldest;  // dates, in seconds from the reference date
    std::optional<double> newest;
};

// Sorted by one of the two.
std::vector<OrderedEvent> sortedByYear(std::vector<OrderedEvent> events, EventOrder order);

// The events alone.
vexo::VXMediaGroupList groupsOf(const std::vector<OrderedEvent>& events);

// _eventComparisonAlphabetically:; nothing in the plug-in sorts by it.
ComparisonResult _eventComparisonAlphabetically(const vexo::VXMediaGroupRef& a,
                                                const vexo::VXMediaGroupRef& b);

// _ReelixRootGroupComparison:; by name, the event library last. Of two event libraries each comes after the
// other.
ComparisonResult _ReelixRootGroupComparison(const vexo::VXMediaGroupRef& a, const vexo::VXMediaGroupRef& b);

}  // namespace reelix::ReelixSupport
