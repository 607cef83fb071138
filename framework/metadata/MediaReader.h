// Reads what is inside media files. Callable from any thread.
//
// MediaReader is the seam; ProcessMediaReader has the reading done by a helper process, so that a file that
// crashes or hangs a decoder harms nothing but itself.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "framework/metadata/MediaProperties.h"
#include "framework/metadata/ReaderMessage.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class ReaderHelper;
class ReaderProcess;

class MediaReader {
  public:
    virtual ~MediaReader() = default;

    // What the file behind `descriptor` says. The descriptor stays the caller's; it is open for reading on a
    // plain file, and its position may be anywhere.
    virtual MediaReaderAnswer read(int descriptor) = 0;

    // A representative picture of the movie behind `descriptor`, upright and in its shown proportions,
    // opaque, scaled down to at most `longestSide` pixels a side. The descriptor is as above.
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
        // Runs a block once, on any thread, after the time for which an idle helper is kept; nil keeps it.
        // The block may outlive the reader. Called by the threads that read and by such blocks, with at most
        // one block waiting at a time; not for a reader that is closed.
        std::function<void(std::function<void()>)> afterIdleTime = {};
        // Hears each time why no helper could be started, on the thread that reads, and nothing once the
        // reader is closed; nil for nobody.
        std::function<void(const std::string& problem)> warn = {};
    };

    explicit ProcessMediaReader(Settings settings);
    ~ProcessMediaReader() override;

    // Waits for the files that other threads have read before this one.
    MediaReaderAnswer read(int descriptor) override VX_EXCLUDES(turn_);
    // A longest side beyond largestFrameSide counts as that.
    MediaFrameAnswer frame(int descriptor, int longestSide) override VX_EXCLUDES(turn_);

    // What the helper has given up so that a file that takes it over gains little, such as "seccomp"; starts
    // a helper when none runs. nil when none can be started.
    std::optional<std::vector<std::string>> confinement() VX_EXCLUDES(turn_);

    // Ends the helper at once, for good; whoever is waiting for it, and whoever asks later, gets a failure
    // that lies elsewhere.
    void close();

    // How many helpers were started so far.
    int startedHelpers() const;

  private:
    ReaderFindings ask(ReaderRequest request, std::span<const int> descriptors) VX_EXCLUDES(turn_);
    // nil when the helper ended without an answer.
    std::optional<ReaderFindings> exchange(ReaderProcess& process, const ReaderRequest& request,
                                           std::span<const int> descriptors) VX_REQUIRES(turn_);
    ReaderFindings dismissed(std::string reason) VX_REQUIRES(turn_);
    MediaFailure notStarted() const;

    const Settings settings_;
    const std::shared_ptr<ReaderHelper> helper_;

    platform::Mutex turn_;  // held as long as the helper is at work, and while it is started
    std::uint64_t lastRequest_ VX_GUARDED_BY(turn_) = 0;
};

// The helper's program: what VEXO_MEDIA_READER names, else "vexo-media-reader" beside the running program,
// else in the installed folder of programs. The path need not exist.
std::string mediaReaderProgram();

}  // namespace vexo
