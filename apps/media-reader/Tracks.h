// The tracks of an opened media file, as the reader looks at them.
#pragma once

#include <span>

extern "C" {
#include <libavformat/avformat.h>
}

namespace reader {

std::span<AVStream* const> tracksOf(const AVFormatContext& format);

// A cover picture in a sound file is no video.
bool isVideo(const AVStream& track);
bool isSound(const AVStream& track);
bool isCoverPicture(const AVStream& track);

// The first track of which `isWanted` holds; nil when there is none.
AVStream* firstTrack(const AVFormatContext& format, bool (*isWanted)(const AVStream&));

// By how many quarter turns clockwise, 0 to 3, the picture is to be turned before it is shown.
int quarterTurnsOf(const AVStream& track);

}  // namespace reader
