// Which network and FUSE mounts a path leads through, found out without a look at anything that lies on one.
// Links are followed as far as the first such mount; what lies below it is told by the path alone.
//
// Remembers the folders it has followed, so one that changes counts once this is made anew. Not thread-safe.
#pragma once

#include <string>
#include <unordered_map>
#include <vector>

#include "platform/linux/MountTable.h"

namespace platform {

class ServedWays {
  public:
    explicit ServedWays(MountTable::MountPoints served) : served_(std::move(served)) {}

    // Their mount points, in the order in which they are entered.
    std::vector<std::string> mountPointsOnTheWayTo(const std::string& path);

  private:
    struct Way {
        std::string path;  // without links, up to the first mount
        std::vector<std::string> mountPoints;
    };

    // Not of the root.
    Way wayTo(const std::string& path);
    Way begin() const;
    void goOn(Way& way, const std::string& name) const;
    void enter(Way& way, std::string child) const;
    void keep(const std::string& folder, const Way& way);

    const MountTable::MountPoints served_;
    std::unordered_map<std::string, Way> ways_;  // of folders
};

}  // namespace platform
