// A growing list of folder paths that several parties hold: whoever looks at it later sees what was added.
// Thread-safe.
#pragma once

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

#include "platform/ThreadSafety.h"

namespace vexo {

class VXPathList {
  public:
    VXPathList() = default;
    explicit VXPathList(std::vector<std::string> paths) : paths_(std::move(paths)) {}

    void append(std::string path) VX_EXCLUDES(mutex_) {
        platform::Locked lock(mutex_);
        paths_.push_back(std::move(path));
    }
    bool contains(const std::string& path) const VX_EXCLUDES(mutex_) {
        platform::Locked lock(mutex_);
        return std::find(paths_.begin(), paths_.end(), path) != paths_.end();
    }
    // The list as it stands. Duplicates are kept.
    std::vector<std::string> snapshot() const VX_EXCLUDES(mutex_) {
        platform::Locked lock(mutex_);
        return paths_;
    }

  private:
    mutable platform::Mutex mutex_;
    std::vector<std::string> paths_ VX_GUARDED_BY(mutex_);
};
using VXPathListRef = std::shared_ptr<VXPathList>;

}  // namespace vexo
