#include "platform/Text.h"

#include <fmt/printf.h>

#include <algorithm>

#include <unicode/unistr.h>
#include <unicode/unorm.h>
#include <unicode/utf8.h>

namespace platform {

namespace {

constexpr std::string_view replacement = "\uFFFD";

ComparisonResult resultOf(int order) {
    if (order == 0)
        return ComparisonResult::same;
    return order < 0 ? ComparisonResult::ascending : ComparisonResult::descending;
}

char foldedASCII(char letter) {
    return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter + ('a' - 'A')) : letter;
}

// Gives the same order as Unicode's rules do for such text, at a fraction of the cost.
ComparisonResult compareASCII(std::string_view a, std::string_view b) {
    const std::size_t common = std::min(a.size(), b.size());
    for (std::size_t i = 0; i < common; ++i) {
        if (const int order = foldedASCII(a[i]) - foldedASCII(b[i]))
            return resultOf(order);
    }
    return a.size() == b.size() ? ComparisonResult::same : resultOf(a.size() < b.size() ? -1 : 1);
}

// ICU counts in 32 bits; of a longer text, only the beginning is compared.
icu::UnicodeString unicode(std::string_view text) {
    constexpr std::size_t longest = std::size_t{1} << 30;
    return icu::UnicodeString::fromUTF8({text.data(), static_cast<int32_t>(std::min(text.size(), longest))});
}

// Whether a character starts at `index`; moves past it, or past the bytes that make none.
bool isUTF8At(std::string_view text, std::size_t& index) {
    UChar32 character;
    U8_NEXT(text.data(), index, text.size(), character);
    return character >= 0;
}

}  // namespace

bool isASCII(std::string_view text) {
    return std::all_of(text.begin(), text.end(),
                       [](char byte) { return static_cast<signed char>(byte) >= 0; });
}

ComparisonResult caseInsensitiveCompare(std::string_view a, std::string_view b) {
    if (isASCII(a) && isASCII(b))
        return compareASCII(a, b);

    const icu::UnicodeString first = unicode(a);
    const icu::UnicodeString second = unicode(b);
    UErrorCode status = U_ZERO_ERROR;
    const int order =
        unorm_compare(first.getBuffer(), first.length(), second.getBuffer(), second.length(),
                      U_FOLD_CASE_DEFAULT | U_COMPARE_IGNORE_CASE | U_COMPARE_CODE_POINT_ORDER, &status);
    return resultOf(U_SUCCESS(status) ? order : a.compare(b));
}

std::string validUTF8(std::string_view text) {
    std::string valid;
    for (std::size_t i = 0; i < text.size();) {
        const std::size_t start = i;
        valid += isUTF8At(text, i) ? text.substr(start, i - start) : replacement;
    }
    return valid;
}

bool isValidUTF8(std::string_view text) {
    for (std::size_t i = 0; i < text.size();) {
        if (!isUTF8At(text, i))
            return false;
    }
    return true;
}

std::string stringWithFormat(const std::string& format, long first, long second) try {
    return fmt::sprintf(format, first, second);
} catch (const fmt::format_error&) {
    return format;
}

}  // namespace platform
