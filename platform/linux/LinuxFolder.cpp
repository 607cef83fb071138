#include "platform/linux/LinuxFolder.h"

#include <dirent.h>
#include <fcntl.h>
#include <strings.h>
#include <sys/sysmacros.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <utility>

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

FolderItem::Kind kindOf(const dirent64& entry) {
    switch (entry.d_type) {
        case DT_REG:
            return FolderItem::Kind::plainFile;
        case DT_DIR:
            return FolderItem::Kind::folder;
        default:
            return FolderItem::Kind::other;
    }
}

// Of a block as getdents64 fills it, in which their names stay.
void addItems(std::vector<FolderItem>& items, const char* block, const char* end) {
    constexpr std::size_t usualSize = 40;  // with a name of 13 to 20 bytes
    if (items.empty())
        items.reserve(static_cast<std::size_t>(end - block) / usualSize);
    while (block < end) {
        const auto& entry = *reinterpret_cast<const dirent64*>(block);
        if (!isDotOrDotDot(entry.d_name))
            items.push_back({entry.d_name, kindOf(entry)});
        block += entry.d_reclen;
    }
}

// In any case of letters, because some file systems find the file by any. Of a large folder nothing is known
// as long as it isn't read to its end.
bool mayHoldHiddenFile(const FolderListing& listing) {
    return !listing.isComplete || std::ranges::any_of(listing.items, [](const FolderItem& item) {
        return item.name.starts_with('.') && strcasecmp(item.name.data(), ".hidden") == 0;
    });
}

dev_t deviceOf(const struct statx& status) {
    return makedev(status.stx_dev_major, status.stx_dev_minor);
}

}  // namespace

std::optional<FolderListing> FolderListing::open(int parent, const char* name) {
    constexpr int flags = O_RDONLY | O_DIRECTORY | O_CLOEXEC | O_NONBLOCK;
    FolderListing listing;
    listing.folder = FileDescriptor(uninterrupted([&] { return openat(parent, name, flags); }));
    if (!listing.folder || !listing.readOn())
        return std::nullopt;
    return listing;
}

// Without the C library's stream of a folder, which asks the system one thing more and takes a block of 32
// KiB for any folder. A block with room for another item mostly is the last, which only the next call tells.
bool FolderListing::readOn() {
    alignas(dirent64) std::array<char, 8 * 1024> buffer;
    std::size_t sizeRead = 0;
    while (!isComplete && sizeRead + sizeof(dirent64) <= buffer.size()) {
        const auto size =
            uninterrupted([&] { return getdents64(folder.number(), buffer.data(), buffer.size()); });
        if (size < 0 && errno != ENOENT)
            return false;
        if (size <= 0) {  // below 0 in a folder that is gone
            isComplete = true;
            return true;
        }
        auto block = std::make_unique_for_overwrite<char[]>(static_cast<std::size_t>(size));
        std::copy_n(buffer.data(), size, block.get());
        nameBlocks.push_back(std::move(block));
        addItems(items, nameBlocks.back().get(), nameBlocks.back().get() + size);
        sizeRead += static_cast<std::size_t>(size);
    }
    return true;
}

bool FolderListing::readToTheEnd() {
    while (!isComplete) {
        if (!readOn())
            return false;
    }
    return true;
}

std::optional<FolderListing> FolderListing::openOrLog(int parent, const char* name, const std::string& path,
                                                      SystemLog& log) {
    auto listing = open(parent, name);
    if (!listing && errno != ENOENT)
        log.log(failureLine("list", path, errno));
    return listing;
}

// What is in a folder can be hidden by a flag where the folder itself can.
LinuxFolder::Device::Device(const std::optional<struct statx>& folder)
    : number(folder ? std::optional(deviceOf(*folder)) : std::nullopt),
      mayHoldHiddenFlags(!folder || mayHaveHiddenFlag(*folder)) {}

bool LinuxFolder::Device::holds(const std::optional<struct statx>& folder) const {
    return folder && number == deviceOf(*folder);
}

LinuxFolder::LinuxFolder(FolderListing listing, std::string path, const Services& services)
    : LinuxFolder(std::move(listing), std::move(path), services, nullptr) {}

LinuxFolder::LinuxFolder(FolderListing listing, std::string path, const Services& services,
                         const std::shared_ptr<Device>& deviceOfParent)
    : listing_(std::move(listing)),
      path_(std::move(path)),
      services_(services),
      hiddenNames_(mayHoldHiddenFile(listing_) ? services_.hiddenNames.ofFolder(path_) : nullptr),
      status_(statusOfFile(listing_.folder.number(), "", AT_EMPTY_PATH)),
      device_(deviceOfParent && deviceOfParent->holds(status_) ? deviceOfParent
                                                               : std::make_shared<Device>(status_)) {}

std::optional<std::vector<FolderItem>> LinuxFolder::nextItems() {
    if (listing_.items.empty() && !listing_.readOn()) {
        services_.systemLog.log(failureLine("list", path_, errno));
        return std::nullopt;
    }
    return std::exchange(listing_.items, {});
}

// No call where the listing has told what the item is and nothing but its name can hide it.
std::optional<std::uint32_t> LinuxFolder::flagsOf(const FolderItem& item) const {
    bool isFolder = item.kind == FolderItem::Kind::folder;
    bool isInvisible = isInvisibleByName(item.name);
    if (item.kind == FolderItem::Kind::other || device_->mayHoldHiddenFlags) {
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

std::optional<FileAttributes> LinuxFolder::attributes() const {
    return status_ ? std::optional(attributesFromStatus(*status_)) : std::nullopt;
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
        isLikeOthers && !device_->mayHaveForeignNames ? ForeignNames::knownToBeMissing : ForeignNames::asked;
    const AttributeAnswer answer = platform::extendedAttribute(
        {listing_.folder.number(), path_, item.name.data()}, attribute, buffer, foreignNames);
    // Not written for each file: threads that write what others read wait for each other.
    if (foreignNames == ForeignNames::asked && isLikeOthers && !answer.hasForeignNames)
        device_->mayHaveForeignNames = false;
    if (answer.size < 0 && !isUsualForAttributes(static_cast<int>(-answer.size)))
        services_.systemLog.log(
            failureLine("read an attribute of", pathOf(item.name), static_cast<int>(-answer.size)));
    return isOfFoundFile(answer.size) ? std::optional(answer.size) : std::nullopt;
}

std::unique_ptr<Folder> LinuxFolder::openFolder(const FolderItem& item) const {
    std::string path = pathOf(item.name);
    if (!services_.reach.isInReach(path))
        return nullptr;
    auto listing =
        FolderListing::openOrLog(listing_.folder.number(), item.name.data(), path, services_.systemLog);
    if (!listing)
        return nullptr;
    return std::unique_ptr<Folder>(new LinuxFolder(std::move(*listing), std::move(path), services_, device_));
}

bool LinuxFolder::isInReach(const FolderItem& item) const {
    return item.kind != FolderItem::Kind::other || services_.reach.isInReach(pathOf(item.name));
}

std::optional<struct statx> LinuxFolder::statusOf(const FolderItem& item, int flags) const {
    const auto status = statusOfFile(listing_.folder.number(), item.name.data(), flags);
    if (!status && !meansMissing(errno))
        services_.systemLog.log(failureLine("look at", pathOf(item.name), errno));
    return status;
}

bool LinuxFolder::isInvisibleByName(std::string_view name) const {
    return name.starts_with('.') || (hiddenNames_ && hiddenNames_->contains(name));
}

std::string LinuxFolder::pathOf(std::string_view name) const {
    return path::appending(path_, name);
}

}  // namespace platform
