// Drawings, played back with Cairo and Pango.
#pragma once

#include <optional>

#include "platform/Renderer.h"

namespace platform {

// Requires, of both: isDrawableSize(drawing.size).
std::optional<Bitmap> played(const RecordedDrawing& drawing, int width, int height);
// Straight over what the bitmap shows, where that comes to the same. Requires: isWhole(bitmap).
bool playOver(Bitmap& bitmap, const RecordedDrawing& drawing);

}  // namespace platform
