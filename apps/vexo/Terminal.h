// Showing text to people: what a terminal can take, and how wide it is.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace vexo {

// The text without anything that a terminal would act on: control characters appear as their Unicode
// pictures, characters that reorder text and bytes that are not UTF-8 as U+FFFD.
std::string printable(std::string_view text);

// Columns that printable text takes.
std::size_t displayWidth(std::string_view text);
// The text cut to `width` columns, with an ellipsis where something was cut.
std::string fitted(const std::string& text, std::size_t width);
// The text followed by blanks up to `width` columns.
std::string padded(const std::string& text, std::size_t width);

// How standard output shows text.
struct OutputStyle {
    std::optional<std::size_t> width;  // columns of the terminal; nil when output goes elsewhere
    bool colors = false;

    static OutputStyle ofStandardOutput();

    std::string bold(const std::string& text) const { return wrap("1", text); }
    std::string dim(const std::string& text) const { return wrap("2", text); }
    std::string accent(const std::string& text) const { return wrap("36", text); }

  private:
    std::string wrap(const char* code, const std::string& text) const;
};

}  // namespace vexo
