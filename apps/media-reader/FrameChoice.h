// Chooses the frame by which a movie is recognised.
#pragma once

#include "apps/media-reader/LibraryObjects.h"
#include "apps/media-reader/MediaFile.h"

namespace reader {

struct ChosenFrame {
    AVFormatContext* format;  // the file's, as is the track
    AVStream* track;
    Owned<AVFrame> frame;
};

// A frame that is neither dark nor flat, from early in the movie if there is one, else the best of those that
// were looked at. A file that has sound and a cover picture shows the picture, because that is how people
// know the recording.
//
// Raises MediaError when there is no picture that can be decoded.
ChosenFrame representativeFrame(MediaFile& file);

}  // namespace reader
