#include "apps/media-reader/Tracks.h"

#include <cmath>
#include <cstdint>

extern "C" {
#include <libavutil/display.h>
}

namespace reader {

std::span<AVStream* const> tracksOf(const AVFormatContext& format) {
    return {format.streams, format.nb_streams};
}

bool isVideo(const AVStream& track) {
    return track.codecpar->codec_type == AVMEDIA_TYPE_VIDEO &&
           !(track.disposition & (AV_DISPOSITION_ATTACHED_PIC | AV_DISPOSITION_TIMED_THUMBNAILS));
}

bool isSound(const AVStream& track) {
    return track.codecpar->codec_type == AVMEDIA_TYPE_AUDIO;
}

bool isCoverPicture(const AVStream& track) {
    return track.codecpar->codec_type == AVMEDIA_TYPE_VIDEO &&
           (track.disposition & AV_DISPOSITION_ATTACHED_PIC);
}

AVStream* firstTrack(const AVFormatContext& format, bool (*isWanted)(const AVStream&)) {
    for (AVStream* track : tracksOf(format))
        if (isWanted(*track))
            return track;
    return nullptr;
}

int quarterTurnsOf(const AVStream& track) {
    std::size_t size = 0;
    const std::uint8_t* matrix = av_stream_get_side_data(&track, AV_PKT_DATA_DISPLAYMATRIX, &size);
    if (!matrix || size < 9 * sizeof(std::int32_t))
        return 0;
    const double anticlockwise = av_display_rotation_get(reinterpret_cast<const std::int32_t*>(matrix));
    if (!std::isfinite(anticlockwise))
        return 0;
    return static_cast<int>(std::lround(-anticlockwise / 90) & 3);
}

}  // namespace reader
