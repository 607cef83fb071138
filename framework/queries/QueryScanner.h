// Takes a query's text apart, from left to right: what a QueryParser asks for is taken when it comes next,
// after blanks. What is taken is a view into the text, which outlives the scanner. Belongs to one thread.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace vexo {

class QueryScanner {
  public:
    explicit QueryScanner(std::string_view text) : text_(text) {}

    // Passes over blanks and answers where it is then.
    std::size_t next();
    bool isAtEnd() { return next() == text_.size(); }

    bool take(std::string_view symbol);
    // Letters, digits, "_", "." and ":"; empty when none comes next.
    std::string_view takeWord();
    // A decimal number with an optional sign; nil when none comes next. One that is too large or too small
    // for a double is infinite.
    std::optional<double> takeNumber();
    // Everything before `end`, which is taken as well; nil when there is no such character any more.
    std::optional<std::string_view> takeUntil(char end);

    // These two pass over no blanks.
    struct Character {
        char byte;
        bool isEscaped;  // stands behind a backslash
    };
    // nil at the end of the text.
    std::optional<Character> takeCharacter();
    // nil when no letter or digit comes right here.
    std::optional<char> takeAdjacentLetter();
    std::size_t position() const { return position_; }

  private:
    template <typename Predicate>
    std::string_view takeWhile(const Predicate& predicate);

    const std::string_view text_;
    std::size_t position_ = 0;
};

}  // namespace vexo
