// Showing an item selected in the desktop's file manager.
#pragma once

#include <optional>
#include <string>

#include "platform/URL.h"

namespace platform {

// Has the file manager open the folder around the item and select it there, also where the item is itself a
// folder. Answers why that failed; nil when it was shown. Waits for the file manager, which may have to be
// started, a few seconds at most. Callable from any thread.
std::optional<std::string> showInFileManager(const URL& item);

}  // namespace platform
