// Class-level utilities. Callable from any thread.
#pragma once

#include <string>

namespace vexo {

struct VXMediaBrowserUtilities {
    // supportedMovieFile:; whether the host plays the file at `path` as a movie, told by its type. Reads the
    // beginning of a file whose name tells no type, and nothing of any other.
    static bool supportedMovieFile(const std::string& path);
};

}  // namespace vexo
