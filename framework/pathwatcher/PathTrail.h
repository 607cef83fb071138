// The way to a watched path: the folders and links that lead there, each of them watched for what becomes of
// the next. So a path is found when it appears, comes back, or begins to lead elsewhere.
//
// Each folder is watched first and looked into then, so nothing happens unseen. Not thread-safe.
#pragma once

#include <deque>
#include <memory>
#include <string>
#include <vector>

#include "framework/pathwatcher/WatchMeans.h"

namespace vexo {

class PathTrail {
  public:
    enum class End { folder, file, missing, silentMount, failure };

    class Owner {
      public:
        // The path, or a part of the way to it, appeared, vanished or was replaced.
        virtual void trailChanged() = 0;
        // The file at the end was written to, or the attributes of what is there changed.
        virtual void contentChanged() = 0;

      protected:
        ~Owner() = default;
    };

    // Follows the path as far as it leads. Both references must outlive the trail.
    PathTrail(WatchMeans& means, Owner& owner, const std::string& path);
    ~PathTrail();
    PathTrail(const PathTrail&) = delete;
    PathTrail& operator=(const PathTrail&) = delete;

    End end() const { return end_; }
    // The path without links: of the folder or file; else of the first thing on the way that is missing, or
    // that can't be watched, continued by the rest as it was given.
    const std::string& path() const { return path_; }
    // Of a file.
    const PathEntry& entry() const { return entry_; }
    // Why the path has to be polled, for people; for silent mounts and failures.
    const std::string& explanation() const { return explanation_; }
    // For silent mounts: whether looking at the files there is of use.
    bool isWorthPolling() const { return isWorthPolling_; }
    // Whether some folder on the way may not be read, so that what happens in it goes unnoticed.
    bool hasBlindSpot() const { return hasBlindSpot_; }
    // From now on the owner also hears of changes of what is at the end, as it does of a file's.
    void watchContentOfLast();
    // The last folder on the way that is watched; empty when there is none.
    std::string lastWatchedFolder() const;

  private:
    class Guard;
    using Names = std::deque<std::string>;

    void follow(Names names);
    bool step(std::string& folder, Names& names);
    bool guard(const std::string& folder, const std::string& name);
    void explainFailure(const std::string& path, int error);
    bool enter(std::string& folder, const std::string& child, Names& names);
    bool followLink(std::string& folder, Names& names);
    bool stopAtFile(const std::string& path);
    bool stopAt(End end, const std::string& path, const Names& rest);
    bool stopAtSilentMount(const std::string& path, const Names& rest);

    WatchMeans& means_;
    Owner& owner_;
    std::vector<std::unique_ptr<Guard>> guards_;
    int linksFollowed_ = 0;

    End end_ = End::missing;
    std::string path_;
    PathEntry entry_;
    std::string explanation_;
    bool isWorthPolling_ = true;
    bool hasBlindSpot_ = false;
};

}  // namespace vexo
