// The names of file-system types: Linux's, and the ones by which the platform knows the types that matter to
// its programs ("msdos", "ntfs", "nfs", "afpfs", "webdav", "udf").
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace platform {

// The platform's name for a type as statfs numbers it; the number in hexadecimal when it is unknown.
std::string fileSystemNameForMagic(std::uint32_t magic);

// The platform's name for a type as the mount table names it. The device decides where the type says only
// that a program serves the files.
std::string fileSystemNameForType(std::string_view type, std::string_view device);

bool isFuse(std::string_view type);
// Whether the files are on another machine, or on the host of a virtual one.
bool isNetworkFileSystem(std::string_view type, std::string_view device);

}  // namespace platform
