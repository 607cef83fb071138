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

// nil, and errno set, when reading fails.
std::optional<std::vector<std::string>> readNames(DIR* folder) {
    std::vector<std::string> names;
    for (;;) {
        const dirent* const entry = uninterrupted([folder] { return readdir(folder); });
        if (!entry)
            break;
        if (!isDotOrDotDot(entry->d_name))
            names.emplace_back(entry->d_name);
    }
    return errno == 0 ? std::optional(std::move(names)) : std::nullopt;
}

// In any case of letters, because some file systems find the file by any.
bool holdsHiddenFile(const FolderListing& listing) {
    return std::ranges::any_of(listing.names, [](const std::string& name) {
        return name.starts_with('.') && strcasecmp(name.c_str(), ".hidden") == 0;
    });
}

std::uint64_t deviceOf(const struct statx& status) {
    return std::uint64_t{status.stx_dev_major} << 32 | status.stx_dev_minor;
}

std::optional<std::uint64_t> deviceOf(DIR* folder) {
    const auto status = statusOfFile(dirfd(folder), "", AT_EMPTY_PATH);
    return status ? std::optional(deviceOf(*status)) : std::nullopt;
}

}  // namespace

std::optional<FolderListing> FolderListing::open(const std::string& path) {
    std::unique_ptr<DIR, Closer> folder(uninterrupted([&] { return opendir(path.c_str()); }));
    if (!folder)
        return std::nullopt;
    auto names = readNames(folder.get());
    if (!names)
        return std::nullopt;
    return FolderListing{std::move(folder), std::move(*names)};
}

LinuxFolder::LinuxFolder(FolderListing listing, std::string path, const Services& services)
    : listing_(std::move(listing)),
      path_(std::move(path)),
      services_(services),
      hiddenNames_(holdsHiddenFile(listing_) ? services_.hiddenNames.ofFolder(path_) : nullptr),
      device_(deviceOf(listing_.folder.get())) {}

// One call for a file or folder; a link takes another one, for what it leads to.
std::optional<FolderEntry> LinuxFolder::entryNamed(const std::string& name) const {
    const auto status = statusOf(name, AT_SYMLINK_NOFOLLOW);
    if (!status)
        return std::nullopt;
    FolderEntry entry;
    entry.flags = containerFlags(*status, name, services_.isPackageExtension);
    if (isInvisible(name, *status))
        entry.flags |= itemIsInvisible;

    entry.isOnFoldersDevice = isOnFoldersDevice(*status);
    const auto target = S_ISLNK(status->stx_mode) ? statusOf(name, 0) : status;
    if (!target)
        return entry;
    entry.hasAttributes = true;
    entry.isPlainFile = S_ISREG(target->stx_mode);
    entry.creationTime = creationTime(*target);
    return entry;
}

std::ptrdiff_t LinuxFolder::extendedAttribute(const std::string& name, const FolderEntry& entry,
                                              std::string_view attribute, std::span<char> buffer) const {
    const auto foreignNames = entry.isOnFoldersDevice && !mayHaveForeignNames_
                                  ? ForeignNames::knownToBeMissing
                                  : ForeignNames::asked;
    const std::string path = pathOf(name);
    const AttributeAnswer answer = platform::extendedAttribute(path, attribute, buffer, foreignNames);
    if (entry.isOnFoldersDevice && !answer.hasForeignNames)
        mayHaveForeignNames_ = false;
    if (answer.size < 0 && !isUsualForAttributes(static_cast<int>(-answer.size)))
        services_.systemLog.log(failureLine("read an attribute of", path, static_cast<int>(-answer.size)));
    return answer.size;
}

std::optional<struct statx> LinuxFolder::statusOf(const std::string& name, int flags) const {
    const auto status = statusOfFile(dirfd(listing_.folder.get()), name.c_str(), flags);
    if (!status && !meansMissing(errno))
        services_.systemLog.log(failureLine("look at", pathOf(name), errno));
    return status;
}

bool LinuxFolder::isInvisible(const std::string& name, const struct statx& status) const {
    return name.starts_with('.') || (hiddenNames_ && hiddenNames_->contains(name)) ||
           (mayHaveHiddenFlag(status) && hasHiddenFlag(pathOf(name)));
}

bool LinuxFolder::isOnFoldersDevice(const struct statx& status) const {
    return !S_ISLNK(status.stx_mode) && deviceOf(status) == device_;
}

std::string LinuxFolder::pathOf(const std::string& name) const {
    return path::appending(path_, name);
}

}  // namespace platform
