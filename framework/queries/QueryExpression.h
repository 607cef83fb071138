// A query over metadata properties, as a text that people and plug-ins write: read once, asked of many items.
//
//     query      = a condition, or several of them put together:
//                    a || b      either; b is asked only where a does not decide
//                    a && b      both, in the same way; binds more tightly than ||
//                    !a          the opposite of the one condition that follows
//                    (a || b)    as a whole
//     condition  = KEY OPERATOR value
//                | InRange(KEY, value, value)    neither below the first value nor above the second
//     KEY        = the name of a property: letters, digits, "_", "." and ":"; * means any property
//     OPERATOR   = == (or =), !=, <, >, <=, >=
//     value      = text | number | truth | time
//     text       = '...' or "..."; a backslash takes the next character as it is, and * stands for any
//                  characters, or none, where the operator is ==, = or !=. Right behind the closing quote
//                  may stand
//                    c   the case of letters counts for nothing
//                    d   accents and the like count for nothing
//                    w   words are compared, made of letters and digits: those of the text stand side by
//                        side anywhere in the property
//     number     = 12, -0.5, 1e9
//     truth      = true, false, YES, NO, in any case of letters: the numbers 1 and 0
//     time       = $time.now           or n seconds from now: $time.now(-3600)
//                | $time.today         the beginning of the day, or of the n-th from it: $time.today(-7)
//                | $time.yesterday     the same, counted from yesterday
//                | $time.this_week     on Monday, n counting weeks; and so on with months and years:
//                | $time.this_month
//                | $time.this_year
//                | $time.iso(2008-12-31T23:59:59Z)    or with another zone (+01:00), or in local time
//                                                     without one, or the beginning of a day (2008-12-31)
//
// Blanks and line ends may stand between all of these. A query has at most `longestQuery` bytes, and at most
// `deepestQuery` levels of "(" and "!".
//
// Numbers compare with numbers, booleans counting as 1 and 0; dates with times, and with numbers as seconds
// from 1970-01-01 00:00:00 UTC; texts with texts, in the order of their characters' numbers. A property that
// is a list compares as each of its elements, and one of them is enough. Things of different kinds are
// neither equal nor in any order.
//
// `!=` is the opposite of `==`, so it also holds for a list none of whose elements is equal, for things of
// different kinds, and for a property that is missing; every other comparison with a missing property fails.
// KEY == '*' asks whether there is such a property at all, whatever its kind.
//
// Immutable and cheap to copy; callable from any thread.
#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>
#include <variant>

#include "host/VXMetadata.h"
#include "platform/Date.h"

namespace vexo {

class QueryCondition;

struct QuerySyntaxError {
    std::string message;   // for people: "expected a value after '='"
    std::size_t position;  // in bytes from the beginning, where the text stops making sense

    // "expected a value after '=' at position 17"
    std::string description() const;
};

class QueryExpression {
  public:
    static constexpr std::size_t longestQuery = 16384;
    static constexpr int deepestQuery = 200;

    using Result = std::variant<QueryExpression, QuerySyntaxError>;
    static Result parse(std::string_view text);

    // Whether an item with these properties is meant. Asks for one property after another, each once, and
    // stops where the answer is known: what costs least is best put first. Only * as a key asks for all of
    // them.
    bool matches(const VXMetadataProperties& properties, const platform::Date& now) const;

  private:
    explicit QueryExpression(std::shared_ptr<const QueryCondition> condition);

    std::shared_ptr<const QueryCondition> condition_;  // never nil
};

}  // namespace vexo
