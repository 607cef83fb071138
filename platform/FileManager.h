// What the plug-in and the host ask of the file system. Callable from any thread.
//
// Every operation takes paths as bytes and understands "/Volumes/<display name>/…" as a name for the mount
// point of the volume with that display name, unless a real entry of that name exists. Nothing here writes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "platform/ByteSource.h"
#include "platform/Date.h"

namespace platform {

// The basic item flags, with the values of the system's item-flag word.
enum ItemFlags : std::uint32_t {
    itemIsPackage = 0x02,    // a folder that is shown as one document
    itemIsContainer = 0x08,  // a folder, package or volume; a symbolic link never is one
    itemIsInvisible = 0x40,  // hidden by any of the platform's means
};

enum class FileKind { file, directory };  // `file` is anything that is no directory

struct FileAttributes {
    std::uint64_t size = 0;
    DateRef modificationDate;  // nil when unknown
    DateRef creationDate;      // nil when the file system tells neither birth nor modification time
};

// An item of a folder, as the folder's listing tells it.
struct FolderItem {
    // `other` stands for everything else, and for what the listing says nothing about.
    enum class Kind : std::uint8_t { other, plainFile, folder };

    std::string_view name;  // lives as long as its folder is open; a NUL follows it
    Kind kind = Kind::other;
};

// A folder that is gone through, some of its items at a time. Each question answers as the operation by path
// does and costs as few calls to the system as can be, often none: what the listing told is not asked again,
// so an item that has vanished since may still be told of by everything but its attributes. It holds a file
// open, so each is closed before the next one further down is entered where a tree may be deep.
//
// The questions may be asked on any thread, also while another one reads on.
class Folder {
  public:
    virtual ~Folder() = default;

    // The items that come next, in the order of contentsOfDirectoryAtPath; empty when all have been told. nil
    // when they can't be read; the reason goes to the system log. What is renamed between two calls may be
    // told twice, by either name, or not at all. The questions below are about one of these.
    //
    // For one thread at a time.
    virtual std::optional<std::vector<FolderItem>> nextItems() = 0;
    // False once all have been told. Where it is true, there may still turn out to be none.
    virtual bool mayHaveMoreItems() const = 0;
    // All that come, nil when some can't be read.
    std::optional<std::vector<FolderItem>> allItems() {
        std::vector<FolderItem> all;
        while (mayHaveMoreItems()) {
            const auto items = nextItems();
            if (!items)
                return std::nullopt;
            all.insert(all.end(), items->begin(), items->end());
        }
        return all;
    }

    // As itemFlagsAtPath answers.
    virtual std::optional<std::uint32_t> flagsOf(const FolderItem& item) const = 0;
    // Whether the item, or what a link leads to, is a file with content of its own.
    virtual bool isPlainFile(const FolderItem& item) const = 0;
    // As attributesOfItemAtPath answers.
    virtual std::optional<FileAttributes> attributesOf(const FolderItem& item) const = 0;
    // The folder's own, as they were when it was opened.
    virtual std::optional<FileAttributes> attributes() const = 0;
    // As FileManager::extendedAttribute answers; nil when it is not even known whether the item is there.
    virtual std::optional<std::ptrdiff_t> extendedAttributeOf(const FolderItem& item,
                                                              std::string_view attribute,
                                                              std::span<char> buffer) const = 0;
    // The folder that the item is, as openFolderAtPath opens it. It may outlive this one.
    virtual std::unique_ptr<Folder> openFolder(const FolderItem& item) const = 0;
};

class FileManager {
  public:
    virtual ~FileManager() = default;

    // nil when there is no home.
    virtual std::optional<std::string> homeDirectory() const = 0;

    // fileExistsAtPath:isDirectory:; links are followed. nil when nothing exists there.
    virtual std::optional<FileKind> kindOfItemAtPath(const std::string& path) const = 0;
    bool fileExistsAtPath(const std::string& path) const { return kindOfItemAtPath(path).has_value(); }

    // contentsOfDirectoryAtPath:error:; the names as the file system lists them, without "." and "..".
    // nil when the folder can't be listed; the reason goes to the system log.
    virtual std::optional<std::vector<std::string>> contentsOfDirectoryAtPath(
        const std::string& path) const = 0;

    // The same folder, to go through. nil when not even its first items can be listed, and logged like that.
    virtual std::unique_ptr<Folder> openFolderAtPath(const std::string& path) const = 0;

    // attributesOfItemAtPath:error:; links are followed. nil when they can't be read.
    virtual std::optional<FileAttributes> attributesOfItemAtPath(const std::string& path) const = 0;

    // LSCopyItemInfoForURL with the basic flags, a combination of ItemFlags; nil when there is no such item.
    virtual std::optional<std::uint32_t> itemFlagsAtPath(const std::string& path) const = 0;

    // displayNameAtPath:; a volume's label for a mount point, else the last component. nil for no item.
    virtual std::optional<std::string> displayNameAtPath(const std::string& path) const = 0;

    // getxattr. Answers the size of the value, or a negative number when the attribute is missing or does
    // not fit. An empty buffer asks for the size alone. Links are followed.
    virtual std::ptrdiff_t extendedAttribute(const std::string& path, std::string_view name,
                                             std::span<char> buffer) const = 0;

    // statfs; the file system's type name ("ext4", "msdos", "nfs", …). nil when the call fails.
    virtual std::optional<std::string> fileSystemTypeNameAtPath(const std::string& path) const = 0;

    // Opens a plain file for reading. nil when it can't be read or is no plain file: FIFOs, devices,
    // sockets and folders are never opened, so the call doesn't block.
    virtual std::unique_ptr<ByteSource> openFileAtPath(const std::string& path) const = 0;
    // contentsAtPath:; all of a plain file of at most `limit` bytes. nil for a longer one, and for what
    // openFileAtPath refuses.
    std::optional<std::vector<std::byte>> contentsAtPath(const std::string& path, std::uint64_t limit) const {
        const std::unique_ptr<ByteSource> file = openFileAtPath(path);
        if (!file || file->size() > limit)
            return std::nullopt;
        std::vector<std::byte> bytes(file->size());
        if (!file->read(0, bytes))
            return std::nullopt;
        return bytes;
    }

    // The path with "/Volumes/<display name>" replaced by the volume's mount point; any other path as it is.
    // nil where no volume has the name.
    virtual std::optional<std::string> resolvedPath(const std::string& path) const = 0;

    // Whether what lies at the path, or would, can be looked at without waiting for a server that is gone.
    // The operations above ask that themselves; whoever asks the system by itself asks this first.
    virtual bool isInReach(const std::string& /*path*/) const { return true; }
};

}  // namespace platform
