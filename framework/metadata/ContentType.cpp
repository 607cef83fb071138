#include "framework/metadata/ContentType.h"

#include <gio/gio.h>

#include <algorithm>
#include <memory>
#include <optional>

#include "platform/linux/PlainFile.h"

namespace vexo {

namespace {

// The database looks for movies within the first kilobyte; a transport stream's five packets are the longest.
constexpr std::size_t beginningBytes = 4096;

// An ISO file begins with its size, "ftyp", its brand and version, and then the other brands it keeps to.
constexpr std::size_t brandOffset = 8;
constexpr std::size_t firstOtherBrand = 16;
constexpr std::size_t brandBytes = 4;
constexpr std::size_t mostOtherBrands = 16;  // cameras name fewer than ten

// nil for a beginning that the database does not know.
std::optional<std::string> mimeOf(std::string_view beginning) {
    const std::unique_ptr<char, decltype(&g_free)> type(
        g_content_type_guess(nullptr, reinterpret_cast<const guchar*>(beginning.data()), beginning.size(),
                             /*result_uncertain=*/nullptr),
        g_free);
    if (!type || g_content_type_is_unknown(type.get()))
        return std::nullopt;
    return type.get();
}

bool isIsoFile(std::string_view beginning) {
    return beginning.size() >= firstOtherBrand && beginning.substr(4, 4) == "ftyp";
}

std::size_t sizeOfBrands(std::string_view beginning) {
    std::size_t declared = 0;
    for (const char byte : beginning.substr(0, 4))
        declared = declared << 8 | static_cast<unsigned char>(byte);
    return std::min({declared, beginning.size(), firstOtherBrand + mostOtherBrands * brandBytes});
}

// The database goes by the first brand alone. Cameras write one of their own there, and the common ones that
// they keep to after it; the beginning is therefore looked up as if each of those came first.
std::optional<std::string> mimeByOtherBrands(std::string beginning) {
    const std::size_t size = sizeOfBrands(beginning);
    for (std::size_t at = firstOtherBrand; at + brandBytes <= size; at += brandBytes) {
        beginning.replace(brandOffset, brandBytes, beginning.substr(at, brandBytes));
        if (auto mime = mimeOf(beginning))
            return mime;
    }
    return std::nullopt;
}

}  // namespace

const FileType* typeOfContent(std::string_view beginning) {
    auto mime = mimeOf(beginning);
    if (!mime && isIsoFile(beginning))
        mime = mimeByOtherBrands(std::string(beginning));
    return mime ? FileTypeTable::shared().typeForMime(*mime) : nullptr;
}

const FileType* typeOfContentOfFile(const std::string& path) {
    const auto beginning = platform::beginningOfPlainFile(path, beginningBytes);
    return beginning && !beginning->empty() ? typeOfContent(*beginning) : nullptr;
}

}  // namespace vexo
