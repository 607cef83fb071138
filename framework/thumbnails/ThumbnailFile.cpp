#include "framework/thumbnails/ThumbnailFile.h"

#include <gdk-pixbuf/gdk-pixbuf.h>

#include <charconv>
#include <memory>
#include <string_view>

namespace vexo {

namespace {

constexpr const char* uriKey = "tEXt::Thumb::URI";
constexpr const char* timeKey = "tEXt::Thumb::MTime";
constexpr const char* sizeKey = "tEXt::Thumb::Size";
constexpr const char* softwareKey = "tEXt::Software";

struct Release {
    void operator()(GdkPixbuf* pixbuf) const { g_object_unref(pixbuf); }
    void operator()(GdkPixbufLoader* loader) const { g_object_unref(loader); }
    void operator()(gchar* bytes) const { g_free(bytes); }
};
using Pixbuf = std::unique_ptr<GdkPixbuf, Release>;
using Loader = std::unique_ptr<GdkPixbufLoader, Release>;

// --- Encoding ----------------------------------------------------------------------------------------------

// A pixbuf has straight colours in the order red, green, blue, alpha.
void putPixel(guchar* to, std::uint32_t premultiplied) {
    const std::uint32_t alpha = premultiplied >> 24;
    const auto straight = [alpha](std::uint32_t colour) {
        return static_cast<guchar>(alpha == 0 ? 0 : std::min(255u, (colour * 255 + alpha / 2) / alpha));
    };
    to[0] = straight(premultiplied >> 16 & 0xff);
    to[1] = straight(premultiplied >> 8 & 0xff);
    to[2] = straight(premultiplied & 0xff);
    to[3] = static_cast<guchar>(alpha);
}

Pixbuf pixbufOf(const platform::Bitmap& picture) {
    Pixbuf pixbuf(gdk_pixbuf_new(GDK_COLORSPACE_RGB, /*has_alpha=*/TRUE, 8, picture.width, picture.height));
    if (!pixbuf)
        return nullptr;
    const int rowBytes = gdk_pixbuf_get_rowstride(pixbuf.get());
    guchar* row = gdk_pixbuf_get_pixels(pixbuf.get());
    auto pixel = picture.pixels.begin();
    for (int y = 0; y < picture.height; ++y, row += rowBytes)
        for (int x = 0; x < picture.width; ++x)
            putPixel(row + 4 * x, *pixel++);
    return pixbuf;
}

// --- Decoding ----------------------------------------------------------------------------------------------

// The loader takes one that breaks off, and shows what it has.
bool isWhole(std::span<const std::byte> png) {
    static constexpr std::string_view lastChunk{"\0\0\0\0IEND\xae\x42\x60\x82", 12};
    const std::string_view text(reinterpret_cast<const char*>(png.data()), png.size());
    return text.ends_with(lastChunk);
}

// The size in a header is known before anything is decoded to it.
void refuseLargerOnes(GdkPixbufLoader* loader, int width, int height, gpointer longestSide) {
    if (std::max(width, height) > *static_cast<const int*>(longestSide))
        gdk_pixbuf_loader_set_size(loader, 0, 0);  // makes the loader decode nothing
}

Loader loaded(std::span<const std::byte> png, int longestSide) {
    Loader loader(gdk_pixbuf_loader_new_with_type("png", nullptr));
    if (!loader)
        return nullptr;
    g_signal_connect(loader.get(), "size-prepared", G_CALLBACK(refuseLargerOnes), &longestSide);
    const bool written = gdk_pixbuf_loader_write(loader.get(), reinterpret_cast<const guchar*>(png.data()),
                                                 png.size(), nullptr);
    const bool closed = gdk_pixbuf_loader_close(loader.get(), nullptr);
    return written && closed ? std::move(loader) : nullptr;
}

std::string_view valueOf(GdkPixbuf* pixbuf, const char* key) {
    const gchar* value = gdk_pixbuf_get_option(pixbuf, key);
    return value ? value : "";
}

// Some programs write a fraction of the second as well.
bool isTime(std::string_view text, std::int64_t time) {
    std::int64_t seconds = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), seconds);
    return error == std::errc() && seconds == time && (end == text.data() + text.size() || *end == '.');
}

bool shows(GdkPixbuf* pixbuf, const ThumbnailSubject& subject) {
    return valueOf(pixbuf, uriKey) == subject.uri &&
           isTime(valueOf(pixbuf, timeKey), subject.modificationTime);
}

std::uint32_t premultiplied(const guchar* pixel, bool hasAlpha) {
    const std::uint32_t alpha = hasAlpha ? pixel[3] : 255;
    const auto scaled = [alpha](std::uint32_t colour) { return (colour * alpha + 127) / 255; };
    return alpha << 24 | scaled(pixel[0]) << 16 | scaled(pixel[1]) << 8 | scaled(pixel[2]);
}

platform::Bitmap bitmapOf(GdkPixbuf* pixbuf) {
    const int width = gdk_pixbuf_get_width(pixbuf);
    const int height = gdk_pixbuf_get_height(pixbuf);
    const int channels = gdk_pixbuf_get_n_channels(pixbuf);
    const bool hasAlpha = gdk_pixbuf_get_has_alpha(pixbuf);
    platform::Bitmap bitmap{width, height, {}};
    bitmap.pixels.reserve(std::size_t(width) * std::size_t(height));
    const guchar* row = gdk_pixbuf_read_pixels(pixbuf);
    for (int y = 0; y < height; ++y, row += gdk_pixbuf_get_rowstride(pixbuf))
        for (int x = 0; x < width; ++x)
            bitmap.pixels.push_back(premultiplied(row + channels * x, hasAlpha));
    return bitmap;
}

}  // namespace

std::vector<std::byte> encodedThumbnail(const ThumbnailSubject& subject, const platform::Bitmap& picture) {
    const Pixbuf pixbuf = pixbufOf(picture);
    const std::string time = std::to_string(subject.modificationTime);
    const std::string size = std::to_string(subject.size);
    gchar* buffer = nullptr;
    gsize length = 0;
    if (!pixbuf || !gdk_pixbuf_save_to_buffer(pixbuf.get(), &buffer, &length, "png", nullptr, uriKey,
                                              subject.uri.c_str(), timeKey, time.c_str(), sizeKey,
                                              size.c_str(), softwareKey, "Vexo", nullptr))
        return {};
    const std::unique_ptr<gchar, Release> owned(buffer);
    const auto* bytes = reinterpret_cast<const std::byte*>(buffer);
    return {bytes, bytes + length};
}

std::optional<platform::Bitmap> decodedThumbnail(std::span<const std::byte> png,
                                                 const ThumbnailSubject& subject, int longestSide) {
    const Loader loader = isWhole(png) ? loaded(png, longestSide) : nullptr;
    GdkPixbuf* pixbuf = loader ? gdk_pixbuf_loader_get_pixbuf(loader.get()) : nullptr;
    if (!pixbuf || !shows(pixbuf, subject))
        return std::nullopt;
    return bitmapOf(pixbuf);
}

}  // namespace vexo
