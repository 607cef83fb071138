// The file formats in which sample movies come, and what each allows.
#pragma once

#include <span>
#include <string_view>

extern "C" {
#include <libavcodec/codec_id.h>
}

namespace sample {

struct MovieFormat {
    std::string_view extension;  // names the format on the command line as well
    const char* container;       // FFmpeg's name
    AVCodecID videoCodec;
    AVCodecID soundCodec;  // AV_CODEC_ID_NONE for a format that is written without sound
    int framesPerSecond;   // when none are asked for
    bool anyFrameRate;     // else only `framesPerSecond`
    int width;             // when no size is asked for
    int height;
    bool anySize;  // else only `width` by `height`
    bool keepsCreationTime;
    bool keepsRotation;
};

std::span<const MovieFormat> movieFormats();
// nil for a format that is not made here.
const MovieFormat* movieFormat(std::string_view extension);

}  // namespace sample
