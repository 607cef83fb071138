// Handing work to the main thread of a command that stays.
#pragma once

#include <memory>
#include <utility>

#include "platform/Dispatcher.h"
#include "platform/Services.h"

namespace vexo {

// Calls `work` with the object on the main thread, in the order of the calls, unless it has gone by then.
// Callable from any thread; needs the main loop to run.
template <typename Object, typename Work>
void onMainThread(const std::weak_ptr<Object>& object, Work work) {
    platform::services().dispatcher.performOnMainRunLoop(platform::Dispatcher::Delay::zero(),
                                                         {platform::RunLoopMode::kCFRunLoopCommonModes},
                                                         [object, work = std::move(work)] {
                                                             if (const auto living = object.lock())
                                                                 work(*living);
                                                         });
}

}  // namespace vexo
