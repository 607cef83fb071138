#include "apps/media-reader/FramePicture.h"

#include <algorithm>
#include <cmath>

#include "apps/media-reader/Tracks.h"

extern "C" {
#include <libavutil/pixdesc.h>
}

namespace reader {

namespace {

constexpr int highestStandardDefinition = 576;  // lines

// The width grows or shrinks with the shape of the pixels, as players have it.
double shownWidth(const ChosenFrame& chosen) {
    const AVFrame& frame = *chosen.frame;
    const AVRational aspect = av_guess_sample_aspect_ratio(chosen.format, chosen.track, chosen.frame.get());
    const bool isKnown = aspect.num > 0 && aspect.den > 0;
    return isKnown ? frame.width * av_q2d(aspect) : frame.width;
}

int pixelsFor(double length, int longestSide) {
    return static_cast<int>(std::lround(std::clamp<double>(length, 1, longestSide)));
}

// Before it is turned.
vexo::FrameSize scaledSize(double width, double height, int longestSide) {
    const double factor = std::min(1.0, longestSide / std::max(width, height));
    return {pixelsFor(width * factor, longestSide), pixelsFor(height * factor, longestSide)};
}

// Most movies of high definition that do not name their colours mean those of high definition.
int colorSpaceOf(const AVFrame& frame) {
    if (frame.colorspace != AVCOL_SPC_UNSPECIFIED)
        return frame.colorspace;
    return frame.height > highestStandardDefinition ? SWS_CS_ITU709 : SWS_CS_ITU601;
}

void setColors(SwsContext* scaler, const AVFrame& frame) {
    constexpr int unchanged = 1 << 16;
    sws_setColorspaceDetails(scaler, sws_getCoefficients(colorSpaceOf(frame)),
                             frame.color_range == AVCOL_RANGE_JPEG, sws_getCoefficients(SWS_CS_DEFAULT),
                             /*dstRange=*/1, /*brightness=*/0, /*contrast=*/unchanged,
                             /*saturation=*/unchanged);
}

Owned<AVFrame> emptyPicture(const vexo::FrameSize& size) {
    auto picture = owned(av_frame_alloc());
    picture->format = AV_PIX_FMT_RGB32;
    picture->width = size.width;
    picture->height = size.height;
    if (av_frame_get_buffer(picture.get(), 0) < 0)
        throw std::bad_alloc();
    return picture;
}

// Not the fast filter: that writes machine code, which the reader may not run.
Owned<AVFrame> scaled(const AVFrame& frame, const vexo::FrameSize& size) {
    auto picture = emptyPicture(size);
    const Owned<SwsContext> scaler(
        sws_getContext(frame.width, frame.height, static_cast<AVPixelFormat>(frame.format), size.width,
                       size.height, AV_PIX_FMT_RGB32, SWS_AREA, nullptr, nullptr, nullptr));
    if (!scaler)
        throw MediaError("the picture cannot be scaled");
    setColors(scaler.get(), frame);
    if (sws_scale(scaler.get(), frame.data, frame.linesize, 0, frame.height, picture->data,
                  picture->linesize) != size.height)
        throw MediaError("the picture cannot be scaled");
    return picture;
}

std::uint32_t pixelAt(const AVFrame& picture, int x, int y) {
    return reinterpret_cast<const std::uint32_t*>(picture.data[0] + y * picture.linesize[0])[x];
}

// The pixel that lies at (x, y) after so many quarter turns clockwise.
std::uint32_t turnedPixelAt(const AVFrame& picture, int quarterTurns, int x, int y) {
    const int right = picture.width - 1;
    const int bottom = picture.height - 1;
    switch (quarterTurns) {
        case 1:
            return pixelAt(picture, y, bottom - x);
        case 2:
            return pixelAt(picture, right - x, bottom - y);
        case 3:
            return pixelAt(picture, right - y, x);
        default:
            return pixelAt(picture, x, y);
    }
}

vexo::FrameSize turnedSize(const AVFrame& picture, int quarterTurns) {
    if (quarterTurns % 2 == 0)
        return {picture.width, picture.height};
    return {picture.height, picture.width};
}

}  // namespace

vexo::FrameSize drawFrame(const ChosenFrame& chosen, int longestSide, std::span<std::uint32_t> pixels) {
    const auto picture =
        scaled(*chosen.frame, scaledSize(shownWidth(chosen), chosen.frame->height, longestSide));
    const int quarterTurns = quarterTurnsOf(*chosen.track);
    const vexo::FrameSize size = turnedSize(*picture, quarterTurns);
    auto pixel = pixels.begin();
    for (int y = 0; y < size.height; ++y)
        for (int x = 0; x < size.width; ++x)
            *pixel++ = turnedPixelAt(*picture, quarterTurns, x, y);
    return size;
}

}  // namespace reader
