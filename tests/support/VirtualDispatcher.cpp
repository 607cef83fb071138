#include "tests/support/VirtualDispatcher.h"

#include <algorithm>
#include <optional>
#include <utility>

using platform::Locked;

namespace testing_support {

void VirtualDispatcher::advance(Delay duration) {
    const Delay end = now() + duration;
    while (runNextUntil(end)) {
    }
    Locked lock(mutex_);
    now_ = std::max(now_, end);
}

platform::Dispatcher::Delay VirtualDispatcher::now() const {
    Locked lock(mutex_);
    return now_;
}

std::vector<VirtualDispatcher::Request> VirtualDispatcher::requests() const {
    Locked lock(mutex_);
    return requests_;
}

std::size_t VirtualDispatcher::pendingCount() const {
    Locked lock(mutex_);
    return pending_.size();
}

bool VirtualDispatcher::isMainThread() const {
    return std::this_thread::get_id() == mainThread_ && !isOffMainThread_;
}

void VirtualDispatcher::asyncInBackground(Block block) {
    add({.place = Place::background}, std::move(block));
}

void VirtualDispatcher::afterInBackground(Delay delay, Block block) {
    add({.place = Place::background, .delay = delay}, std::move(block));
}

void VirtualDispatcher::performOnMainRunLoop(Delay delay, std::vector<platform::RunLoopMode> modes,
                                             Block block) {
    add({.place = Place::mainRunLoop, .delay = delay, .modes = std::move(modes)}, std::move(block));
}

void VirtualDispatcher::detachThread(std::string_view name, double priority, Block block) {
    add({.place = Place::ownThread, .name = std::string(name), .priority = priority}, std::move(block));
}

void VirtualDispatcher::add(Request request, Block block) {
    Locked lock(mutex_);
    pending_.emplace(now_ + std::max(request.delay, Delay::zero()), Pending{request.place, std::move(block)});
    requests_.push_back(std::move(request));
}

bool VirtualDispatcher::runNextUntil(Delay end) {
    std::optional<Pending> next;
    {
        Locked lock(mutex_);
        if (pending_.empty() || pending_.begin()->first > end)
            return false;
        now_ = std::max(now_, pending_.begin()->first);
        next = std::move(pending_.extract(pending_.begin()).mapped());
    }
    run(*next);
    return true;
}

void VirtualDispatcher::run(const Pending& pending) {
    const bool wasOffMainThread = std::exchange(isOffMainThread_, pending.place != Place::mainRunLoop);
    try {
        pending.block();
    } catch (...) {
        handle(pending.block, std::current_exception());
    }
    isOffMainThread_ = wasOffMainThread;
}

void VirtualDispatcher::handle(const Block& block, std::exception_ptr failure) {
    if (!failureHandler_) {
        ++unhandledFailures_;
        return;
    }
    try {
        failureHandler_(block, failure);
    } catch (...) {
        ++unhandledFailures_;
    }
}

}  // namespace testing_support
