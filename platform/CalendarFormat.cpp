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

bool isConversion(std::string_view piece) {
    return piece.size() == 2 && conversions[static_cast<unsigned char>(piece[1])];
}

bool couldBeOfNumber(const CalendarFormat::Piece& piece) {
    return piece.isConversion() || (piece.literal[0] >= '0' && piece.literal[0] <= '9');
}

void addLiteral(std::vector<CalendarFormat::Piece>& pieces, std::string_view text) {
    if (pieces.empty() || pieces.back().isConversion())
        pieces.push_back({});
    pieces.back().literal += text;
}

}  // namespace

std::vector<CalendarFormat::Piece> CalendarFormat::piecesOf(std::string_view format) {
    std::vector<Piece> pieces;
    while (!format.empty()) {
        const std::string_view piece = format.substr(0, format.front() == '%' ? 2 : 1);
        format.remove_prefix(piece.size());
        if (isConversion(piece))
            pieces.push_back({piece[1], {}});
        else
            addLiteral(pieces, piece == "%%" ? piece.substr(1) : piece);
    }
    for (std::size_t i = 0; i + 1 < pieces.size(); ++i)
        pieces[i].runsOn = couldBeOfNumber(pieces[i + 1]);
    return pieces;
}

}  // namespace platform
