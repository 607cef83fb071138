// What FFmpeg's own program says of movies.
#pragma once

#include <nlohmann/json.hpp>
#include <optional>
#include <string>

#include "tests/support/Program.h"

namespace testing_support {

// nil where it is not installed, and for what it can't read.
inline std::optional<nlohmann::json> probed(const std::string& path) {
    const Outcome outcome =
        runProgram("ffprobe", {"-v", "error", "-of", "json", "-show_format", "-show_streams", path});
    const auto json = nlohmann::json::parse(outcome.output, nullptr, false);
    return json.is_object() ? std::optional(json) : std::nullopt;
}

}  // namespace testing_support
