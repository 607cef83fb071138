// What the plug-in keeps once for the whole process, shared by all of its objects: default paths and icons.
// Thread-safe.
#pragma once

#include <functional>
#include <optional>
#include <string>

#include "platform/Image.h"
#include "platform/ThreadSafety.h"

namespace reelix {

// One slot of a cache.
template <typename T>
class CacheSlot {
  public:
    T get() const VX_EXCLUDES(mutex_) {
        platform::Locked lock(mutex_);
        return value_;
    }
    void set(T value) VX_EXCLUDES(mutex_) {
        platform::Locked lock(mutex_);
        value_ = std::move(value);
    }
    void clear() { set(T{}); }

  private:
    mutable platform::Mutex mutex_;
    T value_ VX_GUARDED_BY(mutex_){};
};

using PathSlot = CacheSlot<std::optional<std::string>>;
using IconSlot = CacheSlot<platform::ImageRef>;

struct DefaultPathCache {
    PathSlot oldDefaultPath;
    PathSlot defaultPath;
    PathSlot defaultPath2;  // outlives the plug-in object that filled it
    PathSlot defaultEventsFolderPath;
    PathSlot defaultEventsFolderPath2;
};

struct IconCache {
    IconSlot smallApplicationIcon;
    IconSlot projectIcon;
    IconSlot trailerIcon;
    IconSlot spareProjectIcon;
    IconSlot spareTrailerIcon;
    IconSlot calendarIcon;
    IconSlot eventIcon;
    IconSlot reelixIcon;
};

DefaultPathCache& defaultPathCache();
IconCache& iconCache();

}  // namespace reelix
