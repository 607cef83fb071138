// How many descriptors the process has open, so that a test can tell whether one stayed open.
#pragma once

#include <cstddef>
#include <filesystem>
#include <iterator>

namespace testing_support {

// Counts the one that looks, each time.
inline std::ptrdiff_t openDescriptors() {
    return std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {});
}

}  // namespace testing_support
