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

// A file to be asked, by its path, or by its name and the open folder that it lies in: a kernel that knows
// how walks no path then.
class AttributedFile {
  public:
    AttributedFile(const std::string& path);  // NOLINT: a path is what says which file is meant
    // `folder` is the descriptor of the folder at `folderPath`. All of these outlive the object.
    AttributedFile(int folder, const std::string& folderPath, const char* name);

    // getxattr, with the negative errno for a failure.
    std::ptrdiff_t attribute(const std::string& name, std::span<char> buffer) const;
    std::string path() const;

  private:
    const int folder_;
    const std::string* const folderPath_;  // nil when the name is a path
    const char* const name_;
};

// The attribute "user.<name>", else "osx.<name>", by which drivers for foreign volumes show it, else, where
// the file system keeps no attributes, the one in the "._" file beside the file. An empty buffer asks for the
// size alone. Follows links.
AttributeAnswer extendedAttribute(const AttributedFile& file, std::string_view name, std::span<char> buffer,
                                  ForeignNames foreignNames);

// Whether the file that answered so was found.
bool isOfFoundFile(std::ptrdiff_t size);

// Anything but these is a trouble that someone should hear of.
bool isUsualForAttributes(int error);

// The path without links, "." and ".."; nil, and errno set, where nothing is there.
std::optional<std::string> canonicalPath(const std::string& path);

}  // namespace platform
