#include "framework/metadata/MediaReader.h"
#include "framework/metadata/MediaLimits.h"

#include <sys/stat.h>

#include <algorithm>
#include <array>

#include "framework/metadata/FrameMemory.h"
#include "framework/metadata/ReaderHelper.h"
#include "framework/metadata/ReaderProcess.h"
#include "platform/linux/Uninterrupted.h"

namespace vexo {

namespace {

// Headers and indexes of even hours of film are far smaller.
constexpr std::uint64_t readLimit = 256u << 20;

// nil for what is no plain file.
std::optional<ReaderRequest> requestAbout(int descriptor) {
    struct stat status;
    if (platform::uninterrupted([&] { return fstat(descriptor, &status); }) != 0 || !S_ISREG(status.st_mode))
        return std::nullopt;
    return ReaderRequest{.fileSize = static_cast<std::uint64_t>(status.st_size), .readLimit = readLimit};
}

MediaFailure noPlainFile() {
    return {"it is no plain file", FailureCause::elsewhere};
}

}  // namespace

ProcessMediaReader::ProcessMediaReader(Settings settings)
    : settings_(std::move(settings)), helper_(std::make_shared<ReaderHelper>(settings_)) {}

ProcessMediaReader::~ProcessMediaReader() {
    close();
}

MediaReaderAnswer ProcessMediaReader::read(int descriptor) {
    const auto request = requestAbout(descriptor);
    if (!request)
        return noPlainFile();
    ReaderFindings findings = ask(*request, std::array{descriptor});
    if (auto* properties = std::get_if<MediaProperties>(&findings))
        return std::move(*properties);
    return std::get<MediaFailure>(findings);
}

MediaFrameAnswer ProcessMediaReader::frame(int descriptor, int longestSide) {
    auto request = requestAbout(descriptor);
    if (!request)
        return noPlainFile();
    request->longestSide = std::clamp(longestSide, 1, largestFrameSide);
    const FrameMemory memory(*request->longestSide);
    if (!memory)
        return MediaFailure{"there is no memory for a frame", FailureCause::elsewhere};
    const ReaderFindings findings = ask(*request, std::array{descriptor, memory.descriptor()});
    if (const auto* size = std::get_if<FrameSize>(&findings))
        return memory.frame(*size);
    return std::get<MediaFailure>(findings);
}

std::optional<std::vector<std::string>> ProcessMediaReader::confinement() {
    platform::Locked lock(turn_);
    if (!helper_->take())
        return std::nullopt;
    auto confinement = helper_->confinement();
    helper_->putBack();
    return confinement;
}

void ProcessMediaReader::close() {
    helper_->close();
}

int ProcessMediaReader::startedHelpers() const {
    return helper_->startedProcesses();
}

ReaderFindings ProcessMediaReader::ask(ReaderRequest request, std::span<const int> descriptors) {
    platform::Locked lock(turn_);
    for (int attempt = 0; attempt < 2; ++attempt) {
        const std::shared_ptr<ReaderProcess> process = helper_->take();
        if (!process)
            return notStarted();
        request.number = ++lastRequest_;
        if (auto findings = exchange(*process, request, descriptors)) {
            helper_->putBack();
            return std::move(*findings);
        }
        helper_->discard();
    }
    if (helper_->isClosed())
        return notStarted();
    return MediaFailure{"the media reader ended over the file"};
}

std::optional<ReaderFindings> ProcessMediaReader::exchange(ReaderProcess& process,
                                                           const ReaderRequest& request,
                                                           std::span<const int> descriptors) {
    if (!process.send(encodeRequest(request), descriptors))
        return std::nullopt;
    std::string message;
    switch (process.receive(message, std::chrono::steady_clock::now() + settings_.deadline)) {
        case ReaderProcess::Reception::ended:
            return std::nullopt;
        case ReaderProcess::Reception::late:
            return dismissed("the media reader took too long over the file");
        case ReaderProcess::Reception::message:
            break;
    }
    auto reply = decodeReply(message);
    if (!reply || !isReplyTo(request, *reply))
        return dismissed("the media reader's answer makes no sense");
    return std::move(reply->findings);
}

// A reader that hangs or talks nonsense is not asked again.
ReaderFindings ProcessMediaReader::dismissed(std::string reason) {
    helper_->discard();
    return MediaFailure{std::move(reason)};
}

MediaFailure ProcessMediaReader::notStarted() const {
    return {helper_->isClosed() ? "stopped" : "cannot start " + settings_.program, FailureCause::elsewhere};
}

}  // namespace vexo
