// The names that a folder's ".hidden" file hides, one name a line.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>

#include "platform/ThreadSafety.h"

namespace platform {

using NameSet = std::set<std::string, std::less<>>;

// The names in the content of a ".hidden" file.
NameSet namesInHiddenFile(std::string_view content);

// Answers from the files, and keeps the names of the folders asked about last while their files stay as they
// are. Callable from any thread.
class HiddenNames {
  public:
    bool contains(const std::string& folder, std::string_view name) const VX_EXCLUDES(mutex_);
    // All of them; nil when there are none.
    std::shared_ptr<const NameSet> ofFolder(const std::string& folder) const VX_EXCLUDES(mutex_);

  private:
    // What changes whenever the file does.
    struct Version {
        std::uint64_t device, inode, size;
        std::int64_t seconds;
        std::uint32_t nanoseconds;
        bool operator==(const Version&) const = default;
    };
    struct Entry {
        Version version;
        std::shared_ptr<const NameSet> names;
    };

    std::shared_ptr<const NameSet> keptNames(const std::string& folder, const Version& version) const
        VX_EXCLUDES(mutex_);
    void keep(const std::string& folder, Entry entry) const VX_EXCLUDES(mutex_);

    mutable Mutex mutex_;
    mutable std::map<std::string, Entry> entries_ VX_GUARDED_BY(mutex_);
};

}  // namespace platform
