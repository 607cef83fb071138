#include "platform/Value.h"

#include <fmt/format.h>
#include <locale.h>

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <limits>

namespace platform {

namespace {

constexpr std::string_view whitespace = " \t\n\v\f\r";

std::string_view withoutLeadingWhitespace(std::string_view text) {
    text.remove_prefix(std::min(text.find_first_not_of(whitespace), text.size()));
    return text;
}

// Digits, or a point and digits; keeps the words for infinity and not-a-number from counting as numbers.
bool beginsWithDecimalNumber(std::string_view text) {
    if (text.starts_with('.'))
        text.remove_prefix(1);
    return !text.empty() && text.front() >= '0' && text.front() <= '9';
}

// Infinite or zero, with the right sign, for a number that is too large or too small for a double.
double outOfRangeNumber(std::string_view text) {
    static const locale_t cLocale = newlocale(LC_ALL_MASK, "C", nullptr);
    return strtod_l(std::string(text).c_str(), nullptr, cLocale);
}

double unsignedLeadingNumber(std::string_view text) {
    if (!beginsWithDecimalNumber(text))
        return 0.0;
    double number = 0.0;
    const auto [end, error] = std::from_chars(text.begin(), text.end(), number);
    if (error == std::errc::result_out_of_range)
        return outOfRangeNumber({text.begin(), end});
    return number;
}

double leadingNumber(std::string_view text) {
    text = withoutLeadingWhitespace(text);
    const bool isNegative = text.starts_with('-');
    if (isNegative || text.starts_with('+'))
        text.remove_prefix(1);
    const double magnitude = unsignedLeadingNumber(text);
    return isNegative ? -magnitude : magnitude;
}

// The smallest or the largest number for one beyond the type.
std::int64_t leadingWholeNumber(std::string_view text) {
    text = withoutLeadingWhitespace(text);
    const bool isNegative = text.starts_with('-');
    if (text.starts_with("+") && !text.starts_with("+-"))
        text.remove_prefix(1);
    std::int64_t number = 0;
    const auto error = std::from_chars(text.begin(), text.end(), number).ec;
    if (error == std::errc::result_out_of_range)
        return isNegative ? std::numeric_limits<std::int64_t>::min()
                          : std::numeric_limits<std::int64_t>::max();
    return number;
}

// Nothing that is no number is a whole one: not-a-number gives 0.
std::int64_t wholeNumber(double number) {
    constexpr double beyond = 0x1p63;
    if (number >= beyond)
        return std::numeric_limits<std::int64_t>::max();
    if (number < -beyond)
        return std::numeric_limits<std::int64_t>::min();
    return std::isnan(number) ? 0 : static_cast<std::int64_t>(number);
}

bool saysYes(std::string_view text) {
    text = withoutLeadingWhitespace(text);
    return !text.empty() && std::string_view("yYtT").find(text.front()) != std::string_view::npos;
}

// What a value of one kind compares by.
template <typename T>
const T& content(const T& value) {
    return value;
}
template <typename T>
const T& content(const std::shared_ptr<const T>& shared) {
    return *shared;
}
double content(const DateRef& date) {
    return date->secondsSinceReferenceDate();
}

}  // namespace

std::string stringFromSize(const Size& size) {
    return fmt::format("{{{}, {}}}", size.width, size.height);
}

const std::string* Value::string() const {
    const auto* text = std::get_if<std::shared_ptr<const std::string>>(&content_);
    return text ? text->get() : nullptr;
}

DateRef Value::date() const {
    const DateRef* date = std::get_if<DateRef>(&content_);
    return date ? *date : nullptr;
}

const Data* Value::data() const {
    const auto* data = std::get_if<std::shared_ptr<const Data>>(&content_);
    return data ? data->get() : nullptr;
}

const Array* Value::array() const {
    const auto* array = std::get_if<std::shared_ptr<const Array>>(&content_);
    return array ? array->get() : nullptr;
}

const Dictionary* Value::dictionary() const {
    const auto* dictionary = std::get_if<std::shared_ptr<const Dictionary>>(&content_);
    return dictionary ? dictionary->get() : nullptr;
}

std::optional<double> Value::doubleValue() const {
    if (const bool* truth = boolean())
        return *truth ? 1.0 : 0.0;
    if (const std::int64_t* number = integer())
        return static_cast<double>(*number);
    if (const double* number = real())
        return *number;
    if (const std::string* text = string())
        return leadingNumber(*text);
    return std::nullopt;
}

std::optional<std::int64_t> Value::intValue() const {
    if (const std::int64_t* number = integer())
        return *number;
    if (const std::string* text = string())
        return leadingWholeNumber(*text);
    const std::optional<double> number = doubleValue();
    return number ? std::optional(wholeNumber(*number)) : std::nullopt;
}

std::optional<bool> Value::boolValue() const {
    if (const std::string* text = string(); text && saysYes(*text))
        return true;
    const std::optional<double> number = doubleValue();
    if (!number)
        return std::nullopt;
    return *number != 0.0;
}

bool Value::operator==(const Value& other) const {
    return std::visit(
        []<typename A, typename B>(const A& a, const B& b) {
            if constexpr (std::is_same_v<A, B>)
                return content(a) == content(b);
            else
                return false;
        },
        content_, other.content_);
}

const Value* find(const Dictionary& dictionary, std::string_view key) {
    const auto found = dictionary.find(key);
    return found == dictionary.end() ? nullptr : &found->second;
}

}  // namespace platform
