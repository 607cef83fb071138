#include "apps/media-reader/FrameChoice.h"

#include <optional>
#include <vector>

#include "apps/media-reader/FrameDecoder.h"
#include "apps/media-reader/FrameScore.h"
#include "apps/media-reader/Tracks.h"

namespace reader {

namespace {

// Where to look, in percent of the duration: past the opening titles first, at the very beginning last.
constexpr int places[] = {10, 25, 50, 75, 0};
// Key frames are seldom further apart.
constexpr int mostFramesToAPlace = 250;
constexpr int framesBetweenPlaces = 10;  // in a movie that does not tell its duration
// Leaves the host, which waits no longer than some seconds, time for everything else.
constexpr std::chrono::milliseconds timeToLook{2000};

// A time in the track's own units; nil for some frames further on.
using Place = std::optional<std::int64_t>;

// nil when nobody knows.
std::optional<std::int64_t> durationOf(const AVFormatContext& format, const AVStream& track) {
    if (track.duration != AV_NOPTS_VALUE && track.duration > 0)
        return track.duration;
    if (format.duration == AV_NOPTS_VALUE || format.duration <= 0)
        return std::nullopt;
    return av_rescale_q(format.duration, av_get_time_base_q(), track.time_base);
}

std::int64_t beginningOf(const AVStream& track) {
    return track.start_time == AV_NOPTS_VALUE ? 0 : track.start_time;
}

Place placeIn(const AVStream& track, const std::optional<std::int64_t>& duration, int percent) {
    std::int64_t place;
    if (!duration || __builtin_add_overflow(beginningOf(track), av_rescale(*duration, percent, 100), &place))
        return std::nullopt;
    return place;
}

// Damage in a file shows in its frames, and there may be better ones.
bool isWhole(const AVFrame& frame) {
    return frame.decode_error_flags == 0 && !(frame.flags & AV_FRAME_FLAG_CORRUPT);
}

class Choice {
  public:
    Choice(MediaFile& file, AVStream& track)
        : decoder_(file, track, std::chrono::steady_clock::now() + timeToLook),
          best_(owned(av_frame_alloc())) {}

    // Whether the next frame is a good one.
    bool lookAtNext() { return consider(decoder_.next()); }

    // Whether there is a good one at the place. The key frame before it will do as well, so that few frames
    // need to be decoded.
    bool lookAt(const Place& place) {
        if (place)
            decoder_.seek(*place);
        return lookAtNext() || consider(frameAt(place));
    }

    // A stream that is sought by its bytes may be too short for that and yet have frames.
    void lookAtBeginningIfNothingWasSeen() {
        if (hasSeenAny())
            return;
        decoder_.restart();
        lookAt(std::nullopt);
    }

    Owned<AVFrame> take() {
        if (!hasSeenAny())
            throw MediaError("no picture in it can be decoded");
        return std::move(best_);
    }

  private:
    bool hasSeenAny() const { return best_->buf[0] != nullptr; }

    // The first frame that is shown at the place or later, or the last before it that could be had.
    const AVFrame* frameAt(const Place& place) {
        const int most = place ? mostFramesToAPlace : framesBetweenPlaces;
        const AVFrame* reached = nullptr;
        for (int count = 0; count < most && !isAt(reached, place); ++count) {
            const AVFrame* next = decoder_.next();
            if (!next)
                break;
            reached = next;
        }
        return reached;
    }

    static bool isAt(const AVFrame* frame, const Place& place) {
        return frame && place && frame->best_effort_timestamp != AV_NOPTS_VALUE &&
               frame->best_effort_timestamp >= *place;
    }

    // Whether the frame is a good one; nil is none.
    bool consider(const AVFrame* frame) {
        if (!frame)
            return false;
        const FrameScore score = judge_.scoreOf(*frame);
        const bool isGood = score.isGood && isWhole(*frame);
        if (isGood || score.value > bestScore_)
            keep(*frame, score.value);
        return isGood;
    }

    void keep(const AVFrame& frame, double score) {
        av_frame_unref(best_.get());
        if (av_frame_ref(best_.get(), &frame) < 0)
            throw std::bad_alloc();
        bestScore_ = score;
    }

    FrameDecoder decoder_;
    FrameJudge judge_;
    Owned<AVFrame> best_;
    double bestScore_ = -1;
};

void lookAround(Choice& choice, const AVFormatContext& format, const AVStream& track) {
    const auto duration = durationOf(format, track);
    for (const int percent : places)
        if (choice.lookAt(placeIn(track, duration, percent)))
            return;
    choice.lookAtBeginningIfNothingWasSeen();
}

AVStream& pictureTrack(const AVFormatContext& format) {
    for (const auto isWanted : {isVideo, isCoverPicture})
        if (AVStream* track = firstTrack(format, isWanted))
            return *track;
    throw MediaError("no picture in it");
}

}  // namespace

ChosenFrame representativeFrame(MediaFile& file) {
    AVStream& track = pictureTrack(file.format());
    Choice choice(file, track);
    if (isCoverPicture(track))
        choice.lookAtNext();
    else
        lookAround(choice, file.format(), track);
    return {&file.format(), &track, choice.take()};
}

}  // namespace reader
