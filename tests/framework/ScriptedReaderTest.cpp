// A reader program that misbehaves, and the life of the program that a MediaReader keeps.
#include <gmock/gmock.h>
#include <sys/stat.h>

#include <thread>

#include "tests/framework/MediaReaderTest.h"

using namespace std::chrono_literals;
using testing::Each;
using testing::ElementsAre;
using testing_support::TemporaryFolder;

namespace vexo {
namespace {

// Does as the file says, and counts its starts in a file beside itself.
constexpr const char* script = R"(#!/usr/bin/env python3
import json, mmap, os, signal, socket, time
open(__file__ + ".starts", "a").write("x")
host = socket.socket(fileno=3)
host.send(b'{"mediaReader": 2, "confinement": ["good intentions"]}')

def draw(memory, size, pixel):
    with mmap.mmap(memory, size) as pixels:
        pixels[:] = pixel * (size // 4)

def resize(memory, size):
    try:
        os.ftruncate(memory, size)
        return "done"
    except OSError as error:
        return error.strerror

while True:
    message, files, _, _ = socket.recv_fds(host, 20000, 2)
    if not message:
        break
    request = json.loads(message)
    number = request["request"]
    side = request.get("longestSide")
    act = os.pread(files[0], 100, 0).decode()
    properties = {"request": number, "mediaTypes": ["Video"], "codecs": [act]}
    frame = {"request": number, "frameWidth": side, "frameHeight": side}
    reply = frame if side else properties
    if act == "crash":
        os.kill(os.getpid(), signal.SIGKILL)
    if act == "crash once" and os.path.getsize(__file__ + ".starts") == 1:
        os.kill(os.getpid(), signal.SIGKILL)
    if act == "tell and hang":
        open(__file__ + ".fifo", "w").close()
    if act in ("hang", "tell and hang"):
        signal.pause()
    if act == "late":
        time.sleep(1)
    if act == "stale":
        reply["request"] = number - 1
    if act == "the other kind":
        reply = properties if side else {"request": number, "frameWidth": 1, "frameHeight": 1}
    if act == "too wide":
        reply["frameWidth"] = side + 1
    if act == "too high":
        reply["frameHeight"] = side + 1
    if act == "beyond all":
        reply["frameWidth"] = reply["frameHeight"] = 2 ** 31
    if act == "flat":
        reply["frameHeight"] = 0
    if act == "negative":
        reply["frameHeight"] = -side
    if act == "descriptors":
        reply["codecs"] = sorted(os.listdir("/proc/self/fd"))
    if act == "white":
        draw(files[1], side * side * 4, b"\xff\xff\xff\xff")
    if act == "transparent white":
        draw(files[1], side * side * 4, b"\xff\xff\xff\x00")
    if act == "resize":
        reply = {"request": number,
                 "failure": resize(files[1], 1) + ", " + resize(files[1], 1 << 20)}
    for file in files:
        os.close(file)
    if act == "garbage":
        host.send(b'\xff\x00{"request"')
    elif act == "flood":
        host.send(b"[" * 60000)
    else:
        host.send(json.dumps(reply).encode())
    if act == "leave":
        break
)";

constexpr int side = 16;

class ScriptedReaderTest : public testing::Test {
  protected:
    ScriptedReaderTest() { chmod(program_.c_str(), 0700); }

    std::string fileSaying(const std::string& act) const { return folder_.writeFile(act, act); }
    std::size_t starts() const { return contentOf(program_ + ".starts").size(); }

    // Opened by the script when it says so; it waits until then.
    std::string makeFifo() const { return folder_.makeFifo("reader.fifo"); }
    static void waitFor(const std::string& fifo) {
        const platform::FileDescriptor end(open(fifo.c_str(), O_RDONLY | O_CLOEXEC));
    }

    TemporaryFolder folder_;
    const std::string program_ = folder_.writeFile("reader", script);
    std::vector<std::string> warnings_;
    const std::function<void(const std::string&)> warn_ = [this](const std::string& problem) {
        warnings_.push_back(problem);
    };
    ProcessMediaReader reader_{
        {.program = program_, .deadline = 500ms, .startDeadline = 30s, .pauseAfterFailedStart = 0ms}};
};

// --- Whatever is asked for

enum class Asked { properties, frame };

class MisbehavingMediaReader : public ScriptedReaderTest, public testing::WithParamInterface<Asked> {
  protected:
    MediaFailure failureFor(MediaReader& reader, const std::string& act) {
        const std::string path = fileSaying(act);
        return GetParam() == Asked::frame ? failureIn(frameAnswerFor(reader, path, side), path)
                                          : failureIn(answerFor(reader, path), path);
    }
    MediaFailure failureFor(const std::string& act) { return failureFor(reader_, act); }

    bool works(const std::string& act = "well") {
        const std::string path = fileSaying(act);
        return GetParam() == Asked::frame
                   ? std::holds_alternative<platform::Bitmap>(frameAnswerFor(reader_, path, side))
                   : std::holds_alternative<MediaProperties>(answerFor(reader_, path));
    }
};

INSTANTIATE_TEST_SUITE_P(AskedFor, MisbehavingMediaReader, testing::Values(Asked::properties, Asked::frame),
                         [](const auto& asked) {
                             return asked.param == Asked::frame ? "AFrame" : "Properties";
                         });

TEST_P(MisbehavingMediaReader, IsStartedOnceForManyFiles) {
    EXPECT_EQ(starts(), 0u);
    EXPECT_TRUE(works());
    EXPECT_TRUE(works());
    EXPECT_EQ(starts(), 1u);
    EXPECT_EQ(reader_.startedHelpers(), 1);
}

TEST_P(MisbehavingMediaReader, FailsTheFileWhenItCrashesASecondTime) {
    EXPECT_EQ(failureFor("crash"), MediaFailure{"the media reader ended over the file"});
    EXPECT_EQ(starts(), 2u);
    EXPECT_EQ(reader_.startedHelpers(), 2);
    EXPECT_TRUE(works());
}

TEST_P(MisbehavingMediaReader, ReadsAFileAgainWhenItWasKilledOverIt) {
    EXPECT_TRUE(works("crash once"));
    EXPECT_EQ(starts(), 2u);
}

TEST_P(MisbehavingMediaReader, IsKilledWhenItTakesTooLong) {
    for (const char* act : {"hang", "late"}) {
        EXPECT_EQ(failureFor(act), MediaFailure{"the media reader took too long over the file"}) << act;
        EXPECT_TRUE(childProcessesEnd()) << act;
    }
    EXPECT_TRUE(works());
    EXPECT_EQ(starts(), 3u);
}

TEST_P(MisbehavingMediaReader, IsEndedWhenItTalksNonsense) {
    for (const char* act : {"garbage", "flood", "stale", "the other kind"}) {
        EXPECT_EQ(failureFor(act), MediaFailure{"the media reader's answer makes no sense"}) << act;
        EXPECT_TRUE(childProcessesEnd()) << act;
    }
    EXPECT_TRUE(works());
}

TEST_P(MisbehavingMediaReader, IsReplacedWhenItLeftBetweenFiles) {
    EXPECT_TRUE(works("leave"));
    EXPECT_TRUE(works());
    EXPECT_EQ(starts(), 2u);
}

TEST_P(MisbehavingMediaReader, IsNoFaultOfTheFileWhenItIsMissing) {
    ProcessMediaReader reader({folder_.path("missing")});
    EXPECT_EQ(failureFor(reader, "well").cause, FailureCause::elsewhere);
    EXPECT_EQ(reader.startedHelpers(), 0);
}

TEST_P(MisbehavingMediaReader, IsNoFaultOfTheFileWhenItIsNoReader) {
    for (const char* program : {"/bin/true", "/bin/false"}) {
        ProcessMediaReader reader({program});
        EXPECT_EQ(failureFor(reader, "well").cause, FailureCause::elsewhere) << program;
        EXPECT_TRUE(childProcessesEnd()) << program;
    }
}

TEST_P(MisbehavingMediaReader, IsNotStartedForSomeTimeAfterThatFailed) {
    ProcessMediaReader reader({.program = folder_.path("late"), .pauseAfterFailedStart = 1h, .warn = warn_});
    EXPECT_EQ(failureFor(reader, "well").cause, FailureCause::elsewhere);
    folder_.makeLink("late", program_);
    EXPECT_EQ(failureFor(reader, "well").cause, FailureCause::elsewhere);
    EXPECT_EQ(starts(), 0u);
    EXPECT_THAT(warnings_,
                ElementsAre("cannot start " + folder_.path("late") + ": No such file or directory"));
}

TEST_P(MisbehavingMediaReader, IsWarnedOfWhenItIsNoReader) {
    ProcessMediaReader reader({.program = "/bin/true", .warn = warn_});
    failureFor(reader, "well");
    EXPECT_THAT(warnings_, ElementsAre("cannot start /bin/true: it does not speak as a media reader does"));
}

// --- Closed

TEST_P(MisbehavingMediaReader, IsEndedAtOnceWhenItIsClosedOverAFile) {
    const std::string fifo = makeFifo();
    ProcessMediaReader reader({.program = program_, .deadline = 1h, .startDeadline = 1h});
    MediaFailure failure;
    std::thread waiting([&] { failure = failureFor(reader, "tell and hang"); });
    waitFor(fifo);
    reader.close();
    waiting.join();
    EXPECT_EQ(failure, (MediaFailure{"stopped", FailureCause::elsewhere}));
    EXPECT_TRUE(childProcessesEnd());
}

TEST_P(MisbehavingMediaReader, IsEndedAtOnceWhenItIsClosedWhileItStarts) {
    const std::string fifo = folder_.makeFifo("silent.fifo");
    const std::string silent = folder_.writeFile("silent", "#!/bin/sh\n: >\"$0.fifo\"\nexec sleep 1000\n");
    chmod(silent.c_str(), 0700);
    ProcessMediaReader reader({.program = silent, .startDeadline = 1h});
    MediaFailure failure;
    std::thread waiting([&] { failure = failureFor(reader, "well"); });
    waitFor(fifo);
    reader.close();
    waiting.join();
    EXPECT_EQ(failure, (MediaFailure{"stopped", FailureCause::elsewhere}));
    EXPECT_TRUE(childProcessesEnd());
}

TEST_P(MisbehavingMediaReader, IsNotStartedOnceItIsClosed) {
    EXPECT_TRUE(works());
    reader_.close();
    EXPECT_TRUE(childProcessesEnd());
    EXPECT_EQ(failureFor("well"), (MediaFailure{"stopped", FailureCause::elsewhere}));
    EXPECT_EQ(reader_.confinement(), std::nullopt);
    EXPECT_EQ(reader_.startedHelpers(), 1);
    EXPECT_EQ(starts(), 1u);
}

// --- Frames alone

class MisbehavingFrameReader : public ScriptedReaderTest {
  protected:
    MediaFailure failureFor(const std::string& act) {
        const std::string path = fileSaying(act);
        return failureIn(frameAnswerFor(reader_, path, side), path);
    }
    std::vector<std::uint32_t> pixelsFor(const std::string& act) {
        return frameFor(reader_, fileSaying(act), side).pixels;
    }
};

TEST_F(MisbehavingFrameReader, IsEndedOverASizeThatCannotBe) {
    for (const char* act : {"too wide", "too high", "beyond all", "flat", "negative"}) {
        EXPECT_EQ(failureFor(act), MediaFailure{"the media reader's answer makes no sense"}) << act;
        EXPECT_TRUE(childProcessesEnd()) << act;
    }
}

TEST_F(MisbehavingFrameReader, GivesTheFrameThatItDraws) {
    EXPECT_THAT(pixelsFor("white"), testing::AllOf(testing::SizeIs(side * side), Each(0xFFFFFFFF)));
}

TEST_F(MisbehavingFrameReader, GivesABlackFrameWhenItDrawsNothing) {
    EXPECT_THAT(pixelsFor("well"), testing::AllOf(testing::SizeIs(side * side), Each(0xFF000000)));
}

TEST_F(MisbehavingFrameReader, GivesNoColourThatExceedsItsAlpha) {
    EXPECT_THAT(pixelsFor("transparent white"), Each(0xFFFFFFFF));
}

TEST_F(MisbehavingFrameReader, CannotResizeTheMemory) {
    EXPECT_EQ(failureFor("resize"), MediaFailure{"Operation not permitted, Operation not permitted"});
}

// --- The process

using ReaderProcessLife = ScriptedReaderTest;

TEST_F(ReaderProcessLife, GetsNoDescriptorOfTheHostButTheFile) {
    const platform::FileDescriptor inheritable(open("/dev/null", O_RDONLY));
    // The file, and the folder that the script lists.
    EXPECT_THAT(propertiesFor(reader_, fileSaying("descriptors")).codecs,
                ElementsAre("0", "1", "2", "3", "4", "5"));
}

TEST_F(ReaderProcessLife, EndsWithTheMediaReader) {
    {
        ProcessMediaReader reader({.program = program_, .startDeadline = 30s});
        propertiesFor(reader, fileSaying("well"));
        EXPECT_TRUE(hasChildProcess());
    }
    EXPECT_TRUE(childProcessesEnd());
}

TEST_F(ReaderProcessLife, SaysWhatItHasGivenUp) {
    EXPECT_EQ(reader_.confinement(), std::vector<std::string>{"good intentions"});
    EXPECT_EQ(starts(), 1u);
}

// --- Idle

class IdleMediaReader : public ScriptedReaderTest {
  protected:
    using Block = std::function<void()>;

    std::unique_ptr<ProcessMediaReader> newReader() {
        return std::make_unique<ProcessMediaReader>(ProcessMediaReader::Settings{
            .program = program_, .startDeadline = 30s, .afterIdleTime = [this](Block block) {
                blocks_.push_back(std::move(block));
            }});
    }
    void readWith(ProcessMediaReader& reader) { propertiesFor(reader, fileSaying("well")); }

    // The time passes for the block that has waited longest.
    void passIdleTime() {
        ASSERT_FALSE(blocks_.empty());
        const Block block = std::move(blocks_.front());
        blocks_.erase(blocks_.begin());
        block();
    }

    std::vector<Block> blocks_;
};

TEST_F(IdleMediaReader, EndsItsHelper) {
    const auto reader = newReader();
    EXPECT_TRUE(blocks_.empty());
    readWith(*reader);
    passIdleTime();
    EXPECT_TRUE(childProcessesEnd());
    EXPECT_TRUE(blocks_.empty());
}

TEST_F(IdleMediaReader, StartsAnotherHelperWhenItIsNeeded) {
    const auto reader = newReader();
    readWith(*reader);
    passIdleTime();
    readWith(*reader);
    EXPECT_EQ(reader->startedHelpers(), 2);
    EXPECT_EQ(blocks_.size(), 1u);
}

TEST_F(IdleMediaReader, KeepsAHelperThatWasUsedMeanwhile) {
    const auto reader = newReader();
    readWith(*reader);
    readWith(*reader);
    EXPECT_EQ(blocks_.size(), 1u);

    passIdleTime();
    EXPECT_TRUE(hasChildProcess());
    EXPECT_EQ(blocks_.size(), 1u);

    passIdleTime();
    EXPECT_TRUE(childProcessesEnd());
    EXPECT_TRUE(blocks_.empty());
}

TEST_F(IdleMediaReader, KeepsAHelperThatIsAtWork) {
    const std::string fifo = makeFifo();
    const auto reader = newReader();
    readWith(*reader);
    MediaFailure failure;
    std::thread working(
        [&] { failure = failureIn(answerFor(*reader, fileSaying("tell and hang")), "tell and hang"); });
    waitFor(fifo);
    passIdleTime();
    EXPECT_TRUE(blocks_.empty());
    reader->close();
    working.join();
    EXPECT_EQ(failure.reason, "stopped");
    EXPECT_EQ(reader->startedHelpers(), 1);
}

TEST_F(IdleMediaReader, SchedulesNothingWhenItIsClosed) {
    const auto reader = newReader();
    readWith(*reader);
    reader->close();
    passIdleTime();
    EXPECT_TRUE(blocks_.empty());
}

TEST_F(IdleMediaReader, MayBeGoneWhenTheTimeHasPassed) {
    auto reader = newReader();
    readWith(*reader);
    reader.reset();
    passIdleTime();
    EXPECT_TRUE(blocks_.empty());
}

TEST_F(IdleMediaReader, MayBeToldAtOnce) {
    ProcessMediaReader reader(
        {.program = program_, .startDeadline = 30s, .afterIdleTime = [](Block block) { block(); }});
    readWith(reader);
    readWith(reader);
    EXPECT_EQ(reader.startedHelpers(), 2);
    EXPECT_TRUE(childProcessesEnd());
}

}  // namespace
}  // namespace vexo
