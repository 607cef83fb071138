#include "apps/media-reader/MediaSummary.h"

#include <algorithm>
#include <cmath>
#include <span>
#include <string_view>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavutil/display.h>
#include <libavutil/parseutils.h>
}

namespace reader {

namespace {

std::span<AVStream* const> streamsOf(const AVFormatContext& format) {
    return {format.streams, format.nb_streams};
}

// A cover picture in a sound file is no video.
bool isVideo(const AVStream& stream) {
    return stream.codecpar->codec_type == AVMEDIA_TYPE_VIDEO &&
           !(stream.disposition & (AV_DISPOSITION_ATTACHED_PIC | AV_DISPOSITION_TIMED_THUMBNAILS));
}

bool isSound(const AVStream& stream) {
    return stream.codecpar->codec_type == AVMEDIA_TYPE_AUDIO;
}

const AVStream* firstVideo(const AVFormatContext& format) {
    for (const AVStream* stream : streamsOf(format))
        if (isVideo(*stream))
            return stream;
    return nullptr;
}

bool hasSound(const AVFormatContext& format) {
    const auto streams = streamsOf(format);
    return std::any_of(streams.begin(), streams.end(),
                       [](const AVStream* stream) { return isSound(*stream); });
}

// The tracks of a program stream are woven into one another and count as one.
bool isProgramStream(const AVFormatContext& format) {
    return format.iformat->name == std::string_view("mpeg");
}

std::vector<std::string> mediaTypesOf(const AVFormatContext& format) {
    const bool video = firstVideo(format) != nullptr;
    const bool sound = hasSound(format);
    if (!video && !sound)
        throw MediaError("neither picture nor sound in it");
    if (isProgramStream(format) && video)
        return {"MPEG1 Muxed"};
    std::vector<std::string> types;
    if (video)
        types.push_back("Video");
    if (sound)
        types.push_back("Sound");
    return types;
}

std::vector<std::string> codecsOf(const AVFormatContext& format) {
    std::vector<std::string> codecs;
    for (const AVStream* stream : streamsOf(format)) {
        if (!isVideo(*stream) && !isSound(*stream))
            continue;
        const std::string name = avcodec_get_name(stream->codecpar->codec_id);
        if (std::find(codecs.begin(), codecs.end(), name) == codecs.end())
            codecs.push_back(name);
    }
    return codecs;
}

// Whether the picture is shown lying on its side.
bool isTurned(const AVStream& stream) {
    std::size_t size = 0;
    const std::uint8_t* matrix = av_stream_get_side_data(&stream, AV_PKT_DATA_DISPLAYMATRIX, &size);
    if (!matrix || size < 9 * sizeof(std::int32_t))
        return false;
    const double degrees = av_display_rotation_get(reinterpret_cast<const std::int32_t*>(matrix));
    return std::isfinite(degrees) && std::lround(degrees / 90) % 2 != 0;
}

void setPixelSize(vexo::MediaProperties& properties, const AVStream& video) {
    int width = video.codecpar->width;
    int height = video.codecpar->height;
    if (width <= 0 || height <= 0)
        return;
    if (isTurned(video))
        std::swap(width, height);
    properties.pixelWidth = width;
    properties.pixelHeight = height;
}

std::optional<double> durationOf(const AVFormatContext& format) {
    if (format.duration == AV_NOPTS_VALUE || format.duration <= 0)
        return std::nullopt;
    return static_cast<double>(format.duration) / AV_TIME_BASE;
}

std::optional<double> creationDateOf(const AVFormatContext& format) {
    const AVDictionaryEntry* entry = av_dict_get(format.metadata, "creation_time", nullptr, 0);
    std::int64_t microseconds = 0;
    if (!entry || av_parse_time(&microseconds, entry->value, /*duration=*/0) < 0)
        return std::nullopt;
    return static_cast<double>(microseconds) / AV_TIME_BASE;
}

}  // namespace

vexo::MediaProperties summaryOf(const MediaFile& file) {
    const AVFormatContext& format = file.format();
    vexo::MediaProperties properties;
    properties.mediaTypes = mediaTypesOf(format);
    properties.codecs = codecsOf(format);
    properties.durationSeconds = durationOf(format);
    properties.contentCreationDate = creationDateOf(format);
    if (const AVStream* video = firstVideo(format))
        setPixelSize(properties, *video);
    return properties;
}

}  // namespace reader
