// A folder that asks a file manager's operations by path, so that what a test says of paths holds for it as
// well.
#pragma once

#include <filesystem>
#include <functional>
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
    static constexpr std::size_t itemsATime = 100;

    // Called before some of its items are told, with how many have been; whether they can be read.
    using BeforeReading = std::function<bool(const std::string& path, std::size_t itemsTold)>;

    // nil where the folder can't be listed. `files` is not owned.
    static std::unique_ptr<platform::Folder> open(const platform::FileManager& files, const std::string& path,
                                                  const BeforeReading& beforeReading = nullptr) {
        auto names = files.contentsOfDirectoryAtPath(path);
        return names ? std::make_unique<PathFolder>(files, path, std::move(*names), beforeReading) : nullptr;
    }
    PathFolder(const platform::FileManager& files, std::string path, std::vector<std::string> names,
               BeforeReading beforeReading)
        : files_(files),
          path_(std::move(path)),
          names_(std::move(names)),
          beforeReading_(std::move(beforeReading)) {}

    std::optional<std::vector<platform::FolderItem>> nextItems() override {
        if (beforeReading_ && !beforeReading_(path_, itemsTold_))
            return std::nullopt;
        std::vector<platform::FolderItem> items;
        for (; items.size() < itemsATime && itemsTold_ < names_.size(); ++itemsTold_)
            items.push_back({names_[itemsTold_]});
        isAtEnd_ = items.size() < itemsATime;
        return items;
    }
    bool mayHaveMoreItems() const override { return !isAtEnd_; }
    std::optional<std::uint32_t> flagsOf(const platform::FolderItem& item) const override {
        return files_.itemFlagsAtPath(pathOf(item));
    }
    bool isPlainFile(const platform::FolderItem& item) const override {
        std::error_code ignored;
        return std::filesystem::is_regular_file(pathOf(item), ignored);
    }
    std::optional<platform::FileAttributes> attributesOf(const platform::FolderItem& item) const override {
        return files_.attributesOfItemAtPath(pathOf(item));
    }
    std::optional<platform::FileAttributes> attributes() const override {
        return files_.attributesOfItemAtPath(path_);
    }
    std::optional<std::ptrdiff_t> extendedAttributeOf(const platform::FolderItem& item,
                                                      std::string_view attribute,
                                                      std::span<char> buffer) const override {
        const auto size = files_.extendedAttribute(pathOf(item), attribute, buffer);
        return size >= 0 || attributesOf(item) ? std::optional(size) : std::nullopt;
    }

    std::unique_ptr<platform::Folder> openFolder(const platform::FolderItem& item) const override {
        return files_.openFolderAtPath(pathOf(item));
    }

  private:
    std::string pathOf(const platform::FolderItem& item) const {
        return platform::path::appending(path_, item.name);
    }

    const platform::FileManager& files_;
    const std::string path_;
    const std::vector<std::string> names_;
    const BeforeReading beforeReading_;
    std::size_t itemsTold_ = 0;
    bool isAtEnd_ = false;
};

}  // namespace testing_support
