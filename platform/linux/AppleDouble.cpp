#include "platform/linux/AppleDouble.h"

#include <algorithm>
#include <cstdint>
#include <vector>

#include "platform/BigEndian.h"
#include "platform/Path.h"

namespace platform {

namespace {

constexpr std::size_t largestHead = 64 * 1024;
constexpr std::size_t largestValue = 128 * 1024;

constexpr std::uint32_t fileMagic = 0x00051607;
constexpr std::uint32_t fileVersion = 0x00020000;
constexpr std::size_t entryCountOffset = 24;
constexpr std::size_t entriesOffset = 26;
constexpr std::size_t entrySize = 12;
constexpr std::uint32_t finderInformationEntry = 9;

constexpr std::uint32_t attributesMagic = 0x41545452;  // "ATTR"
constexpr std::size_t attributesAfterFinderInformation = 34;
constexpr std::size_t attributeCountOffset = 34;
constexpr std::size_t attributeListOffset = 36;
constexpr std::size_t attributeNameOffset = 11;

struct Place {
    std::uint64_t offset;
    std::uint64_t length;
};

// The beginning of the file. What is asked for beyond its end reads as zeros, which no magic number, count or
// length takes for something.
class Head {
  public:
    explicit Head(ByteSource& file) : bytes_(std::min<std::uint64_t>(file.size(), largestHead)) {
        if (!file.read(0, bytes_))
            bytes_.clear();
    }

    std::uint32_t number(std::size_t offset, std::size_t width) const {
        if (offset + width > bytes_.size())
            return 0;
        return static_cast<std::uint32_t>(bigEndian(std::span(bytes_).subspan(offset, width)));
    }
    std::uint32_t word(std::size_t offset) const { return number(offset, 4); }

    std::string_view text(std::size_t offset, std::size_t length) const {
        if (offset + length > bytes_.size())
            return {};
        return {reinterpret_cast<const char*>(bytes_.data()) + offset, length};
    }

  private:
    std::vector<std::byte> bytes_;
};

std::optional<std::size_t> attributesOffset(const Head& head) {
    if (head.word(0) != fileMagic || head.word(4) != fileVersion)
        return std::nullopt;
    const std::size_t count = head.number(entryCountOffset, 2);
    for (std::size_t i = 0; i < count; ++i) {
        const std::size_t entry = entriesOffset + i * entrySize;
        if (head.word(entry) == finderInformationEntry)
            return head.word(entry + 4) + attributesAfterFinderInformation;
    }
    return std::nullopt;
}

// The name without the NUL that ends it.
std::string_view attributeName(const Head& head, std::size_t attribute, std::size_t length) {
    const auto name = head.text(attribute + attributeNameOffset, length);
    return name.substr(0, name.find('\0'));
}

std::optional<Place> placeOfAttribute(const Head& head, std::string_view name) {
    const auto table = attributesOffset(head);
    if (!table || head.word(*table) != attributesMagic)
        return std::nullopt;
    std::size_t attribute = *table + attributeListOffset;
    for (auto left = head.number(*table + attributeCountOffset, 2); left > 0; --left) {
        const std::size_t nameLength = head.number(attribute + attributeNameOffset - 1, 1);
        if (nameLength == 0)
            return std::nullopt;
        if (attributeName(head, attribute, nameLength) == name)
            return Place{head.word(attribute), head.word(attribute + 4)};
        constexpr std::size_t alignment = 4;
        attribute += (attributeNameOffset + nameLength + alignment - 1) / alignment * alignment;
    }
    return std::nullopt;
}

}  // namespace

std::optional<std::string> attributeInAppleDouble(ByteSource& file, std::string_view name) {
    const auto place = placeOfAttribute(Head(file), name);
    if (!place || place->length > largestValue || place->offset + place->length > file.size())
        return std::nullopt;
    std::string value(place->length, '\0');
    if (!file.read(place->offset, std::as_writable_bytes(std::span(value))))
        return std::nullopt;
    return value;
}

std::string appleDoublePath(const std::string& path) {
    return path::appending(path::withoutLastComponent(path), "._" + path::lastComponent(path));
}

}  // namespace platform
