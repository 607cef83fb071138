// Which network or FUSE mount a path leads to, found out without a look at anything that lies on one: links
// on the way are followed, and the first such mount ends it.
//
// Remembers the folders it has followed, so it is thrown away before they may lead elsewhere. Not
// thread-safe.
#pragma once

#include <optional>
#include <string>
#include <unordered_map>

#include "platform/linux/MountTable.h"

namespace platform {

class ServedWays {
  public:
    explicit ServedWays(MountTable::MountPoints served) : served_(std::move(served)) {}

    // nil where nothing that is looked at on the way lies on one.
    std::optional<std::string> mountPointOnTheWayTo(const std::string& path);

  private:
    struct Way {
        std::string path;  // without links
        bool endsAtMount = false;
    };

    Way wayTo(const std::string& path);
    Way begin() const { return {"/", served_->contains("/")}; }
    void goOn(Way& way, std::string name) const;
    void keep(const std::string& folder, const Way& way);

    const MountTable::MountPoints served_;
    std::unordered_map<std::string, Way> ways_;  // of folders
};

}  // namespace platform
