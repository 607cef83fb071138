#include "framework/pathwatcher/PollingThreads.h"

#include <atomic>
#include <condition_variable>
#include <system_error>
#include <thread>
#include <utility>

#include "framework/pathwatcher/PolledTree.h"

namespace vexo {

using platform::Locked;

class PollingThreads::Reports {
  public:
    explicit Reports(std::shared_ptr<const WakeSignal> news) : news_(std::move(news)) {}

    void add(PollReport report) VX_EXCLUDES(mutex_) {
        Locked lock(mutex_);
        reports_.push_back(std::move(report));
        news_->raise();
    }
    std::vector<PollReport> take() VX_EXCLUDES(mutex_) {
        Locked lock(mutex_);
        return std::exchange(reports_, {});
    }

  private:
    const std::shared_ptr<const WakeSignal> news_;
    platform::Mutex mutex_;
    std::vector<PollReport> reports_ VX_GUARDED_BY(mutex_);
};

class PollingThreads::MountThread : public std::enable_shared_from_this<MountThread> {
  public:
    MountThread(std::chrono::milliseconds interval, std::shared_ptr<Reports> reports)
        : interval_(interval), reports_(std::move(reports)) {}

    // Where the machine has no thread left, the next place that is added tries again.
    void startUnlessRunning() {
        if (isRunning_)
            return;
        try {
            std::thread([self = shared_from_this()] { self->run(); }).detach();
            isRunning_ = true;
        } catch (const std::system_error&) {
        }
    }
    void stop() VX_EXCLUDES(mutex_) {
        stopped_ = true;
        Locked lock(mutex_);
        changed_.notify_one();
    }

    void add(std::uint64_t number, PolledPlace place) VX_EXCLUDES(mutex_) {
        Locked lock(mutex_);
        trees_[number] = std::make_shared<PolledTree>(std::move(place));
        unseen_[number] = trees_[number];
        changed_.notify_one();
    }
    // Whether nothing is left to poll.
    bool remove(std::uint64_t number) VX_EXCLUDES(mutex_) {
        Locked lock(mutex_);
        unseen_.erase(number);
        trees_.erase(number);
        return trees_.empty();
    }

  private:
    using Trees = std::map<std::uint64_t, std::shared_ptr<PolledTree>>;

    void run() VX_EXCLUDES(mutex_) {
        while (!stopped_)
            for (const auto& [number, tree] : nextTrees())
                look(number, *tree);
    }

    // The new ones as soon as there are some, else all when the interval is over.
    Trees nextTrees() VX_EXCLUDES(mutex_) {
        Locked lock(mutex_);
        if (!nextRound_)
            nextRound_ = std::chrono::steady_clock::now() + interval_;
        while (!stopped_ && unseen_.empty()) {
            if (changed_.wait_until(mutex_, *nextRound_) == std::cv_status::timeout) {
                nextRound_.reset();
                return trees_;
            }
        }
        return std::exchange(unseen_, {});
    }

    void look(std::uint64_t number, PolledTree& tree) {
        PollReport report{number, tree.look(stopped_)};
        if (!stopped_ && (!report.changedPaths.empty() || tree.place().reportsEveryLook))
            reports_->add(std::move(report));
    }

    const std::chrono::milliseconds interval_;
    const std::shared_ptr<Reports> reports_;
    bool isRunning_ = false;  // the owner's own
    std::atomic<bool> stopped_ = false;
    std::optional<std::chrono::steady_clock::time_point> nextRound_;  // the thread's own

    platform::Mutex mutex_;
    std::condition_variable_any changed_;
    Trees trees_ VX_GUARDED_BY(mutex_);
    Trees unseen_ VX_GUARDED_BY(mutex_);
};

PollingThreads::PollingThreads(std::shared_ptr<const WakeSignal> news, std::chrono::milliseconds interval)
    : interval_(interval), reports_(std::make_shared<Reports>(std::move(news))) {}

PollingThreads::~PollingThreads() {
    close();
}

std::uint64_t PollingThreads::add(PolledPlace place) {
    Locked lock(mutex_);
    const std::uint64_t number = ++lastPlace_;
    if (closed_)
        return number;
    mountPoints_[number] = place.mountPoint;
    threadOf(place.mountPoint).add(number, std::move(place));
    return number;
}

PollingThreads::MountThread& PollingThreads::threadOf(const std::string& mountPoint) {
    std::shared_ptr<MountThread>& thread = threads_[mountPoint];
    if (!thread)
        thread = std::make_shared<MountThread>(interval_, reports_);
    thread->startUnlessRunning();
    return *thread;
}

void PollingThreads::remove(std::uint64_t place) {
    Locked lock(mutex_);
    const auto mountPoint = mountPoints_.find(place);
    if (mountPoint == mountPoints_.end())
        return;
    const auto thread = threads_.find(mountPoint->second);
    if (thread->second->remove(place)) {
        thread->second->stop();
        threads_.erase(thread);
    }
    mountPoints_.erase(mountPoint);
}

std::vector<PollReport> PollingThreads::takeReports() {
    return reports_->take();
}

void PollingThreads::close() {
    Locked lock(mutex_);
    closed_ = true;
    for (const auto& [mountPoint, thread] : threads_)
        thread->stop();
    threads_.clear();
    mountPoints_.clear();
}

}  // namespace vexo
