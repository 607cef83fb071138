// What an opened media file says, as the host wants to know it.
#pragma once

#include "apps/media-reader/MediaFile.h"
#include "framework/metadata/MediaProperties.h"

namespace reader {

// Raises MediaError when the file has neither picture nor sound.
vexo::MediaProperties summaryOf(const MediaFile& file);

}  // namespace reader
