#include "apps/sample-movie/TestCard.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <numbers>

namespace sample {

namespace {

// Steps by the golden angle never come close to a hue that was just used.
constexpr double hueStep = 2.399963;
constexpr double saturation = 56;

std::uint8_t level(double value) {
    return static_cast<std::uint8_t>(std::clamp(std::lround(value), 16l, 235l));
}

void fill(std::uint8_t* row, int width, double value) {
    std::fill_n(row, width, level(value));
}

void drawGradient(AVFrame& frame) {
    for (int y = 0; y < frame.height; ++y)
        fill(frame.data[0] + y * frame.linesize[0], frame.width, 70 + 90.0 * y / frame.height);
}

void drawHue(AVFrame& frame, int tint) {
    const double angle = std::fmod(tint * hueStep, 2 * std::numbers::pi);
    const int width = (frame.width + 1) / 2;
    for (int y = 0; y < (frame.height + 1) / 2; ++y) {
        fill(frame.data[1] + y * frame.linesize[1], width, 128 + saturation * std::cos(angle));
        fill(frame.data[2] + y * frame.linesize[2], width, 128 + saturation * std::sin(angle));
    }
}

void drawDisc(AVFrame& frame, double moment) {
    const double radius = std::min(frame.width, frame.height) / 6.0;
    const double centerX = radius + moment * (frame.width - 2 * radius);
    const double centerY = frame.height / 2.0;
    for (int y = static_cast<int>(centerY - radius); y <= centerY + radius && y < frame.height; ++y) {
        const double half = std::sqrt(std::max(0.0, radius * radius - (y - centerY) * (y - centerY)));
        const int left = std::max(0, static_cast<int>(centerX - half));
        const int right = std::min(frame.width, static_cast<int>(centerX + half));
        fill(frame.data[0] + y * frame.linesize[0] + left, std::max(0, right - left), 225);
    }
}

}  // namespace

void drawTestCard(AVFrame& frame, int tint, double moment) {
    drawGradient(frame);
    drawHue(frame, tint);
    drawDisc(frame, moment);
}

}  // namespace sample
