// Extended attributes in AppleDouble files: the "._name" files that some systems write beside a file where
// the file system has no room for its attributes.
//
// The format is big-endian: a list of entries, one of which (number 9) holds 32 bytes of Finder information,
// 2 bytes of padding and a table of attributes whose values lie anywhere in the file.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/ByteSource.h"

namespace platform {

// The value of the attribute `name`; nil when there is none or the file is damaged. Reads at most 64 KiB of
// the file and a value of at most 128 KiB, which is what the format allows.
std::optional<std::string> attributeInAppleDouble(ByteSource& file, std::string_view name);

// Where the attributes of the file at `path` are: "/a/._b" for "/a/b".
std::string appleDoublePath(const std::string& path);

}  // namespace platform
