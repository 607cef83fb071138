// Lines of text laid out with Pango, in the desktop's usual font. One point is one unit of a Cairo context.
//
// Laying text out costs several times what drawing it does, so each thread keeps what it has laid out last.
#pragma once

#include <pango/pangocairo.h>

#include "platform/Drawing.h"

namespace platform {

// The text as one line; nil for a font of a size that is not drawn. Belongs to the calling thread, until its
// next call.
PangoLayout* layoutOf(const AttributedString& text);

}  // namespace platform
