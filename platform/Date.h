// Points in time. A Date is immutable and has identity: two dates may be equal and still be two objects.
#pragma once

#include <compare>
#include <memory>
#include <optional>
#include <string>

#include "platform/LocalZone.h"

namespace platform {

class Date;
using DateRef = std::shared_ptr<const Date>;

// A plain point in time, counted in seconds from the reference date, 2001-01-01 00:00:00 UTC.
class Date {
  public:
    explicit Date(double secondsSinceReferenceDate) : seconds_(secondsSinceReferenceDate) {}
    virtual ~Date() = default;
    Date(const Date&) = delete;
    Date& operator=(const Date&) = delete;

    // Seconds from 1970-01-01 00:00:00 UTC to the reference date.
    static constexpr double secondsFrom1970ToReferenceDate = 978307200.0;

    static DateRef sinceReferenceDate(double seconds) { return std::make_shared<Date>(seconds); }
    static DateRef since1970(double seconds) {
        return std::make_shared<Date>(seconds - secondsFrom1970ToReferenceDate);
    }

    double secondsSinceReferenceDate() const { return seconds_; }
    double secondsSince1970() const { return seconds_ + secondsFrom1970ToReferenceDate; }

    std::partial_ordering compare(const Date& other) const { return seconds_ <=> other.seconds_; }

  private:
    const double seconds_;
};

// Both count a date that is more than a billion years away as that far away; one that is not a number has
// the year 0 and an empty text. The year before year 1 is year 0.

// The year of `date` in the user's calendar, which on Linux is the Gregorian one, in the local time zone.
int yearInCurrentCalendar(const Date& date, const LocalZone& zone = LocalZone::current());

// ISO 8601 in UTC with whole seconds, rounded down: "2008-12-31T23:59:59Z", "+12000-01-01T00:00:00Z",
// "-0044-03-15T00:00:00Z".
std::string iso8601String(const Date& date);

}  // namespace platform
