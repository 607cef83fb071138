#include "apps/media-reader/FrameDecoder.h"

#include "apps/media-reader/Tracks.h"

namespace reader {

namespace {

// Frames as large as cameras make them (8192 x 4608) fit into the memory that the reader has.
constexpr std::int64_t mostPixels = std::int64_t{8192} * 4608;

void readOnly(AVStream& wanted, const AVFormatContext& format) {
    for (AVStream* track : tracksOf(format))
        track->discard = track == &wanted ? AVDISCARD_DEFAULT : AVDISCARD_ALL;
}

Owned<AVCodecContext> decoderOf(const AVStream& track) {
    const AVCodec* codec = avcodec_find_decoder(track.codecpar->codec_id);
    if (!codec)
        throw MediaError("the picture has a format that cannot be decoded");
    auto decoder = owned(avcodec_alloc_context3(codec));
    if (avcodec_parameters_to_context(decoder.get(), track.codecpar) < 0)
        throw std::bad_alloc();
    decoder->pkt_timebase = track.time_base;
    decoder->thread_count = 1;
    decoder->max_pixels = mostPixels;
    if (avcodec_open2(decoder.get(), codec, nullptr) < 0)
        throw MediaError("the picture cannot be decoded");
    return decoder;
}

}  // namespace

FrameDecoder::FrameDecoder(MediaFile& file, AVStream& track, Deadline deadline)
    : format_(file.format()),
      track_(track),
      deadline_(deadline),
      decoder_(decoderOf(track)),
      packet_(owned(av_packet_alloc())),
      frame_(owned(av_frame_alloc())),
      upcoming_(owned(av_frame_alloc())) {
    readOnly(track, format_);
}

void FrameDecoder::seek(std::int64_t time) {
    av_seek_frame(&format_, track_.index, time, AVSEEK_FLAG_BACKWARD);
    avcodec_flush_buffers(decoder_.get());
}

void FrameDecoder::restart() {
    av_seek_frame(&format_, track_.index, 0, AVSEEK_FLAG_BYTE);
    avcodec_flush_buffers(decoder_.get());
}

const AVFrame* FrameDecoder::next() {
    while (!isOver()) {
        const int result = avcodec_receive_frame(decoder_.get(), upcoming_.get());
        if (result == 0) {
            frame_.swap(upcoming_);
            return frame_.get();
        }
        if (result == AVERROR_EOF)
            return nullptr;
        feed();
    }
    return nullptr;
}

// A damaged packet costs its frame, not the movie. At the end of the file the decoder is told to give out
// what it still holds.
void FrameDecoder::feed() {
    const bool isAtEnd = !readPacket();
    avcodec_send_packet(decoder_.get(), isAtEnd ? nullptr : packet_.get());
    av_packet_unref(packet_.get());
}

bool FrameDecoder::readPacket() {
    while (!isOver() && av_read_frame(&format_, packet_.get()) >= 0) {
        if (packet_->stream_index == track_.index)
            return true;
        av_packet_unref(packet_.get());
    }
    return false;
}

}  // namespace reader
