// What the tests of the media reader share: the real program, and questions to a reader.
#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "framework/metadata/MediaReader.h"
#include "platform/linux/FileDescriptor.h"
#include "tests/support/FileContent.h"
#include "tests/support/TemporaryFolder.h"

namespace vexo {

using testing_support::contentOf;

inline const std::string realProgram = VEXO_BIN_DIR "/vexo-media-reader";

inline MediaReaderAnswer answerFor(MediaReader& reader, const std::string& path) {
    const platform::FileDescriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    return reader.read(file.number());
}

inline MediaFrameAnswer frameAnswerFor(MediaReader& reader, const std::string& path, int longestSide) {
    const platform::FileDescriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    return reader.frame(file.number(), longestSide);
}

// What an answer holds besides a failure, which fails the test.
template <typename Wanted>
Wanted wantedIn(const std::variant<Wanted, MediaFailure>& answer, const std::string& path) {
    if (const auto* failure = std::get_if<MediaFailure>(&answer)) {
        ADD_FAILURE() << path << ": " << failure->reason;
        return {};
    }
    return std::get<Wanted>(answer);
}

template <typename Unwanted>
MediaFailure failureIn(const std::variant<Unwanted, MediaFailure>& answer, const std::string& path) {
    const auto* failure = std::get_if<MediaFailure>(&answer);
    EXPECT_TRUE(failure) << path << " was read";
    return failure ? *failure : MediaFailure{};
}

inline MediaProperties propertiesFor(MediaReader& reader, const std::string& path) {
    return wantedIn(answerFor(reader, path), path);
}

inline platform::Bitmap frameFor(MediaReader& reader, const std::string& path, int longestSide) {
    return wantedIn(frameAnswerFor(reader, path, longestSide), path);
}

inline bool hasChildProcess() {
    return waitpid(-1, nullptr, WNOHANG) != -1 || errno != ECHILD;
}

// Whether none is left. One that was killed may need a moment to go on a busy machine.
inline bool childProcessesEnd() {
    for (int i = 0; i < 1000 && hasChildProcess(); ++i)
        usleep(10'000);
    return !hasChildProcess();
}

class RealMediaReader : public testing::Test {
  protected:
    testing_support::TemporaryFolder folder_;
    ProcessMediaReader reader_{{realProgram}};
};

}  // namespace vexo
