// The reader program at its channel.
#include <gmock/gmock.h>

#include <array>

#include "framework/metadata/ReaderProcess.h"
#include "tests/framework/RunningReader.h"

using testing_support::ScopedEnvironment;

namespace vexo {
namespace {

const std::string clip = VEXO_SAMPLES_DIR "/movies/clip.mov";

TEST(MediaReaderProgram, EndsWhenItsHostGoes) {
    RunningReader program;
    ASSERT_TRUE(decodeGreeting(program.receive()));
    program.closeChannel();
    EXPECT_EQ(program.exitStatus(), 0);
}

TEST(MediaReaderProgram, EndsWhenItsHostTalksNonsense) {
    RunningReader program;
    ASSERT_TRUE(decodeGreeting(program.receive()));
    program.send("nonsense");
    EXPECT_EQ(program.receive(), "");
    EXPECT_EQ(program.exitStatus(), 0);
}

TEST(MediaReaderProgram, ARequestWithoutAFileFails) {
    const RunningReader program;
    ASSERT_TRUE(decodeGreeting(program.receive()));
    program.send(encodeRequest({1, 1000, 1000}));
    const auto reply = decodeReply(program.receive());
    ASSERT_TRUE(reply);
    EXPECT_TRUE(std::holds_alternative<MediaFailure>(reply->findings));
}

TEST(MediaReaderProgram, ARequestForAFrameWithoutMemoryFails) {
    const auto program = ReaderProcess::start(realProgram);
    std::string message;
    const auto receive = [&] {
        return program->receive(message, std::chrono::steady_clock::now() + std::chrono::seconds(30));
    };
    ASSERT_EQ(receive(), ReaderProcess::Reception::message);
    const platform::FileDescriptor movie(open(clip.c_str(), O_RDONLY | O_CLOEXEC));
    ASSERT_TRUE(
        program->send(encodeRequest({1, contentOf(clip).size(), 10000, 256}), std::array{movie.number()}));
    ASSERT_EQ(receive(), ReaderProcess::Reception::message);
    EXPECT_EQ(decodeReply(message), (ReaderReply{1, MediaFailure{"there is no memory for a frame"}}));
}

TEST(MediaReaderProgram, IsFoundBesideTheProgramUnlessAnotherIsNamed) {
    {
        const ScopedEnvironment unset("VEXO_MEDIA_READER", nullptr);
        EXPECT_EQ(mediaReaderProgram(), realProgram);
    }
    const ScopedEnvironment set("VEXO_MEDIA_READER", "/elsewhere/reader");
    EXPECT_EQ(mediaReaderProgram(), "/elsewhere/reader");
}

}  // namespace
}  // namespace vexo
