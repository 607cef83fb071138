#include "platform/linux/MountReach.h"

#include <fcntl.h>
#include <signal.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <condition_variable>
#include <system_error>
#include <thread>

#include "platform/linux/LogText.h"
#include "platform/linux/ThreadPriority.h"
#include "platform/linux/Uninterrupted.h"

namespace platform {

namespace {

constexpr std::chrono::minutes mostPatience{1};  // with a server where another may have been mounted since

// What is mounted there by a look is, and what the kernel has cached of the mount does not count.
bool answersALook(const char* path) {
    struct statx status {};
    return statx(AT_FDCWD, path, AT_STATX_FORCE_SYNC, STATX_BASIC_STATS, &status) == 0;
}

// By a process of its own, which the kernel may keep for as long as it likes: it has no files of ours, and
// nobody's end waits for it. False as well where there can be none.
bool answersAProcess(const std::string& path) {
    const pid_t process = fork();
    if (process == 0) {
        close_range(0, ~0U, 0);
        prctl(PR_SET_PDEATHSIG, SIGKILL);
        _exit(answersALook(path.c_str()) ? 0 : 1);
    }
    int status = 0;
    return process > 0 && uninterrupted([&] { return waitpid(process, &status, 0); }) == process &&
           WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

}  // namespace

// What is behind one mount. The thread that waits for it may outlive everything else.
class MountReach::Server : public std::enable_shared_from_this<Server> {
  public:
    Server(std::string mountPoint, std::chrono::milliseconds freshness)
        : mountPoint_(std::move(mountPoint)), freshness_(freshness) {}

    const std::string& mountPoint() const { return mountPoint_; }

    bool answersWithin(std::chrono::milliseconds patience) VX_EXCLUDES(mutex_) {
        Locked lock(mutex_);
        const auto now = Clock::now();
        if (!isAsked_ && now >= answerCountsUntil_)
            ask(isGone_ ? now : now + patience);
        const auto deadline = deadline_;
        while (isAskedUntil(deadline))
            if (answered_.wait_until(mutex_, deadline) == std::cv_status::timeout)
                break;
        return !isAskedUntil(deadline) && !isGone_;
    }

    bool isGivenUp() const VX_EXCLUDES(mutex_) {
        Locked lock(mutex_);
        return isAsked_ && Clock::now() >= deadline_ + mostPatience;
    }

  private:
    // Not by a later question.
    bool isAskedUntil(Clock::time_point deadline) const VX_REQUIRES(mutex_) {
        return isAsked_ && deadline_ == deadline;
    }

    // Where the machine has no thread left, the server counts as one that answers.
    void ask(Clock::time_point deadline) VX_REQUIRES(mutex_) {
        deadline_ = deadline;
        try {
            std::thread([self = shared_from_this()] { self->awaitAnswer(); }).detach();
            isAsked_ = true;
        } catch (const std::system_error&) {
            isGone_ = false;
        }
    }

    // An error that comes at once keeps nobody waiting. One that comes late says that the next will as well.
    void awaitAnswer() VX_EXCLUDES(mutex_) {
        nameThisThread("vexo-reach");
        const bool answers = answersAProcess(mountPoint_ + "/.");
        Locked lock(mutex_);
        isAsked_ = false;
        isGone_ = !answers && (isGone_ || Clock::now() >= deadline_);
        answerCountsUntil_ = Clock::now() + freshness_;
        answered_.notify_all();
    }

    const std::string mountPoint_;
    const std::chrono::milliseconds freshness_;

    mutable Mutex mutex_;
    std::condition_variable_any answered_;
    bool isAsked_ VX_GUARDED_BY(mutex_) = false;
    bool isGone_ VX_GUARDED_BY(mutex_) = false;  // as far as the last answer tells
    Clock::time_point deadline_ VX_GUARDED_BY(mutex_);
    Clock::time_point answerCountsUntil_ VX_GUARDED_BY(mutex_);
};

MountReach::MountReach(const MountTable& table, SystemLog& log, std::chrono::milliseconds patience,
                       std::chrono::milliseconds freshness)
    : table_(table), log_(log), patience_(patience), freshness_(freshness) {}

MountReach::~MountReach() = default;

bool MountReach::isInReach(const std::string& path) const {
    for (const ServerRef& server : serversOnTheWayTo(path)) {
        if (!server->answersWithin(patience_)) {
            log_.log(failureLine("look at", server->mountPoint(), ETIMEDOUT));
            return false;
        }
    }
    return true;
}

std::vector<MountReach::ServerRef> MountReach::serversOnTheWayTo(const std::string& path) const {
    Locked lock(mutex_);
    keepUpToDate();
    std::vector<ServerRef> servers;
    for (std::string& mountPoint : ways_->mountPointsOnTheWayTo(path)) {
        ServerRef& server = servers_[mountPoint];
        if (!server)
            server = std::make_shared<Server>(std::move(mountPoint), freshness_);
        servers.push_back(server);
    }
    return servers;
}

void MountReach::keepUpToDate() const {
    const auto now = Clock::now();
    if (upToDateUntil_ && now < *upToDateUntil_)
        return;
    MountTable::MountPoints served = table_.servedMountPoints();
    const bool hasChanged = served != served_;
    served_ = std::move(served);
    ways_.emplace(served_);
    if (hasChanged)
        forgetServers();
    upToDateUntil_ = now + freshness_;
}

// What was mounted anew where one doesn't answer has a server of its own.
void MountReach::forgetServers() const {
    const auto& served = *served_;
    std::erase_if(servers_, [&](const auto& entry) {
        return !served.contains(entry.first) || entry.second->isGivenUp();
    });
}

}  // namespace platform
