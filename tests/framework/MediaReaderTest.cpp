// The media reader as a host sees it: the real program on real movies, and a scripted one that misbehaves.
#include "framework/metadata/MediaReader.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <fstream>
#include <iterator>
#include <nlohmann/json.hpp>
#include <thread>

#include "framework/metadata/ReaderMessage.h"
#include "platform/linux/FileDescriptor.h"
#include "tests/support/SampleMovie.h"
#include "tests/support/TemporaryFolder.h"

using namespace std::chrono_literals;
using namespace testing_support;
using namespace vexo;
using testing::ElementsAre;
using testing::HasSubstr;

namespace {

const std::string realProgram = VEXO_BIN_DIR "/vexo-media-reader";

std::string contentOf(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

MediaReaderAnswer answerFor(MediaReader& reader, const std::string& path) {
    const platform::FileDescriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    return reader.read(file.number());
}

MediaProperties propertiesFor(MediaReader& reader, const std::string& path) {
    const MediaReaderAnswer answer = answerFor(reader, path);
    if (const auto* failure = std::get_if<MediaFailure>(&answer)) {
        ADD_FAILURE() << path << ": " << failure->reason;
        return {};
    }
    return std::get<MediaProperties>(answer);
}

MediaFailure failureFor(MediaReader& reader, const std::string& path) {
    const MediaReaderAnswer answer = answerFor(reader, path);
    const auto* failure = std::get_if<MediaFailure>(&answer);
    EXPECT_TRUE(failure) << path << " was read";
    return failure ? *failure : MediaFailure{};
}

// What FFmpeg's own program says; nil where it is not installed.
std::optional<nlohmann::json> probed(const std::string& path) {
    const std::string command =
        "ffprobe -v error -of json -show_format -show_streams '" + path + "' 2>/dev/null";
    std::unique_ptr<FILE, int (*)(FILE*)> output(popen(command.c_str(), "r"), pclose);
    std::string text;
    std::array<char, 4096> buffer;
    while (const std::size_t size = fread(buffer.data(), 1, buffer.size(), output.get()))
        text.append(buffer.data(), size);
    const auto json = nlohmann::json::parse(text, nullptr, false);
    return json.is_object() ? std::optional(json) : std::nullopt;
}

bool hasChildProcess() {
    return waitpid(-1, nullptr, WNOHANG) != -1 || errno != ECHILD;
}

class RealMediaReader : public testing::Test {
  protected:
    TemporaryFolder folder_;
    ProcessMediaReader reader_{{realProgram}};
};

}  // namespace

TEST_F(RealMediaReader, TellsTheSizeDurationTypesAndDateOfAMovie) {
    const std::string path = folder_.path("clip.mov");
    makeSampleMovie(path, {.size = "1920x1080", .seconds = 2, .creationTime = "2008-12-31T23:59:59Z"});

    const MediaProperties expected{{"Video", "Sound"}, 1920, 1080, 2.0, {"mpeg4", "aac"}, 1230767999.0};
    EXPECT_EQ(propertiesFor(reader_, path), expected);
}

TEST_F(RealMediaReader, AgreesWithFFprobeForEachFormat) {
    for (const char* format : {"mov", "mp4", "m4v", "3gp", "mkv", "webm", "avi", "mpg", "dv"}) {
        const std::string path = folder_.path(std::string("clip.") + format);
        makeSampleMovie(path, {.size = std::string(format) == "dv" ? "720x576" : "352x288"});
        const auto probe = probed(path);
        if (!probe)
            GTEST_SKIP() << "ffprobe is not installed";

        const MediaProperties properties = propertiesFor(reader_, path);
        const auto& video = probe->at("streams").at(0);
        EXPECT_EQ(properties.pixelWidth, video.at("width").get<int>()) << format;
        EXPECT_EQ(properties.pixelHeight, video.at("height").get<int>()) << format;
        EXPECT_EQ(properties.codecs.at(0), video.at("codec_name").get<std::string>()) << format;
        EXPECT_NEAR(properties.durationSeconds.value_or(0),
                    std::stod(probe->at("format").at("duration").get<std::string>()), 1e-5)
            << format;
    }
}

TEST_F(RealMediaReader, AMovieThatIsTurnedIsHigherThanWide) {
    const std::string path = folder_.path("upright.mp4");
    makeSampleMovie(path, {.size = "640x360", .rotation = 90});
    const MediaProperties properties = propertiesFor(reader_, path);
    EXPECT_EQ(properties.pixelWidth, 360);
    EXPECT_EQ(properties.pixelHeight, 640);
}

TEST_F(RealMediaReader, AMovieThatIsUpsideDownKeepsItsSize) {
    const std::string path = folder_.path("headstand.mp4");
    makeSampleMovie(path, {.size = "640x360", .rotation = 180});
    EXPECT_EQ(propertiesFor(reader_, path).pixelWidth, 640);
}

TEST_F(RealMediaReader, AProgramStreamIsMuxed) {
    const std::string path = folder_.path("clip.mpg");
    makeSampleMovie(path, {.size = "352x288"});
    EXPECT_THAT(propertiesFor(reader_, path).mediaTypes, ElementsAre("MPEG1 Muxed"));
}

TEST_F(RealMediaReader, SoundAloneHasNoSize) {
    const std::string path = folder_.path("sound.m4v");
    makeSampleMovie(path, {.hasVideo = false});
    const MediaProperties properties = propertiesFor(reader_, path);
    EXPECT_THAT(properties.mediaTypes, ElementsAre("Sound"));
    EXPECT_FALSE(properties.pixelWidth);
    EXPECT_NEAR(properties.durationSeconds.value_or(0), 1, 0.1);
}

TEST_F(RealMediaReader, TheNameDoesNotMatter) {
    const std::string path = folder_.path("no-extension");
    makeSampleMovie(path, {.format = "mkv"});
    EXPECT_THAT(propertiesFor(reader_, path).mediaTypes, ElementsAre("Video", "Sound"));
}

TEST_F(RealMediaReader, TextNamedLikeAMovieIsNone) {
    const std::string path = folder_.writeFile("text.mov", std::string(5000, 'a') + "\n");
    EXPECT_THAT(failureFor(reader_, path).reason, HasSubstr("no movie or sound"));
}

TEST_F(RealMediaReader, FilesThatReferToOthersAreNotFollowed) {
    const std::string movie = folder_.path("clip.mov");
    makeSampleMovie(movie);
    const std::string list = folder_.writeFile("list.mov", "ffconcat version 1.0\nfile '" + movie + "'\n");
    const std::string playlist = folder_.writeFile(
        "list.m3u8", "#EXTM3U\n#EXT-X-TARGETDURATION:1\n#EXTINF:1,\nfile://" + movie + "\n");
    EXPECT_THAT(failureFor(reader_, list).reason, HasSubstr("no movie or sound"));
    EXPECT_THAT(failureFor(reader_, playlist).reason, HasSubstr("no movie or sound"));
}

// Every prefix of a movie is a file that some camera or interrupted copy has left behind.
TEST_F(RealMediaReader, TruncatedMoviesAreAnswered) {
    for (const char* format : {"mov", "mkv", "avi", "mpg"}) {
        const std::string whole = folder_.path(std::string("whole.") + format);
        makeSampleMovie(whole, {.size = "160x120"});
        const std::string bytes = contentOf(whole);
        for (std::size_t size = 1; size < bytes.size(); size += 1 + bytes.size() / 40) {
            const std::string path = folder_.writeFile("part", std::string_view(bytes).substr(0, size));
            const MediaReaderAnswer answer = answerFor(reader_, path);
            const auto* failure = std::get_if<MediaFailure>(&answer);
            EXPECT_FALSE(failure && failure->reason.starts_with("the media reader"))
                << format << " of " << size;
        }
    }
}

TEST_F(RealMediaReader, AMovieCutBeforeItsIndexFails) {
    const std::string whole = folder_.path("whole.mov");
    makeSampleMovie(whole);
    const std::string bytes = contentOf(whole);
    const std::string path =
        folder_.writeFile("part.mov", std::string_view(bytes).substr(0, bytes.size() / 2));
    EXPECT_EQ(failureFor(reader_, path).cause, FailureCause::file);
}

TEST_F(RealMediaReader, TheCallersDescriptorStaysWhereItIs) {
    const std::string path = folder_.path("clip.mov");
    makeSampleMovie(path);
    const platform::FileDescriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    ASSERT_EQ(lseek(file.number(), 77, SEEK_SET), 77);
    EXPECT_TRUE(std::holds_alternative<MediaProperties>(reader_.read(file.number())));
    EXPECT_EQ(lseek(file.number(), 0, SEEK_CUR), 77);
}

TEST_F(RealMediaReader, ThreadsTakeTurns) {
    const std::string path = folder_.path("clip.mov");
    makeSampleMovie(path);
    std::vector<std::thread> threads;
    std::atomic<int> read{0};
    for (int i = 0; i < 4; ++i)
        threads.emplace_back([&] {
            for (int j = 0; j < 5; ++j)
                read += std::holds_alternative<MediaProperties>(answerFor(reader_, path));
        });
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(read, 20);
}

// --- The program without a MediaReader around it

namespace {

class RunningProgram {
  public:
    RunningProgram() {
        int ends[2];
        if (socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, ends) != 0)
            throw std::runtime_error("no socket");
        channel_ = platform::FileDescriptor(ends[0]);
        const platform::FileDescriptor theirs(ends[1]);
        posix_spawn_file_actions_t actions;
        posix_spawn_file_actions_init(&actions);
        posix_spawn_file_actions_adddup2(&actions, theirs.number(), readerChannelDescriptor);
        char name[] = "vexo-media-reader";
        char* const arguments[] = {name, nullptr};
        if (posix_spawn(&process_, realProgram.c_str(), &actions, nullptr, arguments, environ) != 0)
            throw std::runtime_error("cannot start " + realProgram);
        posix_spawn_file_actions_destroy(&actions);
    }
    ~RunningProgram() {
        closeChannel();
        if (process_ > 0)
            waitpid(process_, nullptr, 0);
    }

    std::string receive() const {
        std::string message(maximumMessageBytes, '\0');
        const ssize_t size = recv(channel_.number(), message.data(), message.size(), 0);
        message.resize(size > 0 ? static_cast<std::size_t>(size) : 0);
        return message;
    }
    void send(std::string_view message) const {
        ::send(channel_.number(), message.data(), message.size(), MSG_NOSIGNAL);
    }
    void closeChannel() { channel_ = platform::FileDescriptor(); }
    int exitStatus() {
        int status = -1;
        waitpid(std::exchange(process_, -1), &status, 0);
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }
    std::string about(const std::string& file) const {
        return contentOf("/proc/" + std::to_string(process_) + "/" + file);
    }

  private:
    pid_t process_ = -1;
    platform::FileDescriptor channel_;
};

}  // namespace

TEST(MediaReaderProgram, EndsWhenItsHostGoes) {
    RunningProgram program;
    ASSERT_TRUE(decodeGreeting(program.receive()));
    program.closeChannel();
    EXPECT_EQ(program.exitStatus(), 0);
}

TEST(MediaReaderProgram, EndsWhenItsHostTalksNonsense) {
    RunningProgram program;
    ASSERT_TRUE(decodeGreeting(program.receive()));
    program.send("nonsense");
    EXPECT_EQ(program.receive(), "");
    EXPECT_EQ(program.exitStatus(), 0);
}

TEST(MediaReaderProgram, ARequestWithoutAFileFails) {
    const RunningProgram program;
    ASSERT_TRUE(decodeGreeting(program.receive()));
    program.send(encodeRequest({1, 1000, 1000}));
    const auto reply = decodeReply(program.receive());
    ASSERT_TRUE(reply);
    EXPECT_TRUE(std::holds_alternative<MediaFailure>(reply->findings));
}

TEST(MediaReaderProgram, HasGivenUpWhatItDoesNotNeed) {
    const RunningProgram program;
    ASSERT_TRUE(decodeGreeting(program.receive()));
    EXPECT_THAT(program.about("status"), testing::ContainsRegex("NoNewPrivs:\t1"));
    EXPECT_THAT(program.about("limits"), testing::ContainsRegex("Max core file size +0 +0 "));
    EXPECT_THAT(program.about("limits"), testing::ContainsRegex("Max file size +0 +0 "));
    EXPECT_THAT(program.about("limits"), testing::ContainsRegex("Max open files +6 +6 "));
}

TEST(MediaReaderProgram, IsFoundBesideTheProgramUnlessAnotherIsNamed) {
    {
        const ScopedEnvironment unset("VEXO_MEDIA_READER", nullptr);
        EXPECT_EQ(mediaReaderProgram(), realProgram);
    }
    const ScopedEnvironment set("VEXO_MEDIA_READER", "/elsewhere/reader");
    EXPECT_EQ(mediaReaderProgram(), "/elsewhere/reader");
}

// --- A reader that does as the file says

namespace {

// Counts its starts in a file beside itself.
constexpr const char* script = R"(#!/usr/bin/env python3
import json, os, signal, socket
open(__file__ + ".starts", "a").write("x")
host = socket.socket(fileno=3)
host.send(b'{"mediaReader": 2}')
while True:
    message, files, _, _ = socket.recv_fds(host, 20000, 1)
    if not message:
        break
    number = json.loads(message)["request"]
    act = os.pread(files[0], 100, 0).decode()
    reply = {"request": number, "mediaTypes": ["Video"], "codecs": [act]}
    if act == "crash":
        os.kill(os.getpid(), signal.SIGKILL)
    if act == "crash once" and os.path.getsize(__file__ + ".starts") == 1:
        os.kill(os.getpid(), signal.SIGKILL)
    if act == "hang":
        signal.pause()
    if act == "stale":
        reply["request"] = number - 1
    if act == "descriptors":
        reply["codecs"] = sorted(os.listdir("/proc/self/fd"))
    os.close(files[0])
    if act == "garbage":
        host.send(b'\xff\x00{"request"')
    elif act == "flood":
        host.send(b"[" * 60000)
    else:
        host.send(json.dumps(reply).encode())
    if act == "leave":
        break
)";

class MisbehavingMediaReader : public testing::Test {
  protected:
    MisbehavingMediaReader() { chmod(program_.c_str(), 0700); }

    std::string fileSaying(const std::string& act) const { return folder_.writeFile(act, act); }
    std::size_t starts() const { return contentOf(program_ + ".starts").size(); }
    void expectThatTheNextFileWorks() {
        EXPECT_THAT(propertiesFor(reader_, fileSaying("well")).codecs, ElementsAre("well"));
    }

    TemporaryFolder folder_;
    const std::string program_ = folder_.writeFile("reader", script);
    ProcessMediaReader reader_{
        {.program = program_, .deadline = 500ms, .startDeadline = 30s, .pauseAfterFailedStart = 0ms}};
};

}  // namespace

TEST_F(MisbehavingMediaReader, IsStartedOnceForManyFiles) {
    EXPECT_EQ(starts(), 0u);
    expectThatTheNextFileWorks();
    expectThatTheNextFileWorks();
    EXPECT_EQ(starts(), 1u);
}

TEST_F(MisbehavingMediaReader, ACrashFailsTheFileAfterASecondAttempt) {
    EXPECT_EQ(failureFor(reader_, fileSaying("crash")), MediaFailure{"the media reader ended over the file"});
    EXPECT_EQ(starts(), 2u);
    expectThatTheNextFileWorks();
}

TEST_F(MisbehavingMediaReader, AFileIsReadAgainWhenTheReaderWasKilledOverIt) {
    EXPECT_THAT(propertiesFor(reader_, fileSaying("crash once")).codecs, ElementsAre("crash once"));
}

TEST_F(MisbehavingMediaReader, AReaderThatHangsIsKilled) {
    EXPECT_EQ(failureFor(reader_, fileSaying("hang")),
              MediaFailure{"the media reader took too long over the file"});
    EXPECT_FALSE(hasChildProcess());
    expectThatTheNextFileWorks();
    EXPECT_EQ(starts(), 2u);
}

TEST_F(MisbehavingMediaReader, NonsenseFailsTheFileAndEndsTheReader) {
    for (const char* act : {"garbage", "flood", "stale"}) {
        EXPECT_EQ(failureFor(reader_, fileSaying(act)),
                  MediaFailure{"the media reader's answer makes no sense"})
            << act;
        EXPECT_FALSE(hasChildProcess()) << act;
    }
    expectThatTheNextFileWorks();
}

TEST_F(MisbehavingMediaReader, AReaderThatLeftBetweenFilesIsReplaced) {
    EXPECT_THAT(propertiesFor(reader_, fileSaying("leave")).codecs, ElementsAre("leave"));
    expectThatTheNextFileWorks();
    EXPECT_EQ(starts(), 2u);
}

TEST_F(MisbehavingMediaReader, GetsNoDescriptorOfTheHostButTheFile) {
    const platform::FileDescriptor inheritable(open("/dev/null", O_RDONLY));
    // The file, and the folder that the script lists.
    EXPECT_THAT(propertiesFor(reader_, fileSaying("descriptors")).codecs,
                ElementsAre("0", "1", "2", "3", "4", "5"));
}

TEST_F(MisbehavingMediaReader, LeavesNoProcessBehind) {
    {
        ProcessMediaReader reader({.program = program_, .startDeadline = 30s});
        propertiesFor(reader, fileSaying("well"));
        EXPECT_TRUE(hasChildProcess());
    }
    EXPECT_FALSE(hasChildProcess());
}

TEST_F(MisbehavingMediaReader, AMissingProgramIsNoFaultOfTheFile) {
    ProcessMediaReader reader({folder_.path("missing")});
    EXPECT_EQ(failureFor(reader, fileSaying("well")).cause, FailureCause::elsewhere);
}

TEST_F(MisbehavingMediaReader, AProgramThatIsNoReaderIsNoFaultOfTheFile) {
    for (const char* program : {"/bin/true", "/bin/false"}) {
        ProcessMediaReader reader({program});
        EXPECT_EQ(failureFor(reader, fileSaying("well")).cause, FailureCause::elsewhere) << program;
        EXPECT_FALSE(hasChildProcess()) << program;
    }
}

TEST_F(MisbehavingMediaReader, AfterAFailedStartThereIsAPause) {
    const std::string late = folder_.path("late");
    ProcessMediaReader reader({.program = late, .pauseAfterFailedStart = 1h});
    EXPECT_EQ(failureFor(reader, fileSaying("well")).cause, FailureCause::elsewhere);
    folder_.makeLink("late", program_);
    EXPECT_EQ(failureFor(reader, fileSaying("well")).cause, FailureCause::elsewhere);
    EXPECT_EQ(starts(), 0u);
}

// --- The messages

TEST(ReaderMessage, AReplyReadsAsItWasWritten) {
    const ReaderReply movie{7, MediaProperties{{"Video", "Sound"}, 1920, 1080, 12.48, {"h264", "aac"}, -1.5}};
    const ReaderReply failure{8, MediaFailure{"no movie"}};
    EXPECT_EQ(decodeReply(encodeReply(movie)), movie);
    EXPECT_EQ(decodeReply(encodeReply(failure)), failure);
    EXPECT_EQ(decodeRequest(encodeRequest({9, 10, 11})), (ReaderRequest{9, 10, 11}));
    EXPECT_TRUE(decodeGreeting(encodeGreeting({})));
}

TEST(ReaderMessage, WhatIsLongIsCutAndStillUnderstood) {
    const ReaderReply reply{1, MediaFailure{std::string(5000, '\xff')}};
    EXPECT_TRUE(decodeReply(encodeReply(reply)));
    const ReaderReply many{2, MediaProperties{std::vector<std::string>(500, std::string(500, '\1'))}};
    EXPECT_TRUE(decodeReply(encodeReply(many)));
}

TEST(ReaderMessage, NonsenseIsNotUnderstood) {
    for (const char* message :
         {"", "{", "[]", "7", "null", "{}", R"({"request":1})", R"({"request":-1,"failure":"x"})",
          R"({"request":1,"failure":7})", R"({"request":1,"mediaTypes":"Video"})",
          R"({"request":1,"mediaTypes":[]})", R"({"request":1,"mediaTypes":[1]})",
          R"({"request":1,"mediaTypes":["Video"],"pixelWidth":0})",
          R"({"request":1,"mediaTypes":["Video"],"pixelWidth":1e3})",
          R"({"request":1,"mediaTypes":["Video"],"pixelWidth":4294967297})",
          R"({"request":1,"mediaTypes":["Video"],"durationSeconds":-1})",
          R"({"request":1,"mediaTypes":["Video"],"durationSeconds":1e300})",
          R"({"request":1,"mediaTypes":["Video"],"durationSeconds":"long"})"})
        EXPECT_FALSE(decodeReply(message)) << message;
    EXPECT_FALSE(decodeReply(std::string(maximumMessageBytes, '[')));
    EXPECT_FALSE(decodeReply(R"({"request":1,"failure":"x"})" + std::string(maximumMessageBytes, ' ')));
    EXPECT_FALSE(decodeGreeting(R"({"mediaReader":1})"));
}
