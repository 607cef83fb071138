// The machine's own events, folders, mounts and polling.
#pragma once

#include <chrono>
#include <memory>

#include "framework/pathwatcher/WakeSignal.h"
#include "framework/pathwatcher/WatchedPaths.h"

namespace vexo {

constexpr std::chrono::seconds usualPollInterval{10};

// Requires: a platform::ServicesScope exists while they are used.
WatchSeams systemSeams(const std::shared_ptr<const WakeSignal>& wake, std::chrono::milliseconds pollInterval);

}  // namespace vexo
