#include "framework/metadata/ReaderHelper.h"

#include <fmt/format.h>

#include <cerrno>
#include <utility>

#include "framework/metadata/ReaderMessage.h"
#include "framework/metadata/ReaderProcess.h"
#include "platform/linux/LogText.h"

namespace vexo {

ReaderHelper::ReaderHelper(ProcessMediaReader::Settings settings) : settings_(std::move(settings)) {}
ReaderHelper::~ReaderHelper() = default;

std::shared_ptr<ReaderProcess> ReaderHelper::take() {
    auto process = takeKept();
    return process ? process : start();
}

std::shared_ptr<ReaderProcess> ReaderHelper::takeKept() {
    platform::Locked lock(mutex_);
    if (!process_)
        return nullptr;
    isTaken_ = true;
    wasTakenWhileWaiting_ = true;
    return process_;
}

// A process that has only been spawned is kept already, so that `close` reaches it.
std::shared_ptr<ReaderProcess> ReaderHelper::start() {
    if (!mayStart())
        return nullptr;
    std::shared_ptr<ReaderProcess> process = ReaderProcess::start(settings_.program);
    const int error = process ? 0 : errno;
    if (process && adopt(process) && isGreetedBy(*process))
        return process;
    discard();
    warnOfFailedStart(error);
    platform::Locked lock(mutex_);
    earliestStart_ = Clock::now() + settings_.pauseAfterFailedStart;
    return nullptr;
}

// `error` is 0 for a process that was there and did not speak.
void ReaderHelper::warnOfFailedStart(int error) const {
    platform::Locked lock(warning_);
    if (!settings_.warn || isClosed())
        return;
    settings_.warn(error != 0 ? platform::failureLine("start", settings_.program, error)
                              : fmt::format("cannot start {}: it does not speak as a media reader does",
                                            platform::printable(settings_.program)));
}

bool ReaderHelper::mayStart() const {
    platform::Locked lock(mutex_);
    return !isClosed_ && Clock::now() >= earliestStart_;
}

bool ReaderHelper::adopt(const std::shared_ptr<ReaderProcess>& process) {
    platform::Locked lock(mutex_);
    if (isClosed_)
        return false;
    process_ = process;
    isTaken_ = true;
    wasTakenWhileWaiting_ = true;
    ++startedProcesses_;
    return true;
}

bool ReaderHelper::isGreetedBy(ReaderProcess& process) {
    std::string message;
    if (process.receive(message, Clock::now() + settings_.startDeadline) != ReaderProcess::Reception::message)
        return false;
    auto confinement = decodeGreeting(message);
    if (!confinement)
        return false;
    platform::Locked lock(mutex_);
    confinement_ = std::move(*confinement);
    return true;
}

void ReaderHelper::putBack() {
    {
        platform::Locked lock(mutex_);
        isTaken_ = false;
    }
    endAfterIdleTime();
}

void ReaderHelper::discard() {
    std::shared_ptr<ReaderProcess> discarded;  // goes outside the lock, for it is waited for
    platform::Locked lock(mutex_);
    isTaken_ = false;
    discarded = std::move(process_);
}

void ReaderHelper::close() {
    {
        std::shared_ptr<ReaderProcess> closed;  // as above
        platform::Locked lock(mutex_);
        isClosed_ = true;
        closed = std::move(process_);
        if (closed)
            closed->end();
    }
    platform::Locked lastWarning(warning_);
}

bool ReaderHelper::isClosed() const {
    platform::Locked lock(mutex_);
    return isClosed_;
}

std::vector<std::string> ReaderHelper::confinement() const {
    platform::Locked lock(mutex_);
    return confinement_;
}

int ReaderHelper::startedProcesses() const {
    platform::Locked lock(mutex_);
    return startedProcesses_;
}

void ReaderHelper::endAfterIdleTime() {
    if (!beginWaiting())
        return;
    settings_.afterIdleTime([helper = weak_from_this()] {
        const auto self = helper.lock();
        if (self && !self->takeIdle())
            self->endAfterIdleTime();
    });
}

bool ReaderHelper::beginWaiting() {
    platform::Locked lock(mutex_);
    if (!settings_.afterIdleTime || !process_ || isTaken_ || isWaiting_)
        return false;
    isWaiting_ = true;
    wasTakenWhileWaiting_ = false;
    return true;
}

std::shared_ptr<ReaderProcess> ReaderHelper::takeIdle() {
    platform::Locked lock(mutex_);
    isWaiting_ = false;
    return wasTakenWhileWaiting_ ? nullptr : std::move(process_);
}

}  // namespace vexo
