// Looks again and again at folders that the kernel sends no events for, and tells which of them changed.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace vexo {

struct PolledPlace {
    enum class Depth {
        tree,    // a folder with everything below it, or a file
        itself,  // whether it is there, and whether it is still the same
    };

    std::string path;        // links in it are followed, except below it
    std::string mountPoint;  // places of one mount wait for one another, and for no other
    Depth depth = Depth::tree;
    std::vector<std::string> excluded;  // paths below it that are left out
    std::string reportedPath;           // what the place is called in reports
    // The package that the place is part of, as it is called in reports.
    std::optional<std::string> package = {};
    bool reportsEveryLook = false;  // not only those that found changes
};

// One look at a place.
struct PollReport {
    std::uint64_t place = 0;
    // Folders in which something changed; the place itself when it appeared, vanished or is a file that
    // changed.
    std::vector<std::string> changedPaths;
};

class FolderPolling {
  public:
    virtual ~FolderPolling() = default;

    // The first look is taken soon. It reports the place, because what happened before it is not known.
    virtual std::uint64_t add(PolledPlace place) = 0;
    virtual void remove(std::uint64_t place) = 0;
    // The reports since the last call, which may be about places that were removed meanwhile.
    virtual std::vector<PollReport> takeReports() = 0;
    // From the end of one round of looks to the beginning of the next.
    virtual std::chrono::milliseconds interval() const = 0;
    // Nothing is looked at or reported any more.
    virtual void close() = 0;
};

}  // namespace vexo
