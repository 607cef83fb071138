#include "platform/CalendarFormat.h"

#include <array>

namespace platform {

namespace {

using LetterSet = std::array<bool, 256>;

constexpr LetterSet conversions = [] {
    LetterSet letters{};
    for (const unsigned char letter : std::string_view("YymdeHIMSFjpaAbBcxXwzZ"))
        letters[letter] = true;
    return letters;
}();

std::size_t sizeInFormat(std::string_view format) {
    return format[0] == '%' && format.size() > 1 ? 2 : 1;
}

}  // namespace

std::optional<FormatPiece> FormatReader::peek() const {
    if (rest_.empty())
        return std::nullopt;
    const std::string_view piece = rest_.substr(0, sizeInFormat(rest_));
    if (piece.size() == 2 && conversions[static_cast<unsigned char>(piece[1])])
        return FormatPiece{piece[1], {}};
    return FormatPiece{0, piece == "%%" ? piece.substr(1) : piece};
}

std::optional<FormatPiece> FormatReader::next() {
    const std::optional<FormatPiece> piece = peek();
    if (piece)
        rest_.remove_prefix(sizeInFormat(rest_));
    return piece;
}

}  // namespace platform
