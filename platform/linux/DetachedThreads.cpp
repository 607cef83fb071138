#include "platform/linux/DetachedThreads.h"

#include <system_error>
#include <utility>

#include "platform/linux/ThreadPriority.h"

namespace platform {

DetachedThreads::DetachedThreads(Run run, std::function<void(Dispatcher::Block block)> runWithoutThread)
    : run_(std::move(run)),
      runWithoutThread_(std::move(runWithoutThread)),
      starter_([this] { startAndJoin(); }) {}

void DetachedThreads::start(std::string name, double priority, Dispatcher::Block block) {
    Locked lock(mutex_);
    if (closed_)
        return;
    requests_.push_back({std::move(name), priority, std::move(block)});
    changed_.notify_one();
}

void DetachedThreads::close() {
    std::deque<Request> dropped;
    {
        Locked lock(mutex_);
        closed_ = true;
        std::swap(dropped, requests_);
        changed_.notify_one();
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
    for (const Request& request : requests)
        startThread(request);
}

void DetachedThreads::startThread(const Request& request) {
    const ThreadNumber number = ++lastNumber_;
    try {
        running_.emplace(number, [this, number, request] { runThread(number, request); });
    } catch (const std::system_error&) {
        runWithoutThread_(request.block);
    }
}

void DetachedThreads::runThread(ThreadNumber number, const Request& request) {
    nameThisThread(request.name);
    setPriorityOfThisThread(request.priority);
    run_(request.block);
    Locked lock(mutex_);
    finished_.push_back(number);
    changed_.notify_one();
}

}  // namespace platform
