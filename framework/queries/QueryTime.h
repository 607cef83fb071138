// The points in time that a query names: fixed ones, and those that move with the clock, "$time.today".
//
// Days, weeks, months and years begin by the local clock (platform/LocalZone); a week begins on Monday in
// every locale. A value; callable from any thread.
#pragma once

#include "platform/Date.h"

namespace vexo {

// What a moving time begins with and is counted in. `yesterday` counts in days, like `today`.
enum class QueryTimeUnit { fixed, now, today, yesterday, thisWeek, thisMonth, thisYear };

struct QueryTime {
    static constexpr double mostUnits = 1e8;

    QueryTimeUnit unit;
    // Seconds from 1970 for a fixed time, seconds from now for `now`; else a whole number of days, weeks,
    // months or years. Requires: for the latter, at most `mostUnits` in either direction.
    double amount;

    // Requires: `now` is within a million years of the reference date.
    double secondsSince1970(const platform::Date& now) const;
};

}  // namespace vexo
