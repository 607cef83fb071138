// A folder that asks a file manager's operations by path, so that what a test says of paths holds for it as
// well.
#pragma once

#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "platform/FileManager.h"
#include "platform/Path.h"

namespace testing_support {

class PathFolder final : public platform::Folder {
  public:
    // nil where the folder can't be listed. `files` is not owned.
    static std::unique_ptr<platform::Folder> open(const platform::FileManager& files,
                                                  const std::string& path) {
        auto names = files.contentsOfDirectoryAtPath(path);
        return names ? std::make_unique<PathFolder>(files, path, std::move(*names)) : nullptr;
    }
    PathFolder(const platform::FileManager& files, std::string path, std::vector<std::string> names)
        : files_(files), path_(std::move(path)), names_(std::move(names)) {}

    const std::vector<std::string>& names() const override { return names_; }
    std::optional<platform::FolderEntry> entryNamed(const std::string& name) const override {
        const std::string item = pathOf(name);
        const auto flags = files_.itemFlagsAtPath(item);
        if (!flags)
            return std::nullopt;
        platform::FolderEntry entry;
        entry.flags = *flags;
        std::error_code ignored;
        entry.isPlainFile = std::filesystem::is_regular_file(item, ignored);
        const auto attributes = files_.attributesOfItemAtPath(item);
        entry.hasAttributes = attributes.has_value();
        if (attributes && attributes->creationDate)
            entry.creationTime = attributes->creationDate->secondsSince1970();
        return entry;
    }
    std::ptrdiff_t extendedAttribute(const std::string& name, const platform::FolderEntry&,
                                     std::string_view attribute, std::span<char> buffer) const override {
        return files_.extendedAttribute(pathOf(name), attribute, buffer);
    }

  private:
    std::string pathOf(const std::string& name) const { return platform::path::appending(path_, name); }

    const platform::FileManager& files_;
    const std::string path_;
    const std::vector<std::string> names_;
};

}  // namespace testing_support
