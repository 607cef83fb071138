// The process's one watcher of file-system paths and metadata queries.
//
// Observers are held weakly: a registration ends when its observer goes. Callable from any thread; observers
// are called on any thread.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "host/VXPathList.h"
#include "platform/Notification.h"

namespace vexo {

class VXPathObserver {
  public:
    virtual ~VXPathObserver() = default;

    // watchedPathChanged:fileChangedEventFlags:
    virtual void watchedPathChanged(const std::string& path, std::uint64_t fileChangedEventFlags) = 0;
    // watchedQueryChanged:queryScope:
    virtual void watchedQueryChanged(const platform::Notification& notification,
                                     const VXPathListRef& queryScope) = 0;
};
using VXPathObserverRef = std::shared_ptr<VXPathObserver>;

class VXPathWatcher {
  public:
    virtual ~VXPathWatcher() = default;

    static VXPathWatcher& sharedPathWatcher();

    // watchPath:observer:; from now on the observer hears of changes under `path`, which need not exist yet.
    virtual void watchPath(const std::string& path, const VXPathObserverRef& observer) = 0;
    // watchPathIsUnique:observer:; NO for a path that is watched for that observer already, itself or
    // through a folder above it.
    virtual bool watchPathIsUnique(const std::string& path, const VXPathObserverRef& observer) = 0;
    // watchQuery:observer:queryScope:queryRunMode:; results arrive through watchedQueryChanged. The scope is
    // shared: folders added to it later count. A repeated registration of the same query and observer is
    // one; the newest scope counts. Run mode 4 means: gather once in silence, then report each change of the
    // result as kMDQueryDidUpdateNotification.
    virtual void watchQuery(const std::string& query, const VXPathObserverRef& observer,
                            VXPathListRef queryScope, unsigned queryRunMode) = 0;
};

}  // namespace vexo
