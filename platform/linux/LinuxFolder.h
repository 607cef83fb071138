// A folder of the machine that is gone through: every look at an item goes by the folder's descriptor, so the
// kernel walks no path, and what holds for the whole folder is found out once. Kernels before 6.13 tell
// attributes by path alone: there a folder that is moved has none any more.
#pragma once

#include <fcntl.h>
#include <sys/stat.h>

#include <atomic>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/FileManager.h"
#include "platform/SystemLog.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/HiddenNames.h"
#include "platform/linux/MountReach.h"

namespace platform {

// An open folder, whose items are read in the order of the file system, some at a time.
struct FolderListing {
    // With the first items. nil, and errno set, when the folder can't be listed.
    static std::optional<FolderListing> open(const std::string& path) { return open(AT_FDCWD, path.c_str()); }
    // By its name in an open folder.
    static std::optional<FolderListing> open(int parent, const char* name);
    // The same; why it can't be listed, of the folder at `path`, is logged, unless it is not there.
    static std::optional<FolderListing> openOrLog(int parent, const char* name, const std::string& path,
                                                  SystemLog& log);

    // Adds the next items, if there are more. False, and errno set, when reading fails.
    bool readOn();
    // Adds all that are left.
    bool readToTheEnd();

    FileDescriptor folder;
    std::vector<FolderItem> items;  // that were read
    bool isComplete = false;        // whether there are no more to read
    // As the kernel filled them. The names of items lie in these.
    std::vector<std::unique_ptr<const char[]>> nameBlocks;
};

class LinuxFolder final : public Folder {
  public:
    // What it asks for what the kernel doesn't tell.
    struct Services {
        const HiddenNames& hiddenNames;
        const MountReach& reach;
        const std::function<bool(std::string_view extension)>& isPackageExtension;
        SystemLog& systemLog;
    };

    // `path` is the one by which the kernel knows the folder. The services must outlive the folder, and those
    // that are opened from it.
    LinuxFolder(FolderListing listing, std::string path, const Services& services);

    std::optional<std::vector<FolderItem>> nextItems() override;
    bool mayHaveMoreItems() const override { return !listing_.isComplete || !listing_.items.empty(); }
    std::optional<std::uint32_t> flagsOf(const FolderItem& item) const override;
    bool isPlainFile(const FolderItem& item) const override;
    std::optional<FileAttributes> attributesOf(const FolderItem& item) const override;
    std::optional<FileAttributes> attributes() const override;
    std::optional<std::ptrdiff_t> extendedAttributeOf(const FolderItem& item, std::string_view attribute,
                                                      std::span<char> buffer) const override;
    std::unique_ptr<Folder> openFolder(const FolderItem& item) const override;

  private:
    // What is found out once for the folders on one device, each opened from another.
    struct Device {
        explicit Device(const std::optional<struct ::statx>& folder);
        bool holds(const std::optional<struct ::statx>& folder) const;

        const std::optional<dev_t> number;
        const bool mayHoldHiddenFlags;  // of FAT and NTFS
        // Whether its files may have attributes by the names of foreign volumes' drivers.
        std::atomic<bool> mayHaveForeignNames = true;
    };

    LinuxFolder(FolderListing listing, std::string path, const Services& services,
                const std::shared_ptr<Device>& deviceOfParent);

    // Not behind a link to a mount that doesn't answer.
    bool isInReach(const FolderItem& item) const;
    std::optional<struct ::statx> statusOf(const FolderItem& item, int flags) const;
    bool isInvisibleByName(std::string_view name) const;
    std::string pathOf(std::string_view name) const;

    FolderListing listing_;  // its items are those that nobody has taken
    const std::string path_;
    const Services& services_;
    const std::shared_ptr<const NameSet> hiddenNames_;  // nil for none
    const std::optional<struct ::statx> status_;        // nil when the kernel didn't tell
    const std::shared_ptr<Device> device_;
};

}  // namespace platform
