#include "framework/queries/QueryScanner.h"

#include <algorithm>
#include <charconv>
#include <limits>

namespace vexo {
namespace {

bool isBlank(char byte) {
    return byte == ' ' || byte == '\t' || byte == '\n' || byte == '\r';
}

bool isDigit(char byte) {
    return byte >= '0' && byte <= '9';
}

bool isLetterOrDigit(char byte) {
    return isDigit(byte) || (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z');
}

bool isPartOfWord(char byte) {
    return isLetterOrDigit(byte) || byte == '_' || byte == '.' || byte == ':';
}

}  // namespace

template <typename Predicate>
std::string_view QueryScanner::takeWhile(const Predicate& predicate) {
    const std::string_view rest = text_.substr(position_);
    const auto end = std::find_if_not(rest.begin(), rest.end(), predicate);
    const auto length = static_cast<std::size_t>(end - rest.begin());
    position_ += length;
    return rest.substr(0, length);
}

std::size_t QueryScanner::next() {
    takeWhile(isBlank);
    return position_;
}

bool QueryScanner::take(std::string_view symbol) {
    if (!text_.substr(next()).starts_with(symbol))
        return false;
    position_ += symbol.size();
    return true;
}

std::string_view QueryScanner::takeWord() {
    next();
    return takeWhile(isPartOfWord);
}

std::optional<double> QueryScanner::takeNumber() {
    const std::string_view rest = text_.substr(next());
    const std::size_t sign = rest.starts_with('+') || rest.starts_with('-') ? 1 : 0;
    // What is read below may also be "inf" or "nan", which are no decimal numbers.
    if (rest.size() == sign || !(isDigit(rest[sign]) || rest[sign] == '.'))
        return std::nullopt;
    double number = 0;
    const auto [end, error] = std::from_chars(rest.data() + sign, rest.data() + rest.size(), number);
    if (error == std::errc::invalid_argument)
        return std::nullopt;
    position_ = static_cast<std::size_t>(end - text_.data());
    if (error == std::errc::result_out_of_range)
        number = std::numeric_limits<double>::infinity();
    return rest.front() == '-' ? -number : number;
}

std::optional<std::string_view> QueryScanner::takeUntil(char end) {
    const std::size_t start = next();
    const std::size_t found = text_.find(end, start);
    if (found == std::string_view::npos)
        return std::nullopt;
    position_ = found + 1;
    return text_.substr(start, found - start);
}

std::optional<QueryScanner::Character> QueryScanner::takeCharacter() {
    const bool isEscaped = text_.substr(position_).starts_with('\\');
    const std::size_t at = position_ + (isEscaped ? 1 : 0);
    if (at >= text_.size())
        return std::nullopt;
    position_ = at + 1;
    return Character{text_[at], isEscaped};
}

std::optional<char> QueryScanner::takeAdjacentLetter() {
    if (position_ == text_.size() || !isLetterOrDigit(text_[position_]))
        return std::nullopt;
    return text_[position_++];
}

}  // namespace vexo
