// The few looks at the disk that watching takes. Links are never followed. Thread-safe.
#pragma once

#include <sys/types.h>

#include <string>
#include <vector>

namespace vexo {

struct PathEntry {
    enum class Kind { missing, folder, link, other };

    Kind kind = Kind::missing;
    std::string target;  // of a link
    dev_t device = 0;    // these two tell entries of one path from one another
    ino_t inode = 0;
    int error = 0;  // errno where it can't be looked at; it's missing then

    bool operator==(const PathEntry&) const = default;
};

struct FolderListing {
    int error = 0;  // errno where the folder can't be listed
    bool isEmpty = true;
    // Entries that are folders, or of which the file system doesn't tell.
    std::vector<std::string> folders;
};

class FolderAccess {
  public:
    virtual ~FolderAccess() = default;

    virtual PathEntry look(const std::string& path) const = 0;
    virtual FolderListing list(const std::string& folder) const = 0;
};

// The file system of the machine.
class DiskAccess final : public FolderAccess {
  public:
    PathEntry look(const std::string& path) const override;
    FolderListing list(const std::string& folder) const override;
};

}  // namespace vexo
