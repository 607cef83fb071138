#include "platform/linux/DetachedThreads.h"

#include <algorithm>
#include <chrono>
#include <memory>
#include <system_error>
#include <utility>

#include "platform/linux/ThreadPriority.h"

namespace platform {

namespace {

using namespace std::chrono_literals;

constexpr auto idleTime = 1s;

}  // namespace

DetachedThreads::DetachedThreads(Run run, std::function<void(Dispatcher::Block block)> runWithoutThread)
    : run_(std::move(run)),
      runWithoutThread_(std::move(runWithoutThread)),
      starter_([this] { startAndJoin(); }) {}

void DetachedThreads::start(std::string name, double priority, Dispatcher::Block block) {
    Locked lock(mutex_);
    if (closed_)
        return;
    if (Idle* const idle = idleThread(priority)) {
        idle->next = Request{std::move(name), priority, std::move(block)};
        handedOver_.notify_all();
        return;
    }
    requests_.push_back({std::move(name), priority, std::move(block)});
    changed_.notify_one();
}

DetachedThreads::Idle* DetachedThreads::idleThread(double priority) {
    const auto found = std::ranges::find_if(
        idle_, [priority](const Idle* idle) { return idle->priority == priority && !idle->next; });
    return found == idle_.end() ? nullptr : *found;
}

void DetachedThreads::close() {
    std::deque<Request> dropped;
    {
        Locked lock(mutex_);
        closed_ = true;
        std::swap(dropped, requests_);
        changed_.notify_one();
        handedOver_.notify_all();
    }
    starter_.join();
}

void DetachedThreads::startAndJoin() {
    nameThisThread("thread starter");
    while (waitForWork()) {
        joinFinished();
        startRequested();
    }
    for (auto& [number, thread] : running_)
        thread.join();
}

// False when there will be none any more.
bool DetachedThreads::waitForWork() {
    Locked lock(mutex_);
    while (!closed_ && requests_.empty() && finished_.empty())
        changed_.wait(mutex_);
    return !closed_;
}

void DetachedThreads::joinFinished() {
    std::vector<ThreadNumber> finished;
    {
        Locked lock(mutex_);
        std::swap(finished, finished_);
    }
    for (const ThreadNumber number : finished) {
        running_.at(number).join();
        running_.erase(number);
    }
}

void DetachedThreads::startRequested() {
    std::deque<Request> requests;
    {
        Locked lock(mutex_);
        std::swap(requests, requests_);
    }
    for (Request& request : requests)
        startThread(std::move(request));
}

void DetachedThreads::startThread(Request request) {
    const ThreadNumber number = ++lastNumber_;
    // The thread takes it out, so that nobody else keeps what the block holds.
    const auto handedOver = std::make_shared<Request>(std::move(request));
    try {
        running_.emplace(number, [this, number, handedOver] { runThread(number, std::move(*handedOver)); });
    } catch (const std::system_error&) {
        runWithoutThread_(std::move(handedOver->block));
    }
}

void DetachedThreads::runThread(ThreadNumber number, Request request) {
    const double priority = request.priority;
    setPriorityOfThisThread(priority);
    for (std::optional<Request> next = std::move(request); next;) {
        nameThisThread(next->name);
        run_(next->block);
        next.reset();  // what the block holds goes before anything is waited for
        next = nextRequest(number, priority);
    }
}

std::optional<DetachedThreads::Request> DetachedThreads::nextRequest(ThreadNumber number, double priority) {
    Idle idle{priority, std::nullopt};
    Locked lock(mutex_);
    idle_.push_back(&idle);
    const auto end = std::chrono::steady_clock::now() + idleTime;
    while (!closed_ && !idle.next && handedOver_.wait_until(mutex_, end) == std::cv_status::no_timeout) {
    }
    std::erase(idle_, &idle);
    if (!closed_ && idle.next)
        return std::move(idle.next);
    finished_.push_back(number);
    changed_.notify_one();
    return std::nullopt;
}

}  // namespace platform
