// The file system of the machine.
//
// What exists but can't be read is a line in the system log; what does not exist is not. What lies on a mount
// that doesn't answer counts as missing (MountReach), and the line is about the mount. Callable from any
// thread.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "platform/FileManager.h"
#include "platform/SystemLog.h"
#include "platform/linux/HiddenNames.h"
#include "platform/linux/LinuxFolder.h"
#include "platform/linux/MountReach.h"
#include "platform/linux/MountTable.h"

struct statx;

namespace platform {

class LinuxFileManager final : public FileManager {
  public:
    using PackageTest = std::function<bool(std::string_view extension)>;

    // `mountTable` and `systemLog` must outlive the manager. `isPackageExtension` is asked on any thread.
    // `volumesFolder` is for tests, which can't make entries in the real one, and `patience` with servers is
    // for those that haven't any.
    LinuxFileManager(std::optional<std::string> homeDirectory, const MountTable& mountTable,
                     SystemLog& systemLog, PackageTest isPackageExtension,
                     std::string volumesFolder = "/Volumes",
                     std::chrono::milliseconds patience = MountReach::usualPatience);

    // HOME where it is an absolute path, else what the password database says; nil when neither knows one.
    static std::optional<std::string> userHomeDirectory();

    std::optional<std::string> homeDirectory() const override { return homeDirectory_; }
    std::optional<FileKind> kindOfItemAtPath(const std::string& path) const override;
    std::optional<std::vector<std::string>> contentsOfDirectoryAtPath(const std::string& path) const override;
    std::unique_ptr<Folder> openFolderAtPath(const std::string& path) const override;
    std::optional<FileAttributes> attributesOfItemAtPath(const std::string& path) const override;
    std::optional<std::uint32_t> itemFlagsAtPath(const std::string& path) const override;
    std::optional<std::string> displayNameAtPath(const std::string& path) const override;
    // The attribute "user.<name>", else "osx.<name>", by which drivers for foreign volumes show it, else,
    // where the file system keeps no attributes, the one in the "._" file beside the file.
    std::ptrdiff_t extendedAttribute(const std::string& path, std::string_view name,
                                     std::span<char> buffer) const override;
    std::optional<std::string> fileSystemTypeNameAtPath(const std::string& path) const override;
    std::unique_ptr<ByteSource> openFileAtPath(const std::string& path) const override;
    std::optional<std::string> resolvedPath(const std::string& path) const override;
    bool isInReach(const std::string& path) const override;

  private:
    enum class Links { follow, lookAt };

    // The resolved path without slashes at its end, behind which the kernel would follow a link; nil when it
    // can't name anything, or nothing that can be looked at.
    std::optional<std::string> kernelPath(const std::string& path) const;
    std::optional<std::string> mountPointOfVolume(std::string_view displayName) const;
    std::optional<struct ::statx> statusOfItem(const std::string& kernelPath, Links links) const;
    bool isInvisible(const std::string& kernelPath, const struct ::statx& status) const;
    std::optional<std::string> volumeNameAt(const std::string& mountPoint) const;
    // nil for a folder that can't be listed; the reason is logged.
    std::optional<FolderListing> listingOfFolder(const std::string& path) const;
    void logFailure(std::string_view operation, const std::string& path, int error) const;

    const std::optional<std::string> homeDirectory_;
    const MountTable& mountTable_;
    const MountReach reach_;
    SystemLog& systemLog_;
    const PackageTest isPackageExtension_;
    const std::string volumesPrefix_;  // "/Volumes/"
    const HiddenNames hiddenNames_;
    const LinuxFolder::Services folderServices_;
};

}  // namespace platform
