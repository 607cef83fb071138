// Pictures of data, drawn with Cairo: PNG by its own decoder, SVG by librsvg.
#include <librsvg/rsvg.h>

#include <array>
#include <cstring>
#include <mutex>
#include <new>
#include <utility>

#include "platform/ThreadSafety.h"
#include "platform/linux/CairoCanvas.h"
#include "platform/linux/VectorCheck.h"

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

class UndrawablePicture final : public Picture {
  public:
    Size naturalSize() const override { return {}; }
    bool isDrawable() const override { return false; }
    std::optional<Bitmap> draw(int, int) const override { return std::nullopt; }
};

class BitmapPicture final : public Picture {
  public:
    explicit BitmapPicture(Bitmap bitmap) : bitmap_(std::move(bitmap)) {}

    Size naturalSize() const override { return {double(bitmap_.width), double(bitmap_.height)}; }
    bool isDrawable() const override { return true; }
    std::optional<Bitmap> draw(int width, int height) const override {
        return paint(width, height, naturalSize(),
                     [this](cairo_t* context) { return paintBitmap(context, bitmap_); });
    }

  private:
    const Bitmap bitmap_;
};

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

std::uint32_t bigEndian(Bytes data, std::size_t offset) {
    std::uint32_t number = 0;
    for (std::byte byte : data.subspan(offset, 4))
        number = number << 8 | std::to_integer<std::uint32_t>(byte);
    return number;
}

// Whether the header declares a size that may be decoded. It stands at a fixed place in every PNG.
bool declaresAllowedSize(Bytes png) {
    constexpr std::size_t widthOffset = 16, heightOffset = 20, headerEnd = 24;
    return png.size() >= headerEnd &&
           isDrawableSize(bigEndian(png, widthOffset), bigEndian(png, heightOffset));
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

// An SVG, parsed when it is first needed: programs that only print names have icons and draw none.
class VectorPicture final : public Picture {
  public:
    explicit VectorPicture(Bytes data) : data_(data.begin(), data.end()) {}

    Size naturalSize() const override { return document().size; }
    bool isDrawable() const override { return naturalSize() != Size{}; }
    std::optional<Bitmap> draw(int width, int height) const override {
        if (auto kept = renderings_.find(width, height))
            return kept;
        const Size size = naturalSize();
        if (size == Size{})
            return std::nullopt;
        auto bitmap = paint(width, height, size, [&](cairo_t* context) { return render(context, size); });
        if (bitmap)
            renderings_.keep(*bitmap);
        return bitmap;
    }

  private:
    struct Document {
        Handle handle;
        Size size;  // nothing when it can't be drawn
    };

    const Document& document() const {
        std::call_once(isParsed_, [this] {
            document_ = parsed(data_);
            data_ = {};
        });
        return document_;
    }
    static Document parsed(const std::vector<std::byte>& data) {
        Handle handle = parsedSVG(data);
        const Size size = handle ? sizeOf(*handle) : Size{};
        if (!isDrawableSize(size.width, size.height))
            return {};
        return {std::move(handle), size};
    }
    // Even drawing changes the state of a handle. Drawing may take long, so nobody else waits for it.
    bool render(cairo_t* context, Size size) const VX_EXCLUDES(drawing_) {
        const RsvgRectangle area{0, 0, size.width, size.height};
        Locked lock(drawing_);
        return rsvg_handle_render_document(document().handle.get(), context, &area, nullptr);
    }

    mutable std::once_flag isParsed_;
    mutable std::vector<std::byte> data_;  // until it is parsed
    mutable Document document_;
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

bool Picture::drawOver(Bitmap& bitmap) const {
    const auto drawn = isWhole(bitmap) ? draw(bitmap.width, bitmap.height) : std::nullopt;
    if (!drawn || !isWhole(*drawn))
        return false;
    return paintOver(bitmap, {double(drawn->width), double(drawn->height)},
                     [&](cairo_t* context) { return paintBitmap(context, *drawn); });
}

std::shared_ptr<const Picture> pictureWithData(std::span<const std::byte> data) {
    if (isPNG(data)) {
        if (auto bitmap = decodedPNG(data))
            return std::make_shared<BitmapPicture>(*std::move(bitmap));
        return std::make_shared<UndrawablePicture>();
    }
    return std::make_shared<VectorPicture>(data);
}

std::shared_ptr<const Picture> pictureWithBitmap(Bitmap bitmap) {
    if (!isWhole(bitmap))
        return std::make_shared<UndrawablePicture>();
    return std::make_shared<BitmapPicture>(std::move(bitmap));
}

std::vector<std::byte> pngData(const Bitmap& bitmap) {
    std::vector<std::byte> bytes;
    if (!isWhole(bitmap))
        return bytes;
    const CairoSurface surface = surfaceOf(bitmap);
    if (cairo_surface_write_to_png_stream(surface.get(), appendBytes, &bytes) != CAIRO_STATUS_SUCCESS)
        bytes.clear();
    return bytes;
}

}  // namespace platform
