// What the host draws over thumbnails: a small dark badge in the lower right corner with the duration of the
// movie. Callable from any thread.
#pragma once

#include "platform/Image.h"

namespace vexo {

// An image of `size` points with the badge for a movie of `duration` seconds. nil where the duration is not
// known, which is what a duration of zero means, and where the badge would cover much of the thumbnail.
platform::ImageRef durationBadge(double duration, platform::Size size);

}  // namespace vexo
