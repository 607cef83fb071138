// The sound of a sample movie: a quiet steady tone.
#pragma once

#include <cstdint>

extern "C" {
#include <libavutil/frame.h>
}

namespace sample {

// Fills a writable frame of 16-bit or float samples, packed or planar, that begins `firstSample` samples from
// the start of the movie.
void fillTone(AVFrame& frame, std::int64_t firstSample);

}  // namespace sample
