#include "apps/sample-movie/MovieFormat.h"

#include <algorithm>
#include <array>

namespace sample {

namespace {

// clang-format off
constexpr std::array formats{
    //           extension container   picture                 sound                fps  any?   width height any? time?  turn?
    MovieFormat{"mov",    "mov",      AV_CODEC_ID_MPEG4,      AV_CODEC_ID_AAC,       5, true,  1280, 720, true,  true,  true},
    MovieFormat{"mp4",    "mp4",      AV_CODEC_ID_MPEG4,      AV_CODEC_ID_AAC,       5, true,  1280, 720, true,  true,  true},
    MovieFormat{"m4v",    "mp4",      AV_CODEC_ID_MPEG4,      AV_CODEC_ID_AAC,       5, true,  1280, 720, true,  true,  true},
    MovieFormat{"3gp",    "3gp",      AV_CODEC_ID_MPEG4,      AV_CODEC_ID_AAC,       5, true,   320, 240, true,  true,  true},
    MovieFormat{"mkv",    "matroska", AV_CODEC_ID_MPEG4,      AV_CODEC_ID_AAC,       5, true,  1280, 720, true,  true,  false},
    MovieFormat{"webm",   "webm",     AV_CODEC_ID_VP8,        AV_CODEC_ID_VORBIS,    5, true,   640, 360, true,  true,  false},
    MovieFormat{"avi",    "avi",      AV_CODEC_ID_MPEG4,      AV_CODEC_ID_MP2,       5, true,   640, 480, true,  false, false},
    MovieFormat{"mpg",    "mpeg",     AV_CODEC_ID_MPEG1VIDEO, AV_CODEC_ID_MP2,      25, false,  352, 288, true,  false, false},
    MovieFormat{"dv",     "dv",       AV_CODEC_ID_DVVIDEO,    AV_CODEC_ID_NONE,     25, false,  720, 576, false, false, false},
};
// clang-format on

}  // namespace

std::span<const MovieFormat> movieFormats() {
    return formats;
}

const MovieFormat* movieFormat(std::string_view extension) {
    const auto found = std::find_if(formats.begin(), formats.end(),
                                    [&](const MovieFormat& format) { return format.extension == extension; });
    return found == formats.end() ? nullptr : &*found;
}

}  // namespace sample
