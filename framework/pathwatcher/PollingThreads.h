// Polls each mount on a thread of its own. Thread-safe.
//
// A look at a mount whose server is gone does not return. Its thread then hangs alone; nobody waits for it,
// not even the end of the process, and everything that it uses it shares in owning. That is why these are no
// threads of the dispatcher, which joins its own.
#pragma once

#include <map>
#include <memory>

#include "framework/pathwatcher/FolderPolling.h"
#include "framework/pathwatcher/WakeSignal.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class PollingThreads final : public FolderPolling {
  public:
    // `news` is raised when there are reports to take.
    PollingThreads(std::shared_ptr<const WakeSignal> news, std::chrono::milliseconds interval);
    ~PollingThreads() override;
    PollingThreads(const PollingThreads&) = delete;
    PollingThreads& operator=(const PollingThreads&) = delete;

    std::uint64_t add(PolledPlace place) override VX_EXCLUDES(mutex_);
    void remove(std::uint64_t place) override VX_EXCLUDES(mutex_);
    std::vector<PollReport> takeReports() override;
    std::chrono::milliseconds interval() const override { return interval_; }
    void close() override VX_EXCLUDES(mutex_);

  private:
    class Reports;
    class MountThread;

    MountThread& threadOf(const std::string& mountPoint) VX_REQUIRES(mutex_);

    const std::chrono::milliseconds interval_;
    const std::shared_ptr<Reports> reports_;

    platform::Mutex mutex_;
    bool closed_ VX_GUARDED_BY(mutex_) = false;
    std::uint64_t lastPlace_ VX_GUARDED_BY(mutex_) = 0;
    std::map<std::uint64_t, std::string> mountPoints_ VX_GUARDED_BY(mutex_);  // by place
    std::map<std::string, std::shared_ptr<MountThread>> threads_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
