// Locks that Clang's thread-safety analysis understands, and the words in which fields and functions
// state what guards them. GCC ignores the words; `./test asan` has Clang check them.
#pragma once

#include <mutex>

#if defined(__clang__)
#define VX_ATTRIBUTE(x) __attribute__((x))
#else
#define VX_ATTRIBUTE(x)
#endif

#define VX_GUARDED_BY(lock) VX_ATTRIBUTE(guarded_by(lock))
#define VX_REQUIRES(...) VX_ATTRIBUTE(requires_capability(__VA_ARGS__))
#define VX_EXCLUDES(...) VX_ATTRIBUTE(locks_excluded(__VA_ARGS__))

namespace platform {

// A plain lock: taking it twice on one thread is an error.
class VX_ATTRIBUTE(capability("mutex")) Mutex {
  public:
    void lock() VX_ATTRIBUTE(acquire_capability()) { mutex_.lock(); }
    void unlock() VX_ATTRIBUTE(release_capability()) { mutex_.unlock(); }

  private:
    std::mutex mutex_;
};

// A lock that the thread holding it may take again.
class VX_ATTRIBUTE(capability("mutex")) RecursiveMutex {
  public:
    void lock() VX_ATTRIBUTE(acquire_capability()) { mutex_.lock(); }
    void unlock() VX_ATTRIBUTE(release_capability()) { mutex_.unlock(); }

  private:
    std::recursive_mutex mutex_;
};

// Holds a lock for the length of a scope, however the scope is left.
template <typename Lock>
class VX_ATTRIBUTE(scoped_lockable) Locked {
  public:
    explicit Locked(Lock& lock) VX_ATTRIBUTE(acquire_capability(lock)) : lock_(lock) { lock_.lock(); }
    ~Locked() VX_ATTRIBUTE(release_capability()) { lock_.unlock(); }
    Locked(const Locked&) = delete;
    Locked& operator=(const Locked&) = delete;

  private:
    Lock& lock_;
};

}  // namespace platform
