// Extended attributes of files, by whatever name the file system keeps them.
#pragma once

#include <cstddef>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace platform {

// Whether the names by which drivers for foreign volumes show attributes are worth asking for.
enum class ForeignNames { asked, knownToBeMissing };

struct AttributeAnswer {
    std::ptrdiff_t size;          // of the value, or the negative errno
    bool hasForeignNames = true;  // false where the file system turned out to know none
};

// The attribute "user.<name>", else "osx.<name>", by which drivers for foreign volumes show it, else, where
// the file system keeps no attributes, the one in the "._" file beside the file. An empty buffer asks for the
// size alone. Follows links.
AttributeAnswer extendedAttribute(const std::string& path, std::string_view name, std::span<char> buffer,
                                  ForeignNames foreignNames);

// Anything but these is a trouble that someone should hear of.
bool isUsualForAttributes(int error);

// The path without links, "." and ".."; nil, and errno set, where nothing is there.
std::optional<std::string> canonicalPath(const std::string& path);

}  // namespace platform
