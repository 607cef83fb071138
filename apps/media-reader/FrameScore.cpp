#include "apps/media-reader/FrameScore.h"

#include <algorithm>
#include <cmath>

#include "apps/media-reader/MediaFile.h"

namespace reader {

namespace {

constexpr int side = 32;
constexpr double darkest = 32;  // of 255, on average
constexpr double brightest = 224;
constexpr double flattest = 14;  // standard deviation

struct Brightness {
    double mean = 0;
    double deviation = 0;
};

Brightness brightnessOf(const AVFrame& grey) {
    double sum = 0;
    double squares = 0;
    for (int y = 0; y < side; ++y) {
        const std::uint8_t* row = grey.data[0] + y * grey.linesize[0];
        std::for_each(row, row + side, [&](double level) {
            sum += level;
            squares += level * level;
        });
    }
    const double mean = sum / (side * side);
    return {mean, std::sqrt(std::max(0.0, squares / (side * side) - mean * mean))};
}

// Of two flat pictures the one that is not black is better.
FrameScore scoreFor(const Brightness& brightness) {
    const double distance = std::min(brightness.mean, 255 - brightness.mean);
    return {.value = brightness.deviation + distance / 16,
            .isGood = brightness.mean >= darkest && brightness.mean <= brightest &&
                      brightness.deviation >= flattest};
}

}  // namespace

FrameJudge::FrameJudge() : grey_(owned(av_frame_alloc())) {
    grey_->format = AV_PIX_FMT_GRAY8;
    grey_->width = side;
    grey_->height = side;
    if (av_frame_get_buffer(grey_.get(), 0) < 0)
        throw std::bad_alloc();
}

FrameScore FrameJudge::scoreOf(const AVFrame& frame) {
    // The size and format of frames may change in the middle of a movie.
    scaler_.reset(sws_getCachedContext(scaler_.release(), frame.width, frame.height,
                                       static_cast<AVPixelFormat>(frame.format), side, side, AV_PIX_FMT_GRAY8,
                                       SWS_POINT, nullptr, nullptr, nullptr));
    if (!scaler_ || sws_scale(scaler_.get(), frame.data, frame.linesize, 0, frame.height, grey_->data,
                              grey_->linesize) != side)
        throw MediaError("the picture cannot be scaled");
    return scoreFor(brightnessOf(*grey_));
}

}  // namespace reader
