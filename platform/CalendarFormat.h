// Takes a calendar format apart.
//
// The conversions are those that platform/CalendarDate.h lists. A "%" that begins none of them stands for
// itself, together with the byte that follows it.
#pragma once

#include <optional>
#include <string_view>

namespace platform {

// Either a conversion or text that stands for itself.
struct FormatPiece {
    char conversion = 0;       // the letter after "%"; 0 for text
    std::string_view literal;  // one byte or two; lives as long as the format

    bool isConversion() const { return conversion != 0; }
};

class FormatReader {
  public:
    explicit FormatReader(std::string_view format) : rest_(format) {}

    // The next piece, which `next` moves past; nil at the end.
    std::optional<FormatPiece> peek() const;
    std::optional<FormatPiece> next();

  private:
    std::string_view rest_;
};

}  // namespace platform
