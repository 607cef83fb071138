// Opening and reading files that others may have put there: only plain files are opened, so nothing blocks
// and no device is touched, and nothing is read without a limit.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "platform/linux/FileDescriptor.h"

namespace platform {

// A plain file that is open for reading, or the errno that says why there is none. What exists and is no
// plain file fails with EISDIR or ENODEV.
struct PlainFile {
    FileDescriptor descriptor;
    std::uint64_t size = 0;
    int error = 0;

    static PlainFile open(const std::string& path);
    explicit operator bool() const { return static_cast<bool>(descriptor); }
};

// Reads up to `length` bytes from `offset` on; fewer where the file ends. Negative on failure.
std::ptrdiff_t readAt(const FileDescriptor& file, std::uint64_t offset, std::byte* buffer,
                      std::size_t length);

// The first `limit` bytes of a plain file; nil when it can't be read.
std::optional<std::string> beginningOfPlainFile(const std::string& path, std::size_t limit);
// The whole of a plain file; nil when it can't be read or is larger than `limit` bytes.
std::optional<std::string> contentsOfPlainFile(const std::string& path, std::size_t limit);

}  // namespace platform
