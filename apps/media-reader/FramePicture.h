// Turns a decoded frame into the picture that people see.
#pragma once

#include <cstdint>
#include <span>

#include "apps/media-reader/FrameChoice.h"
#include "framework/metadata/ReaderMessage.h"

namespace reader {

// Writes the frame upright, in its shown proportions and scaled down to at most `longestSide` pixels a side,
// never enlarged; as pixels of a platform::Bitmap, but with alpha of any kind. Answers its size.
//
// `pixels` has room for longestSide * longestSide of them. Raises MediaError for a frame whose pixels cannot
// be understood.
vexo::FrameSize drawFrame(const ChosenFrame& chosen, int longestSide, std::span<std::uint32_t> pixels);

}  // namespace reader
