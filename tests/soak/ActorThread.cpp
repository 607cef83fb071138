#include "tests/soak/ActorThread.h"

#include <exception>

namespace soak {

using platform::Locked;

ActorThread::ActorThread(std::unique_ptr<Actor> actor, std::chrono::microseconds meanRest, unsigned seed)
    : actor_(std::move(actor)), meanRest_(meanRest), chance_(seed), thread_([this] { actUntilOver(); }) {}

ActorThread::~ActorThread() {
    end();
}

void ActorThread::end() {
    if (!thread_.joinable())
        return;
    {
        Locked lock(mutex_);
        isOver_ = true;
        changed_.notify_one();
    }
    thread_.join();
}

void ActorThread::actUntilOver() {
    try {
        while (rest())
            actor_->act();
        actor_->leave();
    } catch (const std::exception& error) {
        failure_ = error.what();
    }
}

// False when there is nothing more to do.
bool ActorThread::rest() {
    const std::size_t span = 2 * static_cast<std::size_t>(meanRest_.count()) + 1;
    const auto until = std::chrono::steady_clock::now() + std::chrono::microseconds(chance_.below(span));
    Locked lock(mutex_);
    while (!isOver_ && changed_.wait_until(mutex_, until) != std::cv_status::timeout) {
    }
    return !isOver_;
}

}  // namespace soak
