// Durations as people read them.
#pragma once

#include <limits>

namespace platform {

struct MinutesAndSeconds {
    long minutes = 0;
    long seconds = 0;
};

// Both cut off toward zero; minutes are not wrapped into hours. What is beyond the type is its largest
// number. Requires: `duration`, in seconds, is above zero.
constexpr MinutesAndSeconds minutesAndSeconds(double duration) {
    const auto wholeNumber = [](double number) {
        constexpr long largest = std::numeric_limits<long>::max();
        return number < static_cast<double>(largest) ? static_cast<long>(number) : largest;
    };
    const long minutes = wholeNumber(duration / 60);
    return {minutes, wholeNumber(duration - static_cast<double>(minutes) * 60)};
}

}  // namespace platform
