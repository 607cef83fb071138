// A folder of the machine that is gone through: every look at an entry goes by the folder's descriptor, so
// the kernel walks no path, and what holds for the whole folder is found out once. Only attributes, which the
// kernel tells by path alone, are asked for by the path that the folder had.
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

struct statx;

namespace platform {

// An open folder with its names, in the order of the file system.
struct FolderListing {
    struct Closer {
        void operator()(DIR* opened) const { closedir(opened); }
    };

    // nil, and errno set, when the folder can't be listed.
    static std::optional<FolderListing> open(const std::string& path);

    std::unique_ptr<DIR, Closer> folder;
    std::vector<std::string> names;
};

class LinuxFolder final : public Folder {
  public:
    // What it asks for what the kernel doesn't tell.
    struct Services {
        const HiddenNames& hiddenNames;
        const std::function<bool(std::string_view extension)>& isPackageExtension;
        SystemLog& systemLog;
    };

    // `path` is the one by which the kernel knows the folder. The services must outlive the folder.
    LinuxFolder(FolderListing listing, std::string path, const Services& services);

    const std::vector<std::string>& names() const override { return listing_.names; }
    std::optional<FolderEntry> entryNamed(const std::string& name) const override;
    std::ptrdiff_t extendedAttribute(const std::string& name, const FolderEntry& entry,
                                     std::string_view attribute, std::span<char> buffer) const override;

  private:
    std::optional<struct ::statx> statusOf(const std::string& name, int flags) const;
    bool isInvisible(const std::string& name, const struct ::statx& status) const;
    bool isOnFoldersDevice(const struct ::statx& status) const;
    std::string pathOf(const std::string& name) const;

    const FolderListing listing_;
    const std::string path_;
    const Services& services_;
    const std::shared_ptr<const NameSet> hiddenNames_;  // nil for none
    const std::optional<std::uint64_t> device_;
    // Whether files on the folder's device may have attributes by the names of foreign volumes' drivers.
    mutable std::atomic<bool> mayHaveForeignNames_ = true;
};

}  // namespace platform
