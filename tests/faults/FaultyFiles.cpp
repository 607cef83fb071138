#include "tests/faults/FaultyFiles.h"

#include <algorithm>

#include "platform/Path.h"

namespace testing_support {
namespace {

using BeforeOperation = FaultyFiles::BeforeOperation;

bool goesOn(const BeforeOperation& beforeOperation, const std::string& path) {
    return !beforeOperation || beforeOperation(path);
}

// Tells few items at a time, as a large folder does.
class FaultyFolder final : public platform::Folder {
  public:
    FaultyFolder(std::unique_ptr<platform::Folder> real, std::string path,
                 const BeforeOperation& beforeOperation)
        : real_(std::move(real)),
          path_(std::move(path)),
          itemsLeft_(real_->allItems().value()),
          beforeOperation_(beforeOperation) {
        std::ranges::sort(itemsLeft_, std::ranges::greater(), &platform::FolderItem::name);
    }

    std::optional<std::vector<platform::FolderItem>> nextItems() override {
        if (!goesOn(beforeOperation_, path_))
            return std::nullopt;
        constexpr std::size_t few = 2;
        std::vector<platform::FolderItem> next;
        for (; !itemsLeft_.empty() && next.size() < few; itemsLeft_.pop_back())
            next.push_back(itemsLeft_.back());
        return next;
    }
    bool mayHaveMoreItems() const override { return !itemsLeft_.empty(); }
    std::optional<std::uint32_t> flagsOf(const platform::FolderItem& item) const override {
        return asks(item) ? real_->flagsOf(item) : std::nullopt;
    }
    bool isPlainFile(const platform::FolderItem& item) const override {
        return asks(item) && real_->isPlainFile(item);
    }
    std::optional<platform::FileAttributes> attributesOf(const platform::FolderItem& item) const override {
        return asks(item) ? real_->attributesOf(item) : std::nullopt;
    }
    std::optional<platform::FileAttributes> attributes() const override {
        return goesOn(beforeOperation_, path_) ? real_->attributes() : std::nullopt;
    }
    std::optional<std::ptrdiff_t> extendedAttributeOf(const platform::FolderItem& item,
                                                      std::string_view attribute,
                                                      std::span<char> buffer) const override {
        return asks(item) ? real_->extendedAttributeOf(item, attribute, buffer) : std::nullopt;
    }

    std::unique_ptr<platform::Folder> openFolder(const platform::FolderItem& item) const override {
        auto opened = asks(item) ? real_->openFolder(item) : nullptr;
        return opened ? std::make_unique<FaultyFolder>(
                            std::move(opened), platform::path::appending(path_, item.name), beforeOperation_)
                      : nullptr;
    }

  private:
    bool asks(const platform::FolderItem& item) const {
        return goesOn(beforeOperation_, platform::path::appending(path_, item.name));
    }

    const std::unique_ptr<platform::Folder> real_;
    const std::string path_;
    std::vector<platform::FolderItem> itemsLeft_;  // the next one last
    const BeforeOperation& beforeOperation_;
};

class FaultyBytes final : public platform::ByteSource {
  public:
    FaultyBytes(std::unique_ptr<platform::ByteSource> real, const BeforeOperation& beforeOperation)
        : real_(std::move(real)), beforeOperation_(beforeOperation) {}

    std::uint64_t size() const override { return real_->size(); }
    std::string name() const override { return real_->name(); }
    bool read(std::uint64_t offset, std::span<std::byte> buffer) override {
        return goesOn(beforeOperation_, name()) && real_->read(offset, buffer);
    }

  private:
    const std::unique_ptr<platform::ByteSource> real_;
    const BeforeOperation& beforeOperation_;
};

}  // namespace

std::optional<std::string> FaultyFiles::homeDirectory() const {
    return real().homeDirectory();
}

std::optional<platform::FileKind> FaultyFiles::kindOfItemAtPath(const std::string& path) const {
    return goesOn(beforeOperation, path) ? real().kindOfItemAtPath(path) : std::nullopt;
}

std::optional<std::vector<std::string>> FaultyFiles::contentsOfDirectoryAtPath(
    const std::string& path) const {
    auto names = goesOn(beforeOperation, path) ? real().contentsOfDirectoryAtPath(path) : std::nullopt;
    if (names)
        std::ranges::sort(*names);
    return names;
}

std::unique_ptr<platform::Folder> FaultyFiles::openFolderAtPath(const std::string& path) const {
    auto folder = goesOn(beforeOperation, path) ? real().openFolderAtPath(path) : nullptr;
    return folder ? std::make_unique<FaultyFolder>(std::move(folder), path, beforeOperation) : nullptr;
}

std::optional<platform::FileAttributes> FaultyFiles::attributesOfItemAtPath(const std::string& path) const {
    return goesOn(beforeOperation, path) ? real().attributesOfItemAtPath(path) : std::nullopt;
}

std::optional<std::uint32_t> FaultyFiles::itemFlagsAtPath(const std::string& path) const {
    return goesOn(beforeOperation, path) ? real().itemFlagsAtPath(path) : std::nullopt;
}

std::optional<std::string> FaultyFiles::displayNameAtPath(const std::string& path) const {
    return goesOn(beforeOperation, path) ? real().displayNameAtPath(path) : std::nullopt;
}

std::ptrdiff_t FaultyFiles::extendedAttribute(const std::string& path, std::string_view name,
                                              std::span<char> buffer) const {
    return goesOn(beforeOperation, path) ? real().extendedAttribute(path, name, buffer) : -1;
}

std::optional<std::string> FaultyFiles::fileSystemTypeNameAtPath(const std::string& path) const {
    return goesOn(beforeOperation, path) ? real().fileSystemTypeNameAtPath(path) : std::nullopt;
}

std::unique_ptr<platform::ByteSource> FaultyFiles::openFileAtPath(const std::string& path) const {
    auto file = goesOn(beforeOperation, path) ? real().openFileAtPath(path) : nullptr;
    return file ? std::make_unique<FaultyBytes>(std::move(file), beforeOperation) : nullptr;
}

std::optional<std::string> FaultyFiles::resolvedPath(const std::string& path) const {
    return goesOn(beforeOperation, path) ? real().resolvedPath(path) : std::nullopt;
}

}  // namespace testing_support
