// The helper process that a media reader keeps: started when it is needed, ended when it has been idle for
// long or misbehaves, and for good when the reader is closed.
//
// One thread at a time takes the process, works with it and either puts it back or discards it. Closing, and
// the end after an idle time, may come from any other thread meanwhile. Owned by a ProcessMediaReader; the
// blocks that wait for the idle time know it by a weak reference.
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "framework/metadata/MediaReader.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class ReaderProcess;

class ReaderHelper : public std::enable_shared_from_this<ReaderHelper> {
  public:
    explicit ReaderHelper(ProcessMediaReader::Settings settings);
    ~ReaderHelper();

    // The process, started now if there is none; nil when it cannot be started, and after `close`.
    std::shared_ptr<ReaderProcess> take() VX_EXCLUDES(mutex_);
    // Keeps what was taken for the next one, for a while.
    void putBack() VX_EXCLUDES(mutex_);
    // Ends what was taken, as soon as the taker lets go of it.
    void discard() VX_EXCLUDES(mutex_);

    // Ends the process at once; no other is started, and nobody is warned any more.
    void close() VX_EXCLUDES(mutex_, warning_);
    bool isClosed() const VX_EXCLUDES(mutex_);

    // What the process that was started last says that it has given up.
    std::vector<std::string> confinement() const VX_EXCLUDES(mutex_);
    int startedProcesses() const VX_EXCLUDES(mutex_);

  private:
    using Clock = std::chrono::steady_clock;

    std::shared_ptr<ReaderProcess> takeKept() VX_EXCLUDES(mutex_);
    std::shared_ptr<ReaderProcess> start() VX_EXCLUDES(mutex_);
    void warnOfFailedStart(int error) const VX_EXCLUDES(mutex_, warning_);
    bool mayStart() const VX_EXCLUDES(mutex_);
    // False, and nothing is kept, once this is closed.
    bool adopt(const std::shared_ptr<ReaderProcess>& process) VX_EXCLUDES(mutex_);
    bool isGreetedBy(ReaderProcess& process) VX_EXCLUDES(mutex_);
    void endAfterIdleTime() VX_EXCLUDES(mutex_);
    // Whether the process has been idle since the last such check; it is then no longer kept.
    std::shared_ptr<ReaderProcess> takeIdle() VX_EXCLUDES(mutex_);
    // Whether a block is to be scheduled; the caller must do so.
    bool beginWaiting() VX_EXCLUDES(mutex_);

    const ProcessMediaReader::Settings settings_;

    mutable platform::Mutex warning_;  // held while somebody is warned
    mutable platform::Mutex mutex_;    // never held while waiting for the process
    std::shared_ptr<ReaderProcess> process_ VX_GUARDED_BY(mutex_);
    std::vector<std::string> confinement_ VX_GUARDED_BY(mutex_);
    Clock::time_point earliestStart_ VX_GUARDED_BY(mutex_);
    int startedProcesses_ VX_GUARDED_BY(mutex_) = 0;
    bool isTaken_ VX_GUARDED_BY(mutex_) = false;
    bool isClosed_ VX_GUARDED_BY(mutex_) = false;
    bool isWaiting_ VX_GUARDED_BY(mutex_) = false;             // for the idle time to pass
    bool wasTakenWhileWaiting_ VX_GUARDED_BY(mutex_) = false;  // so it has not been idle all the time
};

}  // namespace vexo
