#include "platform/linux/MountReach.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>
#include <condition_variable>
#include <system_error>
#include <thread>

#include "platform/linux/LogText.h"
#include "platform/linux/ThreadPriority.h"

namespace platform {

namespace {

constexpr std::chrono::seconds freshness{1};

}  // namespace

// What is behind one mount. The thread that waits for it may outlive everything else.
class MountReach::Server : public std::enable_shared_from_this<Server> {
  public:
    explicit Server(std::string mountPoint) : mountPoint_(std::move(mountPoint)) {}

    const std::string& mountPoint() const { return mountPoint_; }

    bool answersWithin(std::chrono::milliseconds patience) VX_EXCLUDES(mutex_) {
        Locked lock(mutex_);
        if (!isAsked_ && Clock::now() >= answerCountsUntil_)
            ask(Clock::now() + patience);
        while (isAsked_)
            if (answered_.wait_until(mutex_, deadline_) == std::cv_status::timeout)
                return !isAsked_;
        return true;
    }

  private:
    // Where the machine has no thread left, the server counts as one that answers.
    void ask(Clock::time_point deadline) VX_REQUIRES(mutex_) {
        deadline_ = deadline;
        try {
            std::thread([self = shared_from_this()] { self->awaitAnswer(); }).detach();
            isAsked_ = true;
        } catch (const std::system_error&) {
        }
    }

    // Whatever the answer is, an error as well. What the kernel remembers of the mount is none.
    void awaitAnswer() VX_EXCLUDES(mutex_) {
        nameThisThread("vexo-mount");
        struct statx status {};
        statx(AT_FDCWD, mountPoint_.c_str(), AT_STATX_FORCE_SYNC | AT_NO_AUTOMOUNT, STATX_BASIC_STATS,
              &status);
        Locked lock(mutex_);
        isAsked_ = false;
        answerCountsUntil_ = Clock::now() + freshness;
        answered_.notify_all();
    }

    const std::string mountPoint_;

    Mutex mutex_;
    std::condition_variable_any answered_;
    bool isAsked_ VX_GUARDED_BY(mutex_) = false;
    Clock::time_point deadline_ VX_GUARDED_BY(mutex_);
    Clock::time_point answerCountsUntil_ VX_GUARDED_BY(mutex_);
};

MountReach::MountReach(const MountTable& table, SystemLog& log, std::chrono::milliseconds patience)
    : table_(table), log_(log), patience_(patience) {}

MountReach::~MountReach() = default;

bool MountReach::isInReach(const std::string& path) const {
    const auto server = serverOnTheWayTo(path);
    if (!server || server->answersWithin(patience_))
        return true;
    log_.log(failureLine("look at", server->mountPoint(), ETIMEDOUT));
    return false;
}

std::shared_ptr<MountReach::Server> MountReach::serverOnTheWayTo(const std::string& path) const {
    Locked lock(mutex_);
    keepUpToDate();
    const auto mountPoint = ways_->mountPointOnTheWayTo(path);
    if (!mountPoint)
        return nullptr;
    std::shared_ptr<Server>& server = servers_[*mountPoint];
    if (!server)
        server = std::make_shared<Server>(*mountPoint);
    return server;
}

// What is mounted where a server was that doesn't answer has a server of its own.
void MountReach::keepUpToDate() const {
    const auto now = Clock::now();
    if (upToDateUntil_ && now < *upToDateUntil_)
        return;
    upToDateUntil_ = now + freshness;
    MountTable::MountPoints served = table_.servedMountPoints();
    if (served != served_)
        servers_.clear();
    served_ = std::move(served);
    ways_.emplace(served_);
}

}  // namespace platform
