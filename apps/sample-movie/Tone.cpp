#include "apps/sample-movie/Tone.h"

#include <cmath>
#include <numbers>

extern "C" {
#include <libavutil/samplefmt.h>
}

namespace sample {

namespace {

constexpr double hertz = 220;
constexpr double loudness = 0.05;

void put(std::uint8_t* sample, AVSampleFormat format, double value) {
    if (av_get_packed_sample_fmt(format) == AV_SAMPLE_FMT_FLT)
        *reinterpret_cast<float*>(sample) = static_cast<float>(value);
    else
        *reinterpret_cast<std::int16_t*>(sample) = static_cast<std::int16_t>(value * 32767);
}

}  // namespace

// One channel: packed and planar are then the same.
void fillTone(AVFrame& frame, std::int64_t firstSample) {
    const auto format = static_cast<AVSampleFormat>(frame.format);
    const int bytes = av_get_bytes_per_sample(format);
    for (int i = 0; i < frame.nb_samples; ++i) {
        const double seconds = static_cast<double>(firstSample + i) / frame.sample_rate;
        const double value = loudness * std::sin(2 * std::numbers::pi * hertz * seconds);
        put(frame.data[0] + i * bytes, format, value);
    }
}

}  // namespace sample
