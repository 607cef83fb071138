// Text that is fit for one line of a log, whatever bytes a path or a message brings along.
#pragma once

#include <string>
#include <string_view>

namespace platform {

// The text with every control character, those of the C1 set included, as "\x0a".
std::string printable(std::string_view text);

// "cannot <operation> <path>: <message of the system for the errno `error`>".
std::string failureLine(std::string_view operation, std::string_view path, int error);
// The path that such a line names, as it stands there; all of a line that names none.
std::string_view pathInFailureLine(std::string_view line);

}  // namespace platform
