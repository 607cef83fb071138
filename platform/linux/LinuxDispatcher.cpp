#include "platform/linux/LinuxDispatcher.h"

#include <fmt/format.h>

#include "platform/linux/LogText.h"

namespace platform {

LinuxDispatcher::LinuxDispatcher(SystemLog& systemLog)
    : mainThread_(std::this_thread::get_id()),
      systemLog_(systemLog),
      background_([this](const Block& block) { run(block); }),
      mainLoop_([this](const Block& block) { run(block); }),
      threads_([this](const Block& block) { run(block); },
               [this](Block block) { background_.add(Delay::zero(), std::move(block)); }) {}

// Blocks that still run may hand over others; each part takes such calls, and drops them, until all are
// closed.
LinuxDispatcher::~LinuxDispatcher() {
    mainLoop_.close();
    background_.close();
    threads_.close();
}

void LinuxDispatcher::asyncInBackground(Block block) {
    background_.add(Delay::zero(), std::move(block));
}

void LinuxDispatcher::afterInBackground(Delay delay, Block block) {
    background_.add(delay, std::move(block));
}

void LinuxDispatcher::performOnMainRunLoop(Delay delay, std::vector<RunLoopMode>, Block block) {
    mainLoop_.add(delay, std::move(block));
}

void LinuxDispatcher::detachThread(std::string_view name, double priority, Block block) {
    threads_.start(std::string(name), priority, std::move(block));
}

void LinuxDispatcher::setFailureHandler(FailureHandler handler) {
    Locked lock(mutex_);
    failureHandler_ = std::move(handler);
}

void LinuxDispatcher::run(const Block& block) noexcept {
    try {
        block();
    } catch (...) {
        handle(block, std::current_exception());
    }
}

void LinuxDispatcher::handle(const Block& block, std::exception_ptr failure) {
    FailureHandler handler;
    {
        Locked lock(mutex_);
        handler = failureHandler_;
    }
    if (!handler)
        return logFailure(failure);
    try {
        handler(block, failure);
    } catch (...) {
        logFailure(std::current_exception());
    }
}

void LinuxDispatcher::logFailure(const std::exception_ptr& failure) const {
    try {
        std::rethrow_exception(failure);
    } catch (const std::exception& exception) {
        systemLog_.log(fmt::format("a block failed: {}", printable(exception.what())));
    } catch (...) {
        systemLog_.log("a block failed for an unknown reason");
    }
}

}  // namespace platform
