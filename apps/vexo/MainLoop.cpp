#include "apps/vexo/MainLoop.h"

#include <glib-unix.h>
#include <signal.h>

#include "platform/linux/DescriptorRoom.h"

namespace vexo {

struct MainLoop::State {
    bool ended = false;
    guint interruption = 0;
    guint termination = 0;
};

namespace {

gboolean setFlag(gpointer flag) {
    *static_cast<bool*>(flag) = true;
    return G_SOURCE_CONTINUE;
}

// Longer than anybody waits; GLib counts milliseconds in an unsigned integer.
constexpr double longestTimeout = 4e6;

}  // namespace

MainLoop::MainLoop() : state_(std::make_unique<State>()) {
    platform::requireRoomForDescriptors();
    state_->interruption = g_unix_signal_add(SIGINT, setFlag, &state_->ended);
    state_->termination = g_unix_signal_add(SIGTERM, setFlag, &state_->ended);
}

MainLoop::~MainLoop() {
    g_source_remove(state_->interruption);
    g_source_remove(state_->termination);
}

void MainLoop::runPending() {
    while (g_main_context_iteration(nullptr, /*may_block=*/FALSE)) {
    }
}

void MainLoop::run(const std::optional<Seconds>& atMost) {
    bool timeIsOver = false;
    const bool isLimited = atMost && atMost->count() < longestTimeout;
    const guint timer =
        isLimited ? g_timeout_add(static_cast<guint>(atMost->count() * 1000), setFlag, &timeIsOver) : 0;
    while (!state_->ended && !timeIsOver)
        g_main_context_iteration(nullptr, /*may_block=*/TRUE);
    if (isLimited)
        g_source_remove(timer);
}

void MainLoop::end() {
    state_->ended = true;
}

bool MainLoop::isEnded() const {
    return state_->ended;
}

}  // namespace vexo
