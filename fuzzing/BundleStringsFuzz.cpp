// Files of texts: the text of every key is UTF-8 without an end in its middle.
#include <cstdint>

#include "framework/BundleStrings.h"
#include "fuzzing/Require.h"
#include "platform/Text.h"

namespace {

std::string_view nextLine(std::string_view& rest) {
    const std::string_view line = rest.substr(0, rest.find('\n'));
    rest.remove_prefix(std::min(line.size() + 1, rest.size()));
    return line;
}

void requireText(const vexo::BundleStrings& strings, std::string_view key) {
    if (const auto text = strings.stringForKey(key))
        require(platform::isValidUTF8(*text) && text->find('\0') == std::string::npos);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const bool isLanguageSet = setenv("LANGUAGE", "de:pt_BR", /*overwrite=*/1) == 0;
    require(isLanguageSet);
    std::string_view rest(reinterpret_cast<const char*>(data), size);
    const auto strings = vexo::BundleStrings::withData(rest, "fuzzed");
    while (!rest.empty()) {
        const std::string_view line = nextLine(rest);
        requireText(strings, line.substr(0, line.find_first_of("=[ \t")));
    }
    return 0;
}
