// The picture of a sample movie: a soft gradient in one hue, and a bright disc that crosses it once.
#pragma once

extern "C" {
#include <libavutil/frame.h>
}

namespace sample {

// Draws the picture for a moment, 0 (begin) to 1 (end), into a writable frame of planar YUV with chroma
// halved both ways. `tint` chooses the hue; movies with neighbouring tints look clearly different.
void drawTestCard(AVFrame& frame, int tint, double moment);

}  // namespace sample
