#include "apps/vexo/Paths.h"

#include <algorithm>
#include <filesystem>

namespace vexo {

std::string absolutePath(const std::string& path) {
    std::error_code unknown;
    std::filesystem::path absolute = std::filesystem::absolute(path, unknown);
    if (unknown)
        return path;
    // What ".." leads to is known to the file system alone: the component before it may be a link.
    if (std::find(absolute.begin(), absolute.end(), "..") == absolute.end())
        absolute = absolute.lexically_normal();
    std::string text = absolute.string();
    while (text.size() > 1 && text.back() == '/')
        text.pop_back();
    return text;
}

}  // namespace vexo
