// A text of a query as it stands between the quotes, with its wildcards and modifiers, and how it compares
// with the text of a property.
//
// Texts that Unicode counts as the same are the same, however they are encoded; the locale plays no part.
// Bytes that are not UTF-8 count as U+FFFD. A comparison takes time in proportion to the two texts, whatever
// the wildcards, except that one by words may take the product of their numbers of words. Immutable.
#pragma once

#include <compare>
#include <string>
#include <string_view>
#include <vector>

namespace vexo {

struct TextModifiers {
    bool ignoresCase = false;        // c
    bool ignoresDiacritics = false;  // d
    bool comparesWords = false;      // w
};

class TextPattern {
  public:
    // What lies between wildcards; a text without any is one piece.
    using Pieces = std::vector<std::string>;

    // Requires: there is a piece.
    TextPattern(const Pieces& pieces, TextModifiers modifiers);

    // Whether the pattern takes in the whole text; one by words, whether its words stand side by side
    // anywhere in the text, whatever separates them.
    bool matches(std::string_view text) const;
    // Where `text` stands in relation to the pattern, in which a wildcard is an asterisk here.
    std::strong_ordering orderOf(std::string_view text) const;
    // Whether the pattern is made of wildcards alone.
    bool isAnything() const;

  private:
    const TextModifiers modifiers_;
    const Pieces pieces_;  // prepared for comparing, as are the words
    const std::vector<Pieces> words_;
};

}  // namespace vexo
