// A folder of the machine that is gone through: every look at an item goes by the folder's descriptor, so the
// kernel walks no path, and what holds for the whole folder is found out once. Kernels before 6.13 tell
// attributes by path alone: there a folder that is moved has none any more.
#pragma once

#include <dirent.h>

#include <atomic>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/FileManager.h"
#include "platform/SystemLog.h"
#include "platform/linux/HiddenNames.h"
#include "platform/linux/MountReach.h"

struct statx;

namespace platform {

// An open folder with what lies in it, in the order of the file system.
struct FolderListing {
    struct Closer {
        void operator()(DIR* opened) const { closedir(opened); }
    };

    // nil, and errno set, when the folder can't be listed.
    static std::optional<FolderListing> open(const std::string& path);

    std::unique_ptr<DIR, Closer> folder;
    std::vector<FolderItem> items;
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

    // `path` is the one by which the kernel knows the folder. The services must outlive the folder.
    LinuxFolder(FolderListing listing, std::string path, const Services& services);

    const std::vector<FolderItem>& items() const override { return listing_.items; }
    std::optional<std::uint32_t> flagsOf(const FolderItem& item) const override;
    bool isPlainFile(const FolderItem& item) const override;
    std::optional<FileAttributes> attributesOf(const FolderItem& item) const override;
    std::optional<std::ptrdiff_t> extendedAttributeOf(const FolderItem& item, std::string_view attribute,
                                                      std::span<char> buffer) const override;

  private:
    // Not behind a link to a mount that doesn't answer.
    bool isInReach(const FolderItem& item) const;
    std::optional<struct ::statx> statusOf(const FolderItem& item, int flags) const;
    bool isInvisibleByName(const std::string& name) const;
    std::string pathOf(const std::string& name) const;

    const FolderListing listing_;
    const std::string path_;
    const Services& services_;
    const std::shared_ptr<const NameSet> hiddenNames_;  // nil for none
    const bool mayHoldHiddenFlags_;                     // of FAT and NTFS
    // Whether files on the folder's device may have attributes by the names of foreign volumes' drivers.
    mutable std::atomic<bool> mayHaveForeignNames_ = true;
};

}  // namespace platform
