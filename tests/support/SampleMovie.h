// Real movies for tests, made by vexo-sample-movie.
#pragma once

#include <string>

namespace testing_support {

struct SampleMovie {
    std::string size = "320x240";
    double seconds = 1;
    std::string format = {};        // empty: by the path's extension
    std::string creationTime = {};  // ISO 8601; empty for none
    int rotation = 0;               // degrees, clockwise
    bool hasVideo = true;
    bool hasSound = true;
    int tint = 0;
};

// Raises std::runtime_error when the movie cannot be made.
void makeSampleMovie(const std::string& path, const SampleMovie& movie = {});

}  // namespace testing_support
