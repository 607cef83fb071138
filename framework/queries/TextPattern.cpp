#include "framework/queries/TextPattern.h"

#include <unicode/normalizer2.h>
#include <unicode/uchar.h>
#include <unicode/unistr.h>
#include <unicode/utf8.h>

#include <algorithm>
#include <cstring>

#include "platform/Text.h"

namespace vexo {
namespace {

using Pieces = TextPattern::Pieces;

bool isASCII(std::string_view text) {
    return std::all_of(text.begin(), text.end(),
                       [](char byte) { return static_cast<unsigned char>(byte) < 0x80; });
}

char foldedASCII(char letter) {
    return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
}

icu::UnicodeString withoutMarks(const icu::UnicodeString& text) {
    icu::UnicodeString rest;
    for (int32_t i = 0; i < text.length(); i = text.moveIndex32(i, 1)) {
        if (u_charType(text.char32At(i)) != U_NON_SPACING_MARK)
            rest.append(text.char32At(i));
    }
    return rest;
}

icu::UnicodeString folded(icu::UnicodeString text, TextModifiers modifiers, UErrorCode& status) {
    // Accents are marks of their own only once they are taken apart.
    text = icu::Normalizer2::getNFDInstance(status)->normalize(text, status);
    if (modifiers.ignoresDiacritics)
        text = withoutMarks(text);
    if (modifiers.ignoresCase)
        text.foldCase();
    return icu::Normalizer2::getNFCInstance(status)->normalize(text, status);
}

// The text in the form in which equal texts have equal bytes.
std::string prepared(std::string_view text, TextModifiers modifiers) {
    std::string result(text);
    if (isASCII(text)) {
        if (modifiers.ignoresCase)
            std::transform(result.begin(), result.end(), result.begin(), foldedASCII);
        return result;
    }
    UErrorCode status = U_ZERO_ERROR;
    const icu::UnicodeString form = folded(icu::UnicodeString::fromUTF8(result), modifiers, status);
    if (U_FAILURE(status))
        return platform::validUTF8(text);
    result.clear();
    return form.toUTF8String(result);
}

Pieces prepared(Pieces pieces, TextModifiers modifiers) {
    for (std::string& piece : pieces)
        piece = prepared(piece, modifiers);
    return pieces;
}

bool isPartOfWord(UChar32 character) {
    return u_isalnum(character) || (U_GET_GC_MASK(character) & U_GC_M_MASK);
}

// Cuts pieces into words, each made of pieces in its turn. A word is letters and digits: unlike the rules for
// running text, an underscore or a hyphen ends it, because that is how names of files are made.
std::vector<Pieces> wordsOf(const Pieces& pieces) {
    std::vector<Pieces> words;
    Pieces word{""};
    const auto endWord = [&] {
        if (word != Pieces{""})
            words.push_back(word);
        word = {""};
    };
    for (std::size_t i = 0; i < pieces.size(); ++i) {
        if (i > 0)
            word.emplace_back();
        const std::string& piece = pieces[i];
        for (std::size_t at = 0, start = 0; at < piece.size(); start = at) {
            UChar32 character;
            U8_NEXT(piece.data(), at, piece.size(), character);
            if (character >= 0 && isPartOfWord(character))
                word.back().append(piece, start, at - start);
            else
                endWord();
        }
    }
    endWord();
    return words;
}

// Moves `text` behind the first `piece` in it. The C library's search is linear, std::string's is not.
bool moveBehind(std::string_view& text, const std::string& piece) {
    const auto* found =
        static_cast<const char*>(memmem(text.data(), text.size(), piece.data(), piece.size()));
    if (!found)
        return false;
    text.remove_prefix(static_cast<std::size_t>(found - text.data()) + piece.size());
    return true;
}

// Taking each piece at its first place is enough: what follows a wildcard never needs a later one.
bool takeIn(const Pieces& pieces, std::string_view text) {
    const std::string& first = pieces.front();
    const std::string& last = pieces.back();
    if (pieces.size() == 1)
        return text == first;
    if (!text.starts_with(first))
        return false;
    text.remove_prefix(first.size());
    if (!text.ends_with(last))
        return false;
    text.remove_suffix(last.size());
    return std::all_of(pieces.begin() + 1, pieces.end() - 1,
                       [&](const std::string& piece) { return moveBehind(text, piece); });
}

bool containsWords(const std::vector<Pieces>& text, const std::vector<Pieces>& pattern) {
    if (pattern.empty())
        return false;
    const auto takesIn = [](const Pieces& word, const Pieces& pieces) {
        return takeIn(pieces, word.front());
    };
    return std::search(text.begin(), text.end(), pattern.begin(), pattern.end(), takesIn) != text.end();
}

std::string joined(const Pieces& pieces) {
    std::string text = pieces.front();
    for (std::size_t i = 1; i < pieces.size(); ++i)
        text += "*" + pieces[i];
    return text;
}

}  // namespace

TextPattern::TextPattern(const Pieces& pieces, TextModifiers modifiers)
    : modifiers_(modifiers),
      pieces_(prepared(pieces, modifiers)),
      words_(modifiers.comparesWords ? wordsOf(pieces_) : std::vector<Pieces>()) {}

bool TextPattern::matches(std::string_view text) const {
    const std::string form = prepared(text, modifiers_);
    return modifiers_.comparesWords ? containsWords(wordsOf({form}), words_) : takeIn(pieces_, form);
}

std::strong_ordering TextPattern::orderOf(std::string_view text) const {
    return prepared(text, modifiers_) <=> joined(pieces_);
}

bool TextPattern::isAnything() const {
    return pieces_.size() > 1 && std::all_of(pieces_.begin(), pieces_.end(),
                                             [](const std::string& piece) { return piece.empty(); });
}

}  // namespace vexo
