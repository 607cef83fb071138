#include "apps/media-reader/MediaFile.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <new>
#include <string>

namespace reader {

namespace {

constexpr int bufferBytes = 64 * 1024;
constexpr int mostStreams = 64;

// Movies and sound as cameras, phones and editing programs write them. Formats that are text, refer to other
// files or are single pictures are left out: whatever they hold is no movie file.
constexpr const char* formats =
    "mov,matroska,avi,mpeg,mpegts,mpegvideo,dv,flv,live_flv,ogg,asf,mxf,gxf,rm,nut,"
    "mp3,aac,ac3,eac3,wav,w64,aiff,caf,flac,amr,au,ape,wv,tta";

void check(int result) {
    if (result >= 0)
        return;
    if (result == AVERROR(EINVAL) || result == AVERROR_INVALIDDATA)
        throw MediaError("no movie or sound that can be read");
    char text[AV_ERROR_MAX_STRING_SIZE] = {};
    throw MediaError(av_make_error_string(text, sizeof text, result));
}

int refuseToOpen(AVFormatContext*, AVIOContext**, const char*, int, AVDictionary**) {
    return AVERROR(EPERM);
}

}  // namespace

void MediaFile::CloseIO::operator()(AVIOContext* io) const {
    av_freep(&io->buffer);
    avio_context_free(&io);
}

void MediaFile::CloseFormat::operator()(AVFormatContext* format) const {
    avformat_close_input(&format);
}

MediaFile::MediaFile(int descriptor, std::uint64_t size, std::uint64_t readLimit)
    : descriptor_(descriptor), size_(static_cast<std::int64_t>(size)), allowance_(readLimit) {
    if (size_ < 0)
        throw MediaError("no plain file");
    makeContext();
    open();
}

void MediaFile::makeContext() {
    auto* buffer = static_cast<unsigned char*>(av_malloc(bufferBytes));
    io_.reset(buffer ? avio_alloc_context(buffer, bufferBytes, 0, this, readPacket, nullptr, seek) : nullptr);
    format_.reset(avformat_alloc_context());
    if (!io_ || !format_)
        throw std::bad_alloc();
    format_->pb = io_.get();
    format_->flags |= AVFMT_FLAG_CUSTOM_IO;
    format_->io_open = refuseToOpen;
    format_->max_streams = mostStreams;
    format_->format_whitelist = av_strdup(formats);
}

void MediaFile::open() {
    AVFormatContext* format = format_.release();
    const int result = avformat_open_input(&format, nullptr, nullptr, nullptr);  // frees it on failure
    format_.reset(format);
    check(result);
    if (format_->probe_score < AVPROBE_SCORE_RETRY)
        throw MediaError("no movie or sound that can be recognised");
    check(avformat_find_stream_info(format_.get(), nullptr));
}

int MediaFile::readPacket(void* file, std::uint8_t* buffer, int size) {
    return static_cast<MediaFile*>(file)->read(buffer, size);
}

std::int64_t MediaFile::seek(void* file, std::int64_t offset, int whence) {
    return static_cast<MediaFile*>(file)->moveTo(offset, whence);
}

int MediaFile::read(std::uint8_t* buffer, int size) {
    const auto wanted = std::min<std::uint64_t>(static_cast<std::uint64_t>(size), allowance_);
    if (wanted == 0)
        return AVERROR(EFBIG);
    const ssize_t got = pread(descriptor_, buffer, wanted, position_);
    if (got < 0)
        return AVERROR(errno);
    if (got == 0)
        return AVERROR_EOF;
    position_ += got;
    allowance_ -= static_cast<std::uint64_t>(got);
    return static_cast<int>(got);
}

std::int64_t MediaFile::moveTo(std::int64_t offset, int whence) {
    if (whence == AVSEEK_SIZE)
        return size_;
    const std::int64_t base = whence == SEEK_CUR ? position_ : whence == SEEK_END ? size_ : 0;
    std::int64_t target;
    if (__builtin_add_overflow(base, offset, &target) || target < 0)
        return AVERROR(EINVAL);
    return position_ = target;
}

}  // namespace reader
