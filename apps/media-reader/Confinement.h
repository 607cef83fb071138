// What the reader gives up before it touches a file.
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace reader {

// Closes what is not needed; limits memory, open files, written files, core dumps and new privileges, and
// then as much of the system as the kernel allows a process to give up. All of it is for good. Answers the
// names of what was given up, as a host shows them; nil when a limit could not be set, and the reader is then
// not to work.
[[nodiscard]] std::optional<std::vector<std::string>> confine();

// Allows some more processor time, for one file; the system ends a reader that takes longer.
void renewProcessorTime();

}  // namespace reader
