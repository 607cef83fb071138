// Reads movies for a host that started it: one file after another, each by a descriptor that the host sends,
// until the host closes the channel. Runs confined, because the files may be anybody's.
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <exception>

#include "apps/media-reader/Channel.h"
#include "apps/media-reader/Confinement.h"
#include "apps/media-reader/FramePicture.h"
#include "apps/media-reader/MediaFile.h"
#include "apps/media-reader/MediaSummary.h"
#include "apps/media-reader/SharedPixels.h"

extern "C" {
#include <libavutil/log.h>
#include <libavutil/mem.h>
}

namespace {

constexpr std::size_t largestAllocation = 256u << 20;

vexo::FrameSize drawnFrame(const reader::Job& job, reader::MediaFile& file, int longestSide) {
    const reader::SharedPixels memory(job.memory, longestSide);
    return reader::drawFrame(reader::representativeFrame(file), longestSide, memory.pixels());
}

vexo::ReaderFindings findingsFor(const reader::Job& job) {
    reader::renewProcessorTime();
    try {
        reader::MediaFile file(job.file.number(), job.request.fileSize, job.request.readLimit);
        if (const auto longestSide = job.request.longestSide)
            return drawnFrame(job, file, *longestSide);
        return reader::summaryOf(file);
    } catch (const std::exception& error) {
        return vexo::MediaFailure{error.what()};
    }
}

// What one request asks for; false when the host has gone. The file is closed before the host hears of it.
bool readNext() {
    std::string reply;
    if (const auto job = reader::Channel::receive())
        reply = vexo::encodeReply({job->request.number, findingsFor(*job)});
    return !reply.empty() && reader::Channel::send(reply);
}

// A date in a movie that names no time zone is in universal time.
void takeDatesAsUniversal() {
    setenv("TZ", "UTC0", /*overwrite=*/1);
    tzset();
}

int refuse(const char* reason) {
    std::fprintf(stderr, "vexo-media-reader: %s\n", reason);
    return 2;
}

}  // namespace

int main() {
    if (!reader::Channel::isOpen())
        return refuse("is started by programs that show movies, not by hand");
    reader::Channel::endWithHost();
    takeDatesAsUniversal();
    av_log_set_level(AV_LOG_QUIET);
    av_max_alloc(largestAllocation);
    const auto confinement = reader::confine();
    if (!confinement)
        return refuse("cannot limit itself, so it reads nothing");

    reader::Channel::send(vexo::encodeGreeting(*confinement));
    while (readNext()) {
    }
    return 0;
}
