// All paths that are watched: takes in what the kernel, the mount table and the polling tell, and finds out
// which paths changed.
//
// Whatever cannot be told exactly, because events were lost, ends in one way: everything is given up and
// begun anew, and each path is reported. Not thread-safe.
#pragma once

#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "framework/pathwatcher/MountChanges.h"
#include "framework/pathwatcher/WatchMeans.h"
#include "framework/pathwatcher/WatchedPath.h"

namespace vexo {

// The world that is watched.
struct WatchSeams {
    std::unique_ptr<FileEvents> events;
    std::unique_ptr<FolderAccess> folders;
    std::unique_ptr<MountChanges> mounts;
    std::unique_ptr<FolderPolling> polling;
    std::function<std::optional<std::string>(const std::string& path)> resolvedPath;
};

class WatchedPaths {
  public:
    explicit WatchedPaths(WatchSeams seams);
    ~WatchedPaths();
    WatchedPaths(const WatchedPaths&) = delete;
    WatchedPaths& operator=(const WatchedPaths&) = delete;

    // Each does nothing when it is so already. Requires: the path is absolute.
    void add(const std::string& path);
    void remove(const std::string& path);
    bool contains(const std::string& path) const { return paths_.contains(path); }

    // Takes in what waits. Of events a great number at most, so that a storm of them can't keep reports back.
    void takeEvents();
    void takePollReports();
    void takeMountChanges();
    // The mount table is known to have changed.
    void mountsChanged();

    ChangeBurst& burst() { return burst_; }
    const ChangeBurst& burst() const { return burst_; }
    const WatchSeams& seams() const { return seams_; }
    // Those that came since the last call; no text comes twice.
    std::vector<std::string> takeWarnings();

    // Requires: `watchedPath` is watched, and `path` is it or below it.
    WatchState stateOf(const std::string& watchedPath, const std::string& path) const;
    // The paths, as reported, of all folders that are watched through events.
    std::vector<std::string> watchedFolders() const;
    // The number of folders that the kernel watches for us, those on the way included.
    std::size_t watchCount() const { return watches_.count(); }

    // Stops the polling.
    void close() { seams_.polling->close(); }

  private:
    void take(const PollReport& report);
    void checkDoubts();
    void beginAnew();
    void warn(const std::string& warning);
    void warnOfFailure(const std::string& folder, int error);

    WatchSeams seams_;
    Watches watches_;
    ChangeBurst burst_;
    WatchMeans means_;
    std::set<std::string> knownWarnings_;
    std::vector<std::string> newWarnings_;
    std::set<int> knownFailures_;  // errno
    std::map<std::string, std::unique_ptr<WatchedPath>> paths_;
};

}  // namespace vexo
