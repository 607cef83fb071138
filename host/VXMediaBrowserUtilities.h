// Class-level utilities. Callable from any thread.
#pragma once

#include <string>
#include <string_view>

namespace vexo {

struct VXMediaBrowserUtilities {
    // supportedMovieFile:; whether the host plays the file at `path` as a movie, told by its type. Reads the
    // beginning of a file whose name tells no type, and nothing of any other.
    static bool supportedMovieFile(const std::string& path);
    // The same for a caller who knows that a plain file lies at `path`.
    static bool supportedPlainFile(const std::string& path);

    // localizedStringForKey:value:table: of the framework's own bundle, without a table: the text in the
    // user's language, or `value` for a key that the framework lacks.
    static std::string localizedStringForKey(std::string_view key, std::string_view value);
};

}  // namespace vexo
