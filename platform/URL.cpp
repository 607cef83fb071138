#include "platform/URL.h"

namespace platform {

namespace {

constexpr std::string_view scheme = "file://";
constexpr std::string_view localHost = "localhost";

bool isLetterOrDigit(char byte) {
    return (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z') || (byte >= '0' && byte <= '9');
}

// Of what a path may hold unescaped only ";" is escaped all the same, as other programs of the desktop do
// it: URLs of one file must be the same text everywhere (shared thumbnails are found by it).
bool standsForItself(char byte) {
    constexpr std::string_view marks =
        "-._~"        // unreserved
        "!$&'()*+,="  // delimiters that mean nothing in a path
        ":@/";
    return isLetterOrDigit(byte) || marks.find(byte) != marks.npos;
}

void appendEscaped(std::string& text, char byte) {
    constexpr std::string_view digits = "0123456789ABCDEF";
    const auto value = static_cast<unsigned char>(byte);
    text += {'%', digits[value >> 4], digits[value & 0x0F]};
}

// -1 for anything that is no hexadecimal digit.
int hexadecimalValue(char digit) {
    if (digit >= '0' && digit <= '9')
        return digit - '0';
    if (digit >= 'a' && digit <= 'f')
        return digit - 'a' + 10;
    if (digit >= 'A' && digit <= 'F')
        return digit - 'A' + 10;
    return -1;
}

// The byte that "%41" at the start of `text` stands for. nil for a bad escape and for the two bytes that no
// name can hold.
std::optional<char> unescapedByte(std::string_view text) {
    if (text.size() < 3)
        return std::nullopt;
    const int high = hexadecimalValue(text[1]);
    const int low = hexadecimalValue(text[2]);
    if (high < 0 || low < 0)
        return std::nullopt;
    const char byte = static_cast<char>(high * 16 + low);
    return byte == '\0' || byte == '/' ? std::nullopt : std::optional(byte);
}

std::optional<std::string> unescapedPath(std::string_view text) {
    std::string path;
    for (std::size_t i = 0; i < text.size(); ++i) {
        std::optional<char> byte = text[i];
        if (byte == '%') {
            byte = unescapedByte(text.substr(i));
            i += 2;
        } else if (byte == '\0' || byte == '?' || byte == '#') {
            return std::nullopt;
        }
        if (!byte)
            return std::nullopt;
        path += *byte;
    }
    return path;
}

bool startsWithIgnoringCase(std::string_view text, std::string_view lowercasePrefix) {
    const auto matches = [](char letter, char lowercase) {
        return (letter >= 'A' && letter <= 'Z' ? letter + ('a' - 'A') : letter) == lowercase;
    };
    return text.size() >= lowercasePrefix.size() &&
           std::equal(lowercasePrefix.begin(), lowercasePrefix.end(), text.begin(),
                      [&](char lowercase, char letter) { return matches(letter, lowercase); });
}

std::string_view withoutTrailingSlashes(std::string_view path) {
    while (path.size() > 1 && path.ends_with('/'))
        path.remove_suffix(1);
    return path;
}

}  // namespace

std::optional<URL> URL::fileURLWithString(std::string_view text) {
    if (!startsWithIgnoringCase(text, scheme))
        return std::nullopt;
    text.remove_prefix(scheme.size());
    if (startsWithIgnoringCase(text, localHost))
        text.remove_prefix(localHost.size());
    if (!text.starts_with('/'))
        return std::nullopt;
    std::optional<std::string> path = unescapedPath(withoutTrailingSlashes(text));
    return path ? std::optional(URL(std::move(*path))) : std::nullopt;
}

std::string URL::absoluteString() const {
    std::string text(scheme);
    for (const char byte : withoutTrailingSlashes(path_)) {
        if (standsForItself(byte))
            text += byte;
        else
            appendEscaped(text, byte);
    }
    return text;
}

}  // namespace platform
