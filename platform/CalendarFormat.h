// A calendar format, taken apart once for any number of dates.
//
// The conversions are those that platform/CalendarDate.h lists. A "%" that begins none of them stands for
// itself, together with the byte that follows it. Immutable and thread-safe.
#pragma once

#include <concepts>
#include <string>
#include <string_view>
#include <vector>

namespace platform {

class CalendarFormat {
  public:
    // Either a conversion or text that stands for itself.
    struct Piece {
        char conversion = 0;  // the letter after "%"; 0 for text
        std::string literal;  // never empty for text
        // Whether what comes next could be taken for more digits of a number.
        bool runsOn = false;

        bool isConversion() const { return conversion != 0; }
    };

    template <std::convertible_to<std::string_view> Text>
    CalendarFormat(const Text& format)  // NOLINT: a text is what says which format is meant
        : pieces_(piecesOf(format)) {}

    // No text follows another.
    const std::vector<Piece>& pieces() const { return pieces_; }

  private:
    static std::vector<Piece> piecesOf(std::string_view format);

    const std::vector<Piece> pieces_;
};

}  // namespace platform
