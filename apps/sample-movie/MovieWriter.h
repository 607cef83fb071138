// Encodes a sample movie. The same description gives the same bytes with the same FFmpeg.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "apps/sample-movie/MovieFormat.h"

namespace sample {

struct Movie {
    const MovieFormat* format = nullptr;
    int width = 0;
    int height = 0;
    double seconds = 2;
    int framesPerSecond = 0;
    bool hasVideo = true;
    bool hasSound = true;
    int clockwiseRotation = 0;  // 0, 90, 180 or 270 degrees, as the player is to turn the picture
    std::optional<std::string> creationTime;  // ISO 8601
    int tint = 0;
};

// The bytes of the file. Raises std::runtime_error with the step that failed.
std::vector<std::byte> encodedMovie(const Movie& movie);

}  // namespace sample
