// Has the metadata of a tree's movies read while nobody waits for it, so that the index knows them when
// somebody asks. Callable from any thread.
//
// Works through one tree after another on a thread of low priority, which lives only while there is work. A
// tree that is published again after a change is not gone through again: its new movies are read when they
// are asked for.
#pragma once

#include <deque>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/VXMediaGroup.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class MetadataPrefetcher : public std::enable_shared_from_this<MetadataPrefetcher> {
  public:
    // Reads the file's metadata unless it is known. Called on the prefetcher's thread.
    using ReadFile = std::function<void(const std::string& path)>;

    explicit MetadataPrefetcher(ReadFile readFile);

    // nil is passed over.
    void prefetch(const VXMediaGroupRef& root) VX_EXCLUDES(mutex_);
    // Stops before the next file, and forgets the trees that wait.
    void cancel() VX_EXCLUDES(mutex_);
    // Cancels, and does nothing more from now on.
    void close() VX_EXCLUDES(mutex_);

  private:
    bool isSeen(const VXMediaGroupRef& root) VX_REQUIRES(mutex_);
    void work() VX_EXCLUDES(mutex_);
    // nil when nothing waits; the thread is then to end.
    VXMediaGroupRef takeNext() VX_EXCLUDES(mutex_);
    bool isWorkingOn(const VXMediaGroupRef& root) const VX_EXCLUDES(mutex_);
    void readMoviesOf(const VXMediaGroupRef& root) VX_EXCLUDES(mutex_);

    const ReadFile readFile_;

    mutable platform::Mutex mutex_;
    std::deque<VXMediaGroupRef> waiting_ VX_GUARDED_BY(mutex_);
    VXMediaGroupRef current_ VX_GUARDED_BY(mutex_);  // nil once it is cancelled
    bool working_ VX_GUARDED_BY(mutex_) = false;
    bool closed_ VX_GUARDED_BY(mutex_) = false;
    std::vector<std::weak_ptr<const VXMediaGroup>> seen_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
