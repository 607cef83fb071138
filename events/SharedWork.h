// Work that several threads do together, piece by piece, for as long as one of them waits for its end.
//
// Whoever needs the work calls `finish`, who needs it no longer `abandon`. Helpers may come at any time or
// never: a late one finds nothing to do.
#pragma once

#include <atomic>
#include <condition_variable>
#include <exception>
#include <functional>

#include "platform/ThreadSafety.h"

namespace reelix {

class SharedWork {
  public:
    // `doPiece` takes a piece that nobody has taken, does it, and answers false when there was none. It is
    // called by several threads at once, and no more once `finish` has returned.
    explicit SharedWork(std::function<bool()> doPiece) : doPiece_(std::move(doPiece)) {}

    // Takes part until no piece is left. Never raises.
    void help() VX_EXCLUDES(mutex_);
    // The same, then waits for what helpers have taken. An exception that left a piece ends the work and
    // comes out here.
    void finish() VX_EXCLUDES(mutex_);
    // Lets no piece be begun any more. Does not wait for those that were.
    void abandon() VX_EXCLUDES(mutex_);

  private:
    void doPieces() VX_EXCLUDES(mutex_);
    void fail(std::exception_ptr failure) VX_EXCLUDES(mutex_);

    const std::function<bool()> doPiece_;
    platform::Mutex mutex_;
    std::condition_variable_any helperLeft_;
    int helpers_ VX_GUARDED_BY(mutex_) = 0;
    // Changed under the mutex, and read without it before each piece.
    std::atomic<bool> isEnded_ = false;
    std::exception_ptr failure_ VX_GUARDED_BY(mutex_);
};

}  // namespace reelix
