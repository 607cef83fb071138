// A thumbnail as the desktop's programs exchange them: a PNG that says which file it shows and in which
// state.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "platform/Image.h"

namespace vexo {

// The file that a thumbnail shows. Programs agree on the URI and compare the time in whole seconds.
struct ThumbnailSubject {
    std::string uri;
    std::int64_t modificationTime = 0;  // seconds from 1970
    std::uint64_t size = 0;             // bytes
};

// The PNG of a picture with the keys "Thumb::URI", "Thumb::MTime", "Thumb::Size" and "Software". Empty when
// it can't be encoded.
std::vector<std::byte> encodedThumbnail(const ThumbnailSubject& subject, const platform::Bitmap& picture);

// The picture in a PNG; nil unless the PNG is whole, of at most `longestSide` pixels a side, and of the
// subject in its present state. Anybody may have written the bytes.
std::optional<platform::Bitmap> decodedThumbnail(std::span<const std::byte> png,
                                                 const ThumbnailSubject& subject, int longestSide);

}  // namespace vexo
