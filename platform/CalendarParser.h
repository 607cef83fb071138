// Reads text by a calendar format.
#pragma once

#include <optional>
#include <string_view>

#include "platform/CalendarDate.h"
#include "platform/CalendarFormat.h"
#include "platform/CalendarNames.h"
#include "platform/CivilTime.h"

namespace platform {

// What a text said. Fields that it did not mention are those of the reference date, midnight.
struct ParsedFields {
    int year = 2001;
    std::optional<int> month;
    std::optional<int> day;
    std::optional<int> dayOfYear;  // counts where neither month nor day is given
    std::optional<int> hour;
    std::optional<int> hourOfHalfDay;  // counts where `hour` is not given
    bool isAfternoon = false;
    int minute = 0;
    int second = 0;
    int millisecond = 0;
    std::optional<int> secondsFromGMT;
    std::string_view zoneAbbreviation;  // a part of the text; empty when it has none

    // nil when there is no such day.
    std::optional<CivilTime> civilTime() const;
};

// Reads one text once, by the names of the user's locale.
class CalendarParser {
  public:
    explicit CalendarParser(std::string_view text) : rest_(text) {}

    // nil when the text does not match the format from its first byte to its last.
    std::optional<ParsedFields> parse(const CalendarFormat& format);

  private:
    struct NumberRange {
        int digits;  // at most
        int lowest;
        int highest;
    };

    // Each moves past what it reads and answers false when that is not there.
    bool readConversion(const CalendarFormat::Piece& piece);
    bool readInLocale(char letter);
    bool readLiteral(std::string_view literal);
    bool readYear(bool hasFourDigits);
    bool readYearOfCentury();
    bool readMonth(NameKind kind);
    bool readHalfOfDay();
    bool readName(NameKind kind, std::optional<int>& index);
    bool readForm(LocaleForm form);
    bool readZoneOffset();
    bool readZoneName();
    template <typename Field>
    bool readNumber(Field& field, NumberRange range);

    // nil when there is no number, or none in the range.
    std::optional<int> number(NumberRange range);
    // The minutes, or seconds, of a zone offset; 0 when it has none.
    std::optional<int> sixtieths();

    std::string_view rest_;
    ParsedFields fields_;
};

}  // namespace platform
