// The polled part of a watched path: a folder or file that sends no events, and the mounts below it, each of
// which is polled for itself so that one whose server is gone holds up no other.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "framework/pathwatcher/WatchMeans.h"

namespace vexo {

class PolledSubtree {
  public:
    enum class Reason {
        lasting,  // it sends no events
        passing,  // it couldn't be watched, and is to be tried again after every look
    };
    struct Place {
        std::string path;
        std::string reportedPath;
        std::optional<std::string> package;
    };

    // `means` must outlive the object.
    PolledSubtree(WatchMeans& means, const Place& place, PolledPlace::Depth depth, Reason reason);
    ~PolledSubtree();
    PolledSubtree(const PolledSubtree&) = delete;
    PolledSubtree& operator=(const PolledSubtree&) = delete;

    // Also those below the place.
    const std::vector<std::uint64_t>& places() const { return places_; }

  private:
    WatchMeans& means_;
    std::vector<std::uint64_t> places_;
};

// Why changes on a mount are not reported, and why a folder could not be watched; for people:
// "network file system (nfs4)", "the limit of 8192 watched folders is reached".
std::string explanationOf(const SilentMount& mount);
std::string explanationOf(const std::string& folder, int error);

// "looked at every 10 s"
std::string rhythmOf(const FolderPolling& polling);

// Whether there is simply nothing to watch: no such folder, or none that we may read.
bool isNatural(int error);

}  // namespace vexo
