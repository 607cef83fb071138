// What the inside of a media file says about it, or why it says nothing. Plain values.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "platform/Image.h"

namespace vexo {

struct MediaProperties {
    std::vector<std::string> mediaTypes = {};  // "Video", "Sound"; "MPEG1 Muxed" alone for a program stream
    std::optional<int> pixelWidth = {};        // as shown: a picture filmed upright is higher than wide
    std::optional<int> pixelHeight = {};
    std::optional<double> durationSeconds = {};
    std::vector<std::string> codecs = {};             // FFmpeg's short names, each once
    std::optional<double> contentCreationDate = {};   // when the content was recorded; seconds from 1970, UTC
    std::optional<double> frameRate = {};             // frames a second, on average
    std::optional<int> audioChannelCount = {};        // of the first sound track
    std::optional<int> audioSampleRate = {};          // of the first sound track, in hertz
    std::optional<std::int64_t> totalBitRate = {};    // bits a second
    std::optional<std::string> title = {};            // as the container names the movie
    std::optional<std::string> acquisitionMake = {};  // who made the camera
    std::optional<std::string> acquisitionModel = {};

    bool operator==(const MediaProperties&) const = default;
};

// A failure that lies in the file stays until the file changes. One that lies elsewhere (no reader program,
// no permission) may be over at the next attempt.
enum class FailureCause { file, elsewhere };

struct MediaFailure {
    std::string reason;
    FailureCause cause = FailureCause::file;

    bool operator==(const MediaFailure&) const = default;
};

using MediaReaderAnswer = std::variant<MediaProperties, MediaFailure>;

// A picture out of a movie, as it is shown, or why there is none.
using MediaFrameAnswer = std::variant<platform::Bitmap, MediaFailure>;

}  // namespace vexo
