#include "apps/sample-movie/MovieWriter.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>
#include <memory>
#include <stdexcept>

#include "apps/sample-movie/MemoryFile.h"
#include "apps/sample-movie/TestCard.h"
#include "apps/sample-movie/Tone.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libavutil/channel_layout.h>
#include <libavutil/display.h>
#include <libavutil/opt.h>
}

namespace sample {

namespace {

constexpr int soundRate = 44100;
constexpr int soundBits = 32000;
constexpr int samplesPerPacket = 1024;  // where the codec leaves the choice
constexpr int videoQuality = 6;         // 1 is best, 31 smallest

int check(int result, const char* step) {
    if (result >= 0)
        return result;
    char text[AV_ERROR_MAX_STRING_SIZE] = {};
    throw std::runtime_error(
        fmt::format("cannot {}: {}", step, av_make_error_string(text, sizeof text, result)));
}

template <typename Type>
Type* existing(Type* object, const char* step) {
    if (!object)
        throw std::runtime_error(fmt::format("cannot {}", step));
    return object;
}

struct Free {
    void operator()(AVFormatContext* context) const { avformat_free_context(context); }
    void operator()(AVCodecContext* context) const { avcodec_free_context(&context); }
    void operator()(AVFrame* frame) const { av_frame_free(&frame); }
    void operator()(AVPacket* packet) const { av_packet_free(&packet); }
};
template <typename Type>
using Owned = std::unique_ptr<Type, Free>;

// One track and its encoder.
class Track {
  public:
    Track(AVFormatContext& file, AVCodecID codecID) : file_(file) {
        codec_ = existing(avcodec_find_encoder(codecID), "find the encoder");
        encoder_.reset(existing(avcodec_alloc_context3(codec_), "make the encoder"));
        stream_ = existing(avformat_new_stream(&file, nullptr), "add a track");
        frame_.reset(existing(av_frame_alloc(), "allocate memory"));
        packet_.reset(existing(av_packet_alloc(), "allocate memory"));
        encoder_->flags |= AV_CODEC_FLAG_BITEXACT;
        encoder_->thread_count = 1;
        if (file.oformat->flags & AVFMT_GLOBALHEADER)
            encoder_->flags |= AV_CODEC_FLAG_GLOBAL_HEADER;
    }
    virtual ~Track() = default;

    // Seconds from the beginning of what is to be written next.
    double position() const { return static_cast<double>(next_) * av_q2d(encoder_->time_base); }
    // Writes the next frame; false when the track has its length.
    virtual bool writeNext() = 0;
    void finish() { encode(nullptr); }

  protected:
    void open() {
        check(avcodec_open2(encoder_.get(), codec_, nullptr), "start the encoder");
        check(avcodec_parameters_from_context(stream_->codecpar, encoder_.get()), "describe a track");
        stream_->time_base = encoder_->time_base;
    }

    // nil for the end of the track.
    void encode(AVFrame* frame) {
        check(avcodec_send_frame(encoder_.get(), frame), "encode");
        for (;;) {
            const int result = avcodec_receive_packet(encoder_.get(), packet_.get());
            if (result == AVERROR(EAGAIN) || result == AVERROR_EOF)
                return;
            check(result, "encode");
            writePacket();
        }
    }

    AVFormatContext& file_;
    const AVCodec* codec_;
    Owned<AVCodecContext> encoder_;
    AVStream* stream_;  // the file's
    Owned<AVFrame> frame_;
    Owned<AVPacket> packet_;
    std::int64_t next_ = 0;  // in units of the encoder's time base

  private:
    void writePacket() {
        if (packet_->duration == 0 && encoder_->codec_type == AVMEDIA_TYPE_VIDEO)
            packet_->duration = 1;
        av_packet_rescale_ts(packet_.get(), encoder_->time_base, stream_->time_base);
        packet_->stream_index = stream_->index;
        check(av_interleaved_write_frame(&file_, packet_.get()), "write");
    }
};

class VideoTrack final : public Track {
  public:
    VideoTrack(AVFormatContext& file, const Movie& movie)
        : Track(file, movie.format->videoCodec),
          tint_(movie.tint),
          frames_(std::max<std::int64_t>(1, std::llround(movie.seconds * movie.framesPerSecond))) {
        encoder_->width = movie.width;
        encoder_->height = movie.height;
        encoder_->pix_fmt = AV_PIX_FMT_YUV420P;
        encoder_->time_base = {1, movie.framesPerSecond};
        encoder_->framerate = {movie.framesPerSecond, 1};
        encoder_->gop_size = 12;
        encoder_->flags |= AV_CODEC_FLAG_QSCALE;
        encoder_->global_quality = FF_QP2LAMBDA * videoQuality;
        stream_->avg_frame_rate = encoder_->framerate;
        if (codec_->id == AV_CODEC_ID_VP8)
            av_opt_set(encoder_->priv_data, "deadline", "realtime", 0);
        open();
        if (movie.clockwiseRotation != 0)
            setRotation(movie.clockwiseRotation);
        frame_->format = encoder_->pix_fmt;
        frame_->width = movie.width;
        frame_->height = movie.height;
        check(av_frame_get_buffer(frame_.get(), 0), "allocate memory");
    }

    bool writeNext() override {
        if (next_ == frames_)
            return false;
        check(av_frame_make_writable(frame_.get()), "allocate memory");
        drawTestCard(*frame_, tint_, frames_ > 1 ? static_cast<double>(next_) / (frames_ - 1) : 0.5);
        frame_->pts = next_++;
        frame_->quality = encoder_->global_quality;
        encode(frame_.get());
        return true;
    }

  private:
    void setRotation(int clockwise) {
        constexpr std::size_t size = 9 * sizeof(std::int32_t);
        auto* matrix =
            existing(av_stream_new_side_data(stream_, AV_PKT_DATA_DISPLAYMATRIX, size), "turn the picture");
        av_display_rotation_set(reinterpret_cast<std::int32_t*>(matrix), clockwise);
    }

    const int tint_;
    const std::int64_t frames_;
};

class SoundTrack final : public Track {
  public:
    SoundTrack(AVFormatContext& file, const Movie& movie)
        : Track(file, movie.format->soundCodec), samples_(std::llround(movie.seconds * soundRate)) {
        encoder_->sample_rate = soundRate;
        encoder_->bit_rate = soundBits;
        encoder_->sample_fmt = codec_->sample_fmts[0];
        encoder_->time_base = {1, soundRate};
        av_channel_layout_default(&encoder_->ch_layout, 1);
        open();
    }

    bool writeNext() override {
        const int perPacket = encoder_->frame_size > 0 ? encoder_->frame_size : samplesPerPacket;
        const auto count = static_cast<int>(std::min<std::int64_t>(perPacket, samples_ - next_));
        if (count <= 0)
            return false;
        prepareFrame(count);
        fillTone(*frame_, next_);
        frame_->pts = next_;
        next_ += count;
        encode(frame_.get());
        return true;
    }

  private:
    void prepareFrame(int count) {
        av_frame_unref(frame_.get());
        frame_->format = encoder_->sample_fmt;
        frame_->sample_rate = soundRate;
        frame_->nb_samples = count;
        check(av_channel_layout_copy(&frame_->ch_layout, &encoder_->ch_layout), "allocate memory");
        check(av_frame_get_buffer(frame_.get(), 0), "allocate memory");
    }

    const std::int64_t samples_;
};

// Writes the tracks side by side, always the one that is behind.
void writeTracks(const std::vector<std::unique_ptr<Track>>& tracks) {
    auto unfinished = tracks.size();
    std::vector<bool> done(tracks.size(), false);
    while (unfinished > 0) {
        std::size_t behind = tracks.size();
        for (std::size_t i = 0; i < tracks.size(); ++i)
            if (!done[i] && (behind == tracks.size() || tracks[i]->position() < tracks[behind]->position()))
                behind = i;
        if (tracks[behind]->writeNext())
            continue;
        tracks[behind]->finish();
        done[behind] = true;
        --unfinished;
    }
}

Owned<AVFormatContext> newFile(const Movie& movie, AVIOContext* io) {
    AVFormatContext* context = nullptr;
    check(avformat_alloc_output_context2(&context, nullptr, movie.format->container, nullptr),
          "make the container");
    Owned<AVFormatContext> file(context);
    file->pb = io;
    file->flags |= AVFMT_FLAG_CUSTOM_IO | AVFMT_FLAG_BITEXACT;
    if (movie.creationTime)
        av_dict_set(&file->metadata, "creation_time", movie.creationTime->c_str(), 0);
    return file;
}

}  // namespace

std::vector<std::byte> encodedMovie(const Movie& movie) {
    MemoryFile memory;
    const Owned<AVFormatContext> file = newFile(movie, memory.io());
    std::vector<std::unique_ptr<Track>> tracks;
    if (movie.hasVideo)
        tracks.push_back(std::make_unique<VideoTrack>(*file, movie));
    if (movie.hasSound)
        tracks.push_back(std::make_unique<SoundTrack>(*file, movie));
    check(avformat_write_header(file.get(), nullptr), "begin the file");
    writeTracks(tracks);
    check(av_write_trailer(file.get()), "finish the file");
    avio_flush(memory.io());
    return memory.content();
}

}  // namespace sample
