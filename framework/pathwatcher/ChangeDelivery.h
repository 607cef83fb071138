// Tells subscribers of changes, on a thread of its own while there is something to tell: one that
// takes its time doesn't keep the watcher from taking in events. What comes meanwhile is told in one go.
// Thread-safe.
#pragma once

#include <map>
#include <memory>
#include <string>
#include <unordered_set>
#include <vector>

#include "framework/pathwatcher/ChangeBurst.h"
#include "framework/pathwatcher/Subscriber.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class ChangeDelivery : public std::enable_shared_from_this<ChangeDelivery> {
  public:
    // A path that comes again before the subscriber was told is told once.
    void add(const Subscriber& subscriber, ChangeBurst::Paths changedPaths) VX_EXCLUDES(mutex_);
    // Tells what was added. Requires: a platform::ServicesScope exists.
    void begin() VX_EXCLUDES(mutex_);
    // Nobody is told of anything any more; a call in progress goes on.
    void close() VX_EXCLUDES(mutex_);

  private:
    // A subscriber that keeps up has nothing but the paths of one burst waiting. For one that takes its time
    // each path is kept once, however often it changes.
    struct Report {
        ChangeBurst::Paths burst;
        std::unordered_set<std::string> sinceThen;
    };
    using Reports = std::map<Subscriber, Report>;

    void deliver() VX_EXCLUDES(mutex_);
    // Empty when nothing waits; the thread is then to end.
    Reports::node_type takeNext() VX_EXCLUDES(mutex_);
    // In byte order, each once.
    static std::vector<std::string> pathsOf(Report report);

    platform::Mutex mutex_;
    Reports waiting_ VX_GUARDED_BY(mutex_);
    bool isDelivering_ VX_GUARDED_BY(mutex_) = false;
    bool closed_ VX_GUARDED_BY(mutex_) = false;
};

}  // namespace vexo
