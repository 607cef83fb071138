// A look at the text of an SVG before librsvg gets it, which reads more than a picture of shapes needs.
#pragma once

#include <cstddef>
#include <span>

namespace platform {

// Whether an SVG may be drawn. Refused is what isn't XML in UTF-8, because a rule about a text holds only for
// an encoding that everybody reads alike; what declares entities, whose text librsvg never frees and which
// may stand for a multiple of itself; what embeds other files, which would be unpacked to any size by
// whatever decoders are installed; and what is larger, or has more elements or words, than an icon that could
// be seen. How long the drawing takes is not known before.
bool isHarmlessVector(std::span<const std::byte> data);

}  // namespace platform
