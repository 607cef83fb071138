// The URLs of files and what is printed of paths. The input is taken for a URL and for a path: each comes
// back from the other the same, and nothing that is printed holds what a terminal would act on.
#include <algorithm>
#include <cstdint>

#include "fuzzing/Require.h"
#include "platform/URL.h"
#include "platform/linux/LogText.h"

namespace {

using platform::URL;

bool isPlain(char byte) {
    return static_cast<unsigned char>(byte) >= 0x20 && byte != '\x7F';
}

void requireThatItComesBack(const URL& url) {
    const std::string text = url.absoluteString();
    require(std::ranges::all_of(text, isPlain));
    const auto again = URL::fileURLWithString(text);
    require(again && again->absoluteString() == text);
    // Slashes at the end are left out.
    require(url.path().starts_with(again->path()));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view input(reinterpret_cast<const char*>(data), size);
    require(std::ranges::all_of(platform::printable(input), isPlain));
    if (const auto url = URL::fileURLWithString(input)) {
        require(url->path().starts_with('/'));
        requireThatItComesBack(*url);
    }
    if (input.find('\0') == std::string_view::npos)
        requireThatItComesBack(URL::fileURLWithPath("/" + std::string(input)));
    return 0;
}
