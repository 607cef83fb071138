#pragma once

#include <fstream>
#include <iterator>
#include <string>

namespace testing_support {

// All bytes of a file; empty when it cannot be read.
inline std::string contentOf(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

}  // namespace testing_support
