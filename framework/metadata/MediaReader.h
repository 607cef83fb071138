// Reads what is inside media files. Callable from any thread.
//
// MediaReader is the seam; ProcessMediaReader has the reading done by a helper process, so that a file that
// crashes or hangs a decoder harms nothing but itself.
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "framework/metadata/MediaProperties.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class ReaderProcess;

class MediaReader {
  public:
    virtual ~MediaReader() = default;

    // What the file behind `descriptor` says. The descriptor stays the caller's; it is open for reading on a
    // plain file, and its position may be anywhere.
    virtual MediaReaderAnswer read(int descriptor) = 0;

    // A representative picture of the movie behind `descriptor`, upright and in its shown proportions, scaled
    // down to at most `longestSide` pixels a side. The descriptor is as above.
    virtual MediaFrameAnswer frame(int descriptor, int longestSide) = 0;
};

// Starts the helper when a file is first to be read and keeps it for the next ones. It takes one file at a
// time.
//
// A helper that does not answer in time is killed and the file counts as unreadable. When it ends over a
// file, the file gets a second attempt by a new one, because it may have been ended from outside.
class ProcessMediaReader final : public MediaReader {
  public:
    struct Settings {
        std::string program;
        std::chrono::milliseconds deadline{5000};  // for one file
        std::chrono::milliseconds startDeadline{10000};
        // How long to do without after a helper could not be started, so that a broken installation does not
        // cost a start for each file.
        std::chrono::milliseconds pauseAfterFailedStart{10000};
    };

    explicit ProcessMediaReader(Settings settings);
    ~ProcessMediaReader() override;

    // Waits for the files that other threads have read before this one.
    MediaReaderAnswer read(int descriptor) override VX_EXCLUDES(mutex_);
    MediaFrameAnswer frame(int descriptor, int longestSide) override VX_EXCLUDES(mutex_);

  private:
    using Clock = std::chrono::steady_clock;

    bool ensureStarted() VX_REQUIRES(mutex_);
    // nil when the helper ended without an answer.
    std::optional<MediaReaderAnswer> exchange(int descriptor) VX_REQUIRES(mutex_);
    MediaReaderAnswer dismissed(std::string reason) VX_REQUIRES(mutex_);

    const Settings settings_;

    platform::Mutex mutex_;
    std::unique_ptr<ReaderProcess> process_ VX_GUARDED_BY(mutex_);
    std::uint64_t lastRequest_ VX_GUARDED_BY(mutex_) = 0;
    Clock::time_point earliestStart_ VX_GUARDED_BY(mutex_);
};

// The helper's program: what VEXO_MEDIA_READER names, else "vexo-media-reader" beside the running program,
// else in the installed folder of programs. The path need not exist.
std::string mediaReaderProgram();

}  // namespace vexo
