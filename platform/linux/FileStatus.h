// What the kernel's answer about a file means here.
#pragma once

#include <sys/stat.h>

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "platform/FileManager.h"

namespace platform {

// Asks statx for what these functions look at; `flags` go with AT_NO_AUTOMOUNT. nil, and errno set, where the
// kernel answers an error.
std::optional<struct statx> statusOfFile(int folder, const char* path, int flags);

// What a link holds; nil, and errno set, for what is no link or can't be read.
std::optional<std::string> targetOfLink(const std::string& path);

// Whether the error says that nothing is there.
bool meansMissing(int error);

// Seconds from 1970; nil where the file system doesn't say. Files have been made at their birth time, or
// where none is kept at the time of their last change.
std::optional<double> modificationTime(const struct statx& status);
std::optional<double> creationTime(const struct statx& status);

// Container and package, of the flags of a folder with this name.
std::uint32_t flagsOfFolder(std::string_view name,
                            const std::function<bool(std::string_view extension)>& isPackageExtension);

// What attributesOfItemAtPath answers.
FileAttributes attributesFromStatus(const struct statx& status);

// Whether it is worth another call to ask for the hidden flag of FAT and NTFS.
bool mayHaveHiddenFlag(const struct statx& status);

}  // namespace platform
