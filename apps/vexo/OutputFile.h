// Writing an answer into a file that the user named.
//
// A plain file appears, or is replaced, whole: the bytes go to a hidden file beside it first, which then
// takes the name. After an error or a request to end the program nothing of them is left, and what was there
// before still is. Who may use a file stays as it was. Links are followed and stay links.
//
// "-" is standard output. Pipes, terminals and devices, and what the system lists under /proc as open
// (/dev/stdout), are written to as they are: there is nothing to replace.
#pragma once

#include <cstddef>
#include <optional>
#include <span>
#include <string>

namespace vexo {

// Answers what went wrong. Belongs to the main thread, and waits as long as a pipe makes it wait.
std::optional<std::string> writeFile(const std::string& path, std::span<const std::byte> bytes);

}  // namespace vexo
