#include "apps/media-reader/MediaSummary.h"

#include <algorithm>
#include <string>
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

void setPicture(vexo::MediaProperties& properties, const AVStream& video) {
    if (video.avg_frame_rate.num > 0 && video.avg_frame_rate.den > 0)
        properties.frameRate = av_q2d(video.avg_frame_rate);
    int width = video.codecpar->width;
    int height = video.codecpar->height;
    if (width <= 0 || height <= 0)
        return;
    if (quarterTurnsOf(video) % 2 != 0)
        std::swap(width, height);
    properties.pixelWidth = width;
    properties.pixelHeight = height;
}

// nil for what the file leaves open.
template <typename Number>
std::optional<Number> known(Number number) {
    return number > 0 ? std::optional(number) : std::nullopt;
}

void setSound(vexo::MediaProperties& properties, const AVStream& sound) {
    properties.audioChannelCount = known(sound.codecpar->ch_layout.nb_channels);
    properties.audioSampleRate = known(sound.codecpar->sample_rate);
}

std::optional<double> durationOf(const AVFormatContext& format) {
    if (format.duration == AV_NOPTS_VALUE || format.duration <= 0)
        return std::nullopt;
    return static_cast<double>(format.duration) / AV_TIME_BASE;
}

const AVDictionaryEntry* entryOf(const AVFormatContext& format, const char* key) {
    return av_dict_get(format.metadata, key, nullptr, 0);
}

std::optional<double> creationDateOf(const AVFormatContext& format) {
    const AVDictionaryEntry* entry = entryOf(format, "creation_time");
    std::int64_t microseconds = 0;
    if (!entry || av_parse_time(&microseconds, entry->value, /*duration=*/0) < 0)
        return std::nullopt;
    return static_cast<double>(microseconds) / AV_TIME_BASE;
}

std::optional<std::string> textOf(const AVDictionaryEntry* entry) {
    return entry && *entry->value ? std::optional<std::string>(entry->value) : std::nullopt;
}

// What the camera calls `name`. The newer keys of the QuickTime family are domain names the wrong way round,
// with the name at the end.
std::optional<std::string> cameraText(const AVFormatContext& format, const std::string& name) {
    if (auto text = textOf(entryOf(format, name.c_str())))
        return text;
    const AVDictionaryEntry* entry = nullptr;
    while ((entry = av_dict_get(format.metadata, "com.", entry, AV_DICT_IGNORE_SUFFIX)))
        if (std::string_view(entry->key).ends_with("." + name))
            return textOf(entry);
    return std::nullopt;
}

}  // namespace

vexo::MediaProperties summaryOf(const MediaFile& file) {
    const AVFormatContext& format = file.format();
    vexo::MediaProperties properties;
    properties.mediaTypes = mediaTypesOf(format);
    properties.codecs = codecsOf(format);
    properties.durationSeconds = durationOf(format);
    properties.contentCreationDate = creationDateOf(format);
    properties.totalBitRate = known(format.bit_rate);
    properties.title = textOf(entryOf(format, "title"));
    properties.acquisitionMake = cameraText(format, "make");
    properties.acquisitionModel = cameraText(format, "model");
    if (const AVStream* video = firstTrack(format, isVideo))
        setPicture(properties, *video);
    if (const AVStream* sound = firstTrack(format, isSound))
        setSound(properties, *sound);
    return properties;
}

}  // namespace reader
