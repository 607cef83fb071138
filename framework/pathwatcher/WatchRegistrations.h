// Who wants to hear of changes at which paths. Thread-safe.
//
// Paths are compared as text, without slashes at their end.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "framework/pathwatcher/Subscriber.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class WatchRegistrations {
  public:
    // The path as it is registered.
    static std::string registeredForm(std::string path);

    void add(const std::string& path, const Subscriber& subscriber) VX_EXCLUDES(mutex_);

    // Whether the path, or a folder above it, is registered for the subscriber.
    bool covers(const std::string& path, const Subscriber& subscriber) const VX_EXCLUDES(mutex_);
    // The path itself or the nearest folder above it that somebody living registered.
    std::optional<std::string> registeredAncestor(const std::string& path) const VX_EXCLUDES(mutex_);

    // The living who registered exactly this path.
    std::vector<Subscriber> subscribersOf(const std::string& path) const VX_EXCLUDES(mutex_);
    // All paths that somebody living registered.
    std::vector<std::string> paths() const VX_EXCLUDES(mutex_);

  private:
    template <typename Predicate>
    std::optional<std::string> findAncestor(const std::string& path, Predicate matches) const
        VX_REQUIRES(mutex_);
    void forgetGone() VX_REQUIRES(mutex_);

    mutable platform::Mutex mutex_;
    std::map<std::string, std::vector<Subscriber>> subscribersByPath_ VX_GUARDED_BY(mutex_);
    std::size_t sizeToForgetAt_ VX_GUARDED_BY(mutex_) = 0;
};

}  // namespace vexo
