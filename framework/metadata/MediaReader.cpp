#include "framework/metadata/MediaReader.h"

#include "framework/metadata/ReaderMessage.h"
#include "framework/metadata/ReaderProcess.h"

namespace vexo {

namespace {

// Headers and indexes of even hours of film are far smaller.
constexpr std::uint64_t readLimit = 256u << 20;

}  // namespace

ProcessMediaReader::ProcessMediaReader(Settings settings) : settings_(std::move(settings)) {}
ProcessMediaReader::~ProcessMediaReader() = default;

MediaReaderAnswer ProcessMediaReader::read(int descriptor) {
    platform::Locked lock(mutex_);
    for (int attempt = 0; attempt < 2; ++attempt) {
        if (!ensureStarted())
            return MediaFailure{"cannot start " + settings_.program, FailureCause::elsewhere};
        if (const auto answer = exchange(descriptor))
            return *answer;
        process_.reset();
    }
    return MediaFailure{"the media reader ended over the file"};
}

MediaFrameAnswer ProcessMediaReader::frame(int, int) {
    return MediaFailure{"frames cannot be read yet", FailureCause::elsewhere};
}

bool ProcessMediaReader::ensureStarted() {
    if (process_)
        return true;
    if (Clock::now() < earliestStart_)
        return false;
    process_ = ReaderProcess::start(settings_.program);
    std::string greeting;
    const bool greeted = process_ &&
                         process_->receive(greeting, Clock::now() + settings_.startDeadline) ==
                             ReaderProcess::Reception::message &&
                         isGreeting(greeting);
    if (greeted)
        return true;
    process_.reset();
    earliestStart_ = Clock::now() + settings_.pauseAfterFailedStart;
    return false;
}

std::optional<MediaReaderAnswer> ProcessMediaReader::exchange(int descriptor) {
    const std::uint64_t number = ++lastRequest_;
    if (!process_->send(encodeRequest({number, readLimit}), descriptor))
        return std::nullopt;
    std::string message;
    switch (process_->receive(message, Clock::now() + settings_.deadline)) {
        case ReaderProcess::Reception::ended:
            return std::nullopt;
        case ReaderProcess::Reception::late:
            return dismissed("the media reader took too long over the file");
        case ReaderProcess::Reception::message:
            break;
    }
    const auto reply = decodeReply(message);
    if (!reply || reply->number != number)
        return dismissed("the media reader's answer makes no sense");
    return reply->answer;
}

// A reader that hangs or talks nonsense is not asked again.
MediaReaderAnswer ProcessMediaReader::dismissed(std::string reason) {
    process_.reset();
    return MediaFailure{std::move(reason)};
}

}  // namespace vexo
