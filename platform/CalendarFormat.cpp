#include "platform/CalendarFormat.h"

namespace platform {

namespace {

constexpr std::string_view conversions = "YymdeHIMSFjpaAbBcxXwzZ";

bool isConversionLetter(char letter) {
    return conversions.find(letter) != conversions.npos;
}

std::size_t sizeInFormat(std::string_view format) {
    return format[0] == '%' && format.size() > 1 ? 2 : 1;
}

}  // namespace

std::optional<FormatPiece> FormatReader::peek() const {
    if (rest_.empty())
        return std::nullopt;
    const std::string_view piece = rest_.substr(0, sizeInFormat(rest_));
    if (piece.size() == 2 && isConversionLetter(piece[1]))
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
