#include "platform/linux/drawing/CairoPicture.h"

#include <librsvg/rsvg.h>

#include <array>
#include <cstring>
#include <new>
#include <utility>

#include "platform/BigEndian.h"
#include "platform/ThreadSafety.h"
#include "platform/linux/drawing/CairoCanvas.h"
#include "platform/linux/drawing/VectorCheck.h"

namespace platform {

namespace {

using Bytes = std::span<const std::byte>;

struct Free {
    void operator()(RsvgHandle* handle) const { g_object_unref(handle); }
};
using Handle = std::unique_ptr<RsvgHandle, Free>;

// Draws the bitmap on an area of its own size. Cairo counts the users of a surface's pixels without a lock,
// so each call has a surface of its own. Without padding the edges of an enlarged bitmap fade out.
bool paintBitmap(cairo_t* context, const Bitmap& bitmap) {
    const CairoSurface surface = surfaceOf(bitmap);
    cairo_set_source_surface(context, surface.get(), 0, 0);
    cairo_pattern_set_extend(cairo_get_source(context), CAIRO_EXTEND_PAD);
    cairo_paint(context);
    return true;
}

// The last few renderings of a picture. Drawing an icon from its shapes costs a thousand times what copying
// its pixels does, and lists draw one icon at one size again and again.
class Renderings {
  public:
    std::optional<Bitmap> find(int width, int height) const VX_EXCLUDES(mutex_) {
        Locked lock(mutex_);
        for (const Bitmap& bitmap : bitmaps_) {
            if (bitmap.width == width && bitmap.height == height)
                return bitmap;
        }
        return std::nullopt;
    }
    void keep(const Bitmap& bitmap) VX_EXCLUDES(mutex_) {
        if (bitmap.pixels.size() > mostPixels)
            return;
        Locked lock(mutex_);
        bitmaps_[next_++ % bitmaps_.size()] = bitmap;
    }

  private:
    static constexpr std::size_t mostPixels = 128 * 128;

    mutable Mutex mutex_;
    std::array<Bitmap, 4> bitmaps_ VX_GUARDED_BY(mutex_);
    std::size_t next_ VX_GUARDED_BY(mutex_) = 0;
};

constexpr std::array<unsigned char, 8> pngSignature{0x89, 'P', 'N', 'G', '\r', '\n', 0x1a, '\n'};

bool isPNG(Bytes data) {
    return data.size() >= pngSignature.size() && std::memcmp(data.data(), pngSignature.data(), 8) == 0;
}

// Whether the header declares a size that may be decoded. It stands at a fixed place in every PNG.
bool declaresAllowedSize(Bytes png) {
    constexpr std::size_t widthOffset = 16, heightOffset = 20, headerEnd = 24;
    return png.size() >= headerEnd &&
           isDrawableSize(bigEndian(png.subspan(widthOffset, 4)), bigEndian(png.subspan(heightOffset, 4)));
}

cairo_status_t takeBytes(void* closure, unsigned char* buffer, unsigned int count) {
    Bytes& rest = *static_cast<Bytes*>(closure);
    if (count > rest.size())
        return CAIRO_STATUS_READ_ERROR;
    std::memcpy(buffer, rest.data(), count);
    rest = rest.subspan(count);
    return CAIRO_STATUS_SUCCESS;
}

std::optional<Bitmap> decodedPNG(Bytes data) {
    if (!declaresAllowedSize(data))
        return std::nullopt;
    const CairoSurface surface(cairo_image_surface_create_from_png_stream(takeBytes, &data));
    if (cairo_surface_status(surface.get()) != CAIRO_STATUS_SUCCESS)
        return std::nullopt;
    const int width = cairo_image_surface_get_width(surface.get());
    const int height = cairo_image_surface_get_height(surface.get());
    return paint(width, height, {double(width), double(height)}, [&](cairo_t* context) {
        cairo_set_source_surface(context, surface.get(), 0, 0);
        cairo_paint(context);
        return true;
    });
}

Handle parsedSVG(Bytes data) {
    if (data.empty() || !isHarmlessVector(data))
        return nullptr;
    // Data without a base location can load no other file.
    Handle handle(
        rsvg_handle_new_from_data(reinterpret_cast<const guint8*>(data.data()), data.size(), nullptr));
    if (handle)
        rsvg_handle_set_dpi(handle.get(), 96);  // 96 CSS pixels are an inch
    return handle;
}

// From width and height, else from the view box. A point is a CSS pixel.
Size sizeOf(RsvgHandle& handle) {
    Size size;
    if (rsvg_handle_get_intrinsic_size_in_pixels(&handle, &size.width, &size.height))
        return size;
    gboolean hasViewBox = FALSE;
    RsvgRectangle viewBox{};
    rsvg_handle_get_intrinsic_dimensions(&handle, nullptr, nullptr, nullptr, nullptr, &hasViewBox, &viewBox);
    return hasViewBox ? Size{viewBox.width, viewBox.height} : Size{};
}

class VectorPicture final : public Picture {
  public:
    VectorPicture(Handle handle, Size size) : handle_(std::move(handle)), size_(size) {}

    Size naturalSize() const override { return size_; }
    bool isDrawable() const override { return true; }
    std::optional<Bitmap> draw(int width, int height) const override {
        if (auto kept = renderings_.find(width, height))
            return kept;
        auto bitmap = paint(width, height, size_, [this](cairo_t* context) { return render(context); });
        if (bitmap)
            renderings_.keep(*bitmap);
        return bitmap;
    }

  private:
    // Even drawing changes the state of a handle. Drawing may take long, so nobody else waits for it.
    bool render(cairo_t* context) const VX_EXCLUDES(drawing_) {
        const RsvgRectangle area{0, 0, size_.width, size_.height};
        Locked lock(drawing_);
        return rsvg_handle_render_document(handle_.get(), context, &area, nullptr);
    }

    const Handle handle_;
    const Size size_;
    mutable Mutex drawing_;
    mutable Renderings renderings_;
};

cairo_status_t appendBytes(void* closure, const unsigned char* buffer, unsigned int count) try {
    auto& bytes = *static_cast<std::vector<std::byte>*>(closure);
    const auto* first = reinterpret_cast<const std::byte*>(buffer);
    bytes.insert(bytes.end(), first, first + count);
    return CAIRO_STATUS_SUCCESS;
} catch (const std::bad_alloc&) {
    return CAIRO_STATUS_NO_MEMORY;  // no exception may pass through Cairo
}

}  // namespace

bool layOver(Bitmap& bitmap, const Bitmap& drawn) {
    return paintOver(bitmap, {double(drawn.width), double(drawn.height)},
                     [&](cairo_t* context) { return paintBitmap(context, drawn); });
}

std::optional<Bitmap> scaled(const Bitmap& bitmap, int width, int height) {
    return paint(width, height, {double(bitmap.width), double(bitmap.height)},
                 [&](cairo_t* context) { return paintBitmap(context, bitmap); });
}

std::shared_ptr<const Picture> newDataPicture(Bytes data) {
    if (isPNG(data)) {
        auto bitmap = decodedPNG(data);
        return bitmap ? pictureWithBitmap(*std::move(bitmap)) : nullptr;
    }
    Handle handle = parsedSVG(data);
    const Size size = handle ? sizeOf(*handle) : Size{};
    if (!isDrawableSize(size.width, size.height))
        return nullptr;
    return std::make_shared<VectorPicture>(std::move(handle), size);
}

std::vector<std::byte> encodedPNG(const Bitmap& bitmap) {
    std::vector<std::byte> bytes;
    const CairoSurface surface = surfaceOf(bitmap);
    if (cairo_surface_write_to_png_stream(surface.get(), appendBytes, &bytes) != CAIRO_STATUS_SUCCESS)
        bytes.clear();
    return bytes;
}

}  // namespace platform
