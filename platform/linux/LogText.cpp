#include "platform/linux/LogText.h"

#include <fmt/format.h>

#include <system_error>

namespace platform {

namespace {

bool isControl(unsigned char byte) {
    return byte < 0x20 || byte == 0x7F;
}

// The C1 controls are two bytes in UTF-8, C2 80 to C2 9F; terminals obey them like an escape sequence.
bool isC1Control(std::string_view text, std::size_t index) {
    if (static_cast<unsigned char>(text[index]) != 0xC2 || index + 1 == text.size())
        return false;
    const auto second = static_cast<unsigned char>(text[index + 1]);
    return second >= 0x80 && second < 0xA0;
}

}  // namespace

std::string printable(std::string_view text) {
    std::string result;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const auto byte = static_cast<unsigned char>(text[i]);
        if (isControl(byte))
            result += fmt::format("\\x{:02x}", byte);
        else if (isC1Control(text, i))
            result += fmt::format("\\x{:02x}", static_cast<unsigned char>(text[++i]));
        else
            result += text[i];
    }
    return result;
}

std::string failureLine(std::string_view operation, std::string_view path, int error) {
    return fmt::format("cannot {} {}: {}", operation, printable(path),
                       std::generic_category().message(error));
}

// Paths are absolute, operations hold no slash, and messages no colon.
std::string_view pathInFailureLine(std::string_view line) {
    const auto begin = line.find('/');
    const auto end = line.rfind(": ");
    return begin < end && end != line.npos ? line.substr(begin, end - begin) : line;
}

}  // namespace platform
