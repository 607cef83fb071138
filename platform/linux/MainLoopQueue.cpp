#include "platform/linux/MainLoopQueue.h"

#include <utility>

namespace platform {

namespace {

// The source becomes ready at its ready time, and its callback does the rest.
gboolean dispatch(GSource*, GSourceFunc callback, gpointer data) {
    return callback(data);
}

GSourceFuncs functions = {nullptr, nullptr, dispatch, nullptr, nullptr, nullptr};

// GLib counts microseconds of the same clock.
gint64 readyTime(BlockQueue::Time due) {
    return std::chrono::ceil<std::chrono::microseconds>(due.time_since_epoch()).count();
}

constexpr gint64 never = -1;

}  // namespace

// A block may run a loop of its own, as a modal dialogue does; the source stays alive within it.
MainLoopQueue::MainLoopQueue(Run run)
    : run_(std::move(run)), source_(g_source_new(&functions, sizeof(GSource))) {
    const auto runNext = [](gpointer self) -> gboolean {
        static_cast<MainLoopQueue*>(self)->runNext();
        return G_SOURCE_CONTINUE;
    };
    g_source_set_callback(source_, runNext, this, nullptr);
    g_source_set_can_recurse(source_, TRUE);
    g_source_set_name(source_, "main run loop blocks");
    g_source_attach(source_, nullptr);
}

void MainLoopQueue::add(Dispatcher::Delay delay, Dispatcher::Block block) {
    Locked lock(mutex_);
    if (closed_)
        return;
    blocks_.add(BlockQueue::dueAfter(delay), std::move(block));
    waitForNext();
}

// The dropped blocks go outside the lock: what they hold may call back when it goes.
void MainLoopQueue::close() {
    BlockQueue dropped;
    {
        Locked lock(mutex_);
        closed_ = true;
        std::swap(dropped, blocks_);
    }
    g_source_destroy(source_);
    g_source_unref(source_);
}

void MainLoopQueue::runNext() {
    std::optional<Dispatcher::Block> block;
    {
        Locked lock(mutex_);
        block = blocks_.takeDue(BlockQueue::Clock::now());
        waitForNext();
    }
    if (block)
        run_(*block);
}

void MainLoopQueue::waitForNext() {
    g_source_set_ready_time(source_, blocks_.empty() ? never : readyTime(blocks_.nextDue()));
}

}  // namespace platform
