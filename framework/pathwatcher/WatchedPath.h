// One path that is watched, whatever is there: a folder with everything below it, a file, nothing yet.
//
// Reports name what is below it by the path as it was registered, also where links or names of volumes are on
// the way. Not thread-safe.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "framework/pathwatcher/FolderTree.h"
#include "framework/pathwatcher/PathTrail.h"
#include "framework/pathwatcher/PolledSubtree.h"
#include "framework/pathwatcher/WatchState.h"

namespace vexo {

class WatchedPath final : public PathTrail::Owner, public FolderTree::Owner {
  public:
    // `means` must outlive the object. Requires: the path is absolute. Watches nothing yet.
    WatchedPath(WatchMeans& means, std::string path);

    const std::string& path() const { return path_; }

    void begin();
    // Gives up everything.
    void end();

    // Whether something happened after which the path may lead elsewhere.
    bool isInDoubt() const { return isInDoubt_; }
    // Follows the path anew, and reports it where it leads elsewhere.
    void check();
    void report();

    void mountsChangedAt(const std::vector<std::string>& mountPoints);
    // Takes a report when it is about this path; answers whether it was.
    bool take(const PollReport& report);

    // The state of the path or of something below it.
    WatchState stateOf(const std::string& path) const;
    std::vector<std::string> watchedFolders() const;

  private:
    using Trails = std::vector<std::unique_ptr<PathTrail>>;

    void trailChanged() override;
    void contentChanged() override;
    void treeWasLost(bool unmounted) override;

    Trails newTrails();
    PathTrail& trail() const { return *trails_.back(); }
    bool leadsWhereItDid(const Trails& next);
    void follow(Trails trails);
    void watchFolder();
    void pollAsNeeded();
    bool exists() const;
    WatchState stateWithoutTree(const std::string& path) const;

    WatchMeans& means_;
    const std::string path_;
    Trails trails_;  // the last one counts
    std::unique_ptr<FolderTree> tree_;
    std::unique_ptr<PolledSubtree> polled_;
    std::string trouble_;  // why a folder at the path can't be watched
    bool isInDoubt_ = false;
    bool wasTouched_ = false;  // the path led elsewhere, if only for a moment
};

}  // namespace vexo
