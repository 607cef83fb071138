// What the reader gives up before it touches a file.
#pragma once

namespace reader {

// Closes what is not needed and limits memory, open files, written files, core dumps and new privileges for
// good. False when a limit could not be set; the reader is then not to work.
[[nodiscard]] bool confine();

// Allows some more processor time, for one file; the system ends a reader that takes longer.
void renewProcessorTime();

}  // namespace reader
