#include "platform/linux/LinuxFolder.h"

#include <fcntl.h>
#include <strings.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "platform/Path.h"
#include "platform/linux/ExtendedAttributes.h"
#include "platform/linux/FileStatus.h"
#include "platform/linux/HiddenFlag.h"
#include "platform/linux/LogText.h"
#include "platform/linux/Uninterrupted.h"

namespace platform {

namespace {

bool isDotOrDotDot(const char* name) {
    return std::strcmp(name, ".") == 0 || std::strcmp(name, "..") == 0;
}

FolderItem::Kind kindOf(const dirent& entry) {
    switch (entry.d_type) {
        case DT_REG:
            return FolderItem::Kind::plainFile;
        case DT_DIR:
            return FolderItem::Kind::folder;
        default:
            return FolderItem::Kind::other;
    }
}

// nil, and errno set, when reading fails.
std::optional<std::vector<FolderItem>> readItems(DIR* folder) {
    std::vector<FolderItem> items;
    for (;;) {
        const dirent* const entry = uninterrupted([folder] { return readdir(folder); });
        if (!entry)
            break;
        if (!isDotOrDotDot(entry->d_name))
            items.push_back({entry->d_name, kindOf(*entry)});
    }
    return errno == 0 ? std::optional(std::move(items)) : std::nullopt;
}

// In any case of letters, because some file systems find the file by any.
bool holdsHiddenFile(const FolderListing& listing) {
    return std::ranges::any_of(listing.items, [](const FolderItem& item) {
        return item.name.starts_with('.') && strcasecmp(item.name.c_str(), ".hidden") == 0;
    });
}

// What is in a folder can be hidden by a flag where the folder itself can.
bool mayHoldHiddenFlags(DIR* folder) {
    const auto status = statusOfFile(dirfd(folder), "", AT_EMPTY_PATH);
    return !status || mayHaveHiddenFlag(*status);
}

}  // namespace

std::optional<FolderListing> FolderListing::open(const std::string& path) {
    std::unique_ptr<DIR, Closer> folder(uninterrupted([&] { return opendir(path.c_str()); }));
    if (!folder)
        return std::nullopt;
    auto items = readItems(folder.get());
    if (!items)
        return std::nullopt;
    return FolderListing{std::move(folder), std::move(*items)};
}

LinuxFolder::LinuxFolder(FolderListing listing, std::string path, const Services& services)
    : listing_(std::move(listing)),
      path_(std::move(path)),
      services_(services),
      hiddenNames_(holdsHiddenFile(listing_) ? services_.hiddenNames.ofFolder(path_) : nullptr),
      mayHoldHiddenFlags_(mayHoldHiddenFlags(listing_.folder.get())) {}

// No call where the listing has told what the item is and nothing but its name can hide it.
std::optional<std::uint32_t> LinuxFolder::flagsOf(const FolderItem& item) const {
    bool isFolder = item.kind == FolderItem::Kind::folder;
    bool isInvisible = isInvisibleByName(item.name);
    if (item.kind == FolderItem::Kind::other || mayHoldHiddenFlags_) {
        const auto status = statusOf(item, AT_SYMLINK_NOFOLLOW);
        if (!status)
            return std::nullopt;
        isFolder = S_ISDIR(status->stx_mode);
        isInvisible = isInvisible || (mayHaveHiddenFlag(*status) && hasHiddenFlag(pathOf(item.name)));
    }
    return (isFolder ? flagsOfFolder(item.name, services_.isPackageExtension) : 0u) |
           (isInvisible ? static_cast<std::uint32_t>(itemIsInvisible) : 0u);
}

bool LinuxFolder::isPlainFile(const FolderItem& item) const {
    if (item.kind != FolderItem::Kind::other)
        return item.kind == FolderItem::Kind::plainFile;
    const auto status = isInReach(item) ? statusOf(item, /*flags=*/0) : std::nullopt;
    return status && S_ISREG(status->stx_mode);
}

std::optional<FileAttributes> LinuxFolder::attributesOf(const FolderItem& item) const {
    const auto status = isInReach(item) ? statusOf(item, /*flags=*/0) : std::nullopt;
    return status ? std::optional(attributesFromStatus(*status)) : std::nullopt;
}

std::optional<std::ptrdiff_t> LinuxFolder::extendedAttributeOf(const FolderItem& item,
                                                               std::string_view attribute,
                                                               std::span<char> buffer) const {
    if (!isInReach(item))
        return std::nullopt;
    // On the folder's device. A single file onto which one of another is mounted counts as well: nobody does
    // that to a clip.
    const bool isLikeOthers = item.kind == FolderItem::Kind::plainFile;
    const auto foreignNames =
        isLikeOthers && !mayHaveForeignNames_ ? ForeignNames::knownToBeMissing : ForeignNames::asked;
    const AttributeAnswer answer = platform::extendedAttribute(
        {dirfd(listing_.folder.get()), path_, item.name}, attribute, buffer, foreignNames);
    if (isLikeOthers && !answer.hasForeignNames)
        mayHaveForeignNames_ = false;
    if (answer.size < 0 && !isUsualForAttributes(static_cast<int>(-answer.size)))
        services_.systemLog.log(
            failureLine("read an attribute of", pathOf(item.name), static_cast<int>(-answer.size)));
    return isOfFoundFile(answer.size) ? std::optional(answer.size) : std::nullopt;
}

bool LinuxFolder::isInReach(const FolderItem& item) const {
    return item.kind != FolderItem::Kind::other || services_.reach.isInReach(pathOf(item.name));
}

std::optional<struct statx> LinuxFolder::statusOf(const FolderItem& item, int flags) const {
    const auto status = statusOfFile(dirfd(listing_.folder.get()), item.name.c_str(), flags);
    if (!status && !meansMissing(errno))
        services_.systemLog.log(failureLine("look at", pathOf(item.name), errno));
    return status;
}

bool LinuxFolder::isInvisibleByName(const std::string& name) const {
    return name.starts_with('.') || (hiddenNames_ && hiddenNames_->contains(name));
}

std::string LinuxFolder::pathOf(const std::string& name) const {
    return path::appending(path_, name);
}

}  // namespace platform
