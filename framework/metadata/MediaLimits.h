// What a media file's properties can be. Beyond these the file lies, or what was told of it was damaged on
// the way. So chosen that whatever is within them fits into a message of the reader's, and any whole number
// into a double.
#pragma once

#include <cstddef>

namespace vexo {

struct Range {
    double least;
    double greatest;

    // False for what is no number.
    bool contains(double number) const { return number >= least && number <= greatest; }
};

inline constexpr std::size_t longestList = 16;
inline constexpr std::size_t longestName = 48;
inline constexpr std::size_t longestText = 900;

inline constexpr Range pixelCounts{1, 1e6};
inline constexpr Range durations{0, 1e9};       // seconds, some thirty years
inline constexpr Range dates{-2.5e11, 2.5e11};  // seconds to the year 9999, either way
inline constexpr Range frameRates{1e-6, 1e6};   // a second
inline constexpr Range channelCounts{1, 1024};
inline constexpr Range sampleRates{1, 1e8};  // hertz
inline constexpr Range bitRates{1, 1e15};    // bits a second
inline constexpr int largestFrameSide = 1024;
inline constexpr Range frameSides{1, largestFrameSide};  // pixels

}  // namespace vexo
