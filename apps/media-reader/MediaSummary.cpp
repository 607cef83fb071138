#include "apps/media-reader/MediaSummary.h"

#include <algorithm>
#include <string_view>

#include "apps/media-reader/Tracks.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavutil/parseutils.h>
}

namespace reader {

namespace {

// The tracks of a program stream are woven into one another and count as one.
bool isProgramStream(const AVFormatContext& format) {
    return format.iformat->name == std::string_view("mpeg");
}

std::vector<std::string> mediaTypesOf(const AVFormatContext& format) {
    const bool video = firstTrack(format, isVideo) != nullptr;
    const bool sound = firstTrack(format, isSound) != nullptr;
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
    for (const AVStream* stream : tracksOf(format)) {
        if (!isVideo(*stream) && !isSound(*stream))
            continue;
        const std::string name = avcodec_get_name(stream->codecpar->codec_id);
        if (std::find(codecs.begin(), codecs.end(), name) == codecs.end())
            codecs.push_back(name);
    }
    return codecs;
}

void setPixelSize(vexo::MediaProperties& properties, const AVStream& video) {
    int width = video.codecpar->width;
    int height = video.codecpar->height;
    if (width <= 0 || height <= 0)
        return;
    if (quarterTurnsOf(video) % 2 != 0)
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
    if (const AVStream* video = firstTrack(format, isVideo))
        setPixelSize(properties, *video);
    return properties;
}

}  // namespace reader
