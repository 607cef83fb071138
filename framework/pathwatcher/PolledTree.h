// What a polled place looked like, folder by folder.
//
// A folder is remembered as one number made of the names, sizes and times of its entries. Not thread-safe.
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <string>
#include <vector>

#include "framework/pathwatcher/FolderPolling.h"

namespace vexo {

class PolledTree {
  public:
    using Clock = std::function<std::chrono::steady_clock::time_point()>;

    explicit PolledTree(PolledPlace place, Clock clock = std::chrono::steady_clock::now)
        : place_(std::move(place)), clock_(std::move(clock)) {}

    const PolledPlace& place() const { return place_; }

    // Looks at all of it, for as long as a server takes. Answers what changed since the last look, each path
    // once: at the first look the place itself, and at one that had to wait for the server so long that
    // others took the place for missing. `stopped` ends the look early; its answer is then worth nothing.
    std::vector<std::string> look(const std::atomic<bool>& stopped);

  private:
    using Signatures = std::map<std::string, std::uint64_t>;  // by path relative to the place

    struct Appearance {
        bool operator==(const Appearance&) const = default;

        std::uint64_t signature = 0;  // of the place itself, 0 when it is missing
        Signatures folders;
    };

    // Whether that took too long.
    bool awaitServer() const;
    Appearance appearance(const std::atomic<bool>& stopped) const;
    Signatures folders(const std::atomic<bool>& stopped) const;
    std::vector<std::string> changesSince(const Appearance& before) const;
    std::string reported(const std::string& folder) const;
    bool isExcluded(const std::string& path) const;

    const PolledPlace place_;
    const Clock clock_;
    bool isKnown_ = false;
    Appearance known_;
};

}  // namespace vexo
