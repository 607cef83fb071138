#include "apps/vexo/Terminal.h"

#include <glib.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cstdlib>

#include "platform/Text.h"

namespace vexo {
namespace {

constexpr gunichar controlPictures = 0x2400;
constexpr gunichar pictureOfDelete = 0x2421;
constexpr gunichar replacement = 0xFFFD;

bool reordersText(gunichar c) {
    return c == 0x061C || c == 0x200E || c == 0x200F || (0x202A <= c && c <= 0x202E) ||
           (0x2066 <= c && c <= 0x2069);
}

gunichar shown(gunichar c) {
    if (c < 0x20)
        return controlPictures + c;
    if (c == 0x7F)
        return pictureOfDelete;
    const bool isControl = (0x80 <= c && c < 0xA0) || c == 0x2028 || c == 0x2029;
    return isControl || reordersText(c) ? replacement : c;
}

void append(std::string& text, gunichar c) {
    char bytes[6];
    text.append(bytes, static_cast<std::size_t>(g_unichar_to_utf8(c, bytes)));
}

std::size_t widthOf(gunichar c) {
    if (g_unichar_iszerowidth(c))
        return 0;
    return g_unichar_iswide(c) ? 2 : 1;
}

std::size_t columnsOfTerminal() {
    winsize size{};
    if (ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0)
        return size.ws_col;
    const char* columns = std::getenv("COLUMNS");
    const long wanted = columns ? std::strtol(columns, nullptr, 10) : 0;
    return wanted > 0 ? static_cast<std::size_t>(wanted) : 80;
}

}  // namespace

std::string printable(std::string_view text) {
    const std::string valid = platform::validUTF8(text);
    std::string result;
    // By position, not by terminator: a name from a document may hold a NUL.
    for (const char* c = valid.data(); c < valid.data() + valid.size(); c = g_utf8_next_char(c))
        append(result, shown(g_utf8_get_char(c)));
    return result;
}

std::size_t displayWidth(std::string_view text) {
    std::size_t width = 0;
    for (const char* c = text.data(); c < text.data() + text.size(); c = g_utf8_next_char(c))
        width += widthOf(g_utf8_get_char(c));
    return width;
}

std::string fitted(const std::string& text, std::size_t width) {
    if (displayWidth(text) <= width)
        return text;
    if (width == 0)
        return {};
    std::string result;
    std::size_t used = 0;
    for (const char* c = text.data(); c < text.data() + text.size(); c = g_utf8_next_char(c)) {
        used += widthOf(g_utf8_get_char(c));
        if (used + 1 > width)
            break;
        append(result, g_utf8_get_char(c));
    }
    return result + "…";
}

std::string padded(const std::string& text, std::size_t width) {
    const std::size_t used = displayWidth(text);
    return used < width ? text + std::string(width - used, ' ') : text;
}

OutputStyle OutputStyle::ofStandardOutput() {
    if (!isatty(STDOUT_FILENO))
        return {};
    const char* noColor = std::getenv("NO_COLOR");
    const char* terminal = std::getenv("TERM");
    const bool colors = !(noColor && *noColor) && terminal && std::string_view(terminal) != "dumb";
    return {columnsOfTerminal(), colors};
}

std::string OutputStyle::wrap(const char* code, const std::string& text) const {
    return colors ? std::string("\033[") + code + "m" + text + "\033[0m" : text;
}

}  // namespace vexo
