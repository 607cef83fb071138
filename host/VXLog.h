// The host's log. Level 2 is a caught error and is always written to the system log; level 16 is a trace and
// is written only in a verbose host. Callable from any thread.
#pragma once

#include <string_view>

namespace vexo {

inline constexpr int VXLogLevelCaughtError = 2;
inline constexpr int VXLogLevelTrace = 16;

void VXLog(std::string_view message, int level, const void* sender);
// Like VXLog, for diagnostics that only developers want.
void VXLogDef(std::string_view message, int level, const void* sender);

}  // namespace vexo
