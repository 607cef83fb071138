// Comparing and cleaning text for people. Text is UTF-8; bytes that are not count as U+FFFD.
#pragma once

#include <string>
#include <string_view>

namespace platform {

// The three-way result of a comparison, with the numbers the system's callers know.
enum class ComparisonResult { ascending = -1, same = 0, descending = 1 };

// Ascending becomes descending and the other way round; same stays.
constexpr ComparisonResult opposite(ComparisonResult result) {
    return static_cast<ComparisonResult>(-static_cast<int>(result));
}

// Compares by Unicode case folding and canonical equivalence, not by bytes and not by locale.
ComparisonResult caseInsensitiveCompare(std::string_view a, std::string_view b);

bool isASCII(std::string_view text);
// The text with every byte sequence that is not UTF-8 replaced by U+FFFD.
std::string validUTF8(std::string_view text);
// Whether the text is well-formed UTF-8.
bool isValidUTF8(std::string_view text);

// stringWithFormat: with two numbers for a format of the printf function, "%ld:%02ld" say. A format that asks
// for other values or for more of them is answered as it is.
std::string stringWithFormat(const std::string& format, long first, long second);

}  // namespace platform
