// Properties of real movies by the real program.
#include "tests/framework/MediaReaderTest.h"

#include <gmock/gmock.h>

#include <atomic>
#include <nlohmann/json.hpp>
#include <thread>

#include "tests/framework/FFprobe.h"
#include "tests/framework/RawMovie.h"
#include "tests/support/SampleMovie.h"

using namespace testing_support;
using testing::ElementsAre;
using testing::HasSubstr;

namespace vexo {
namespace {

MediaFailure failureFor(MediaReader& reader, const std::string& path) {
    return failureIn(answerFor(reader, path), path);
}

RawMovie greyMovie() {
    return {.colourAt = [](int, int, int) { return 0x808080; }};
}

TEST_F(RealMediaReader, TellsWhatIsInAMovie) {
    const std::string path = folder_.path("clip.mov");
    makeSampleMovie(path, {.size = "1920x1080", .seconds = 2, .creationTime = "2008-12-31T23:59:59Z"});

    MediaProperties properties = propertiesFor(reader_, path);
    EXPECT_GT(std::exchange(properties.totalBitRate, std::nullopt), 1000);
    const nlohmann::json expected{{"mediaTypes", {"Video", "Sound"}},
                                  {"pixelWidth", 1920},
                                  {"pixelHeight", 1080},
                                  {"durationSeconds", 2.0},
                                  {"codecs", {"mpeg4", "aac"}},
                                  {"contentCreationDate", 1230767999.0},
                                  {"frameRate", 5.0},
                                  {"audioChannelCount", 1},
                                  {"audioSampleRate", 44100},
                                  {"request", 1}};
    EXPECT_EQ(nlohmann::json::parse(encodeReply({1, properties})), expected);
}

TEST_F(RealMediaReader, TellsTheTitleAndTheCamera) {
    const MediaProperties properties = propertiesFor(reader_, VEXO_SAMPLES_DIR "/movies/camera.mov");
    EXPECT_EQ(properties.title, "Räder am Fluß");
    EXPECT_EQ(properties.acquisitionMake, "Camera Works");
    EXPECT_EQ(properties.acquisitionModel, "CW 100");
}

TEST_F(RealMediaReader, TakesADateWithoutAZoneAsUniversalTime) {
    const ScopedEnvironment elsewhere("TZ", "America/New_York");
    RawMovie movie = greyMovie();
    movie.date = "Wed Dec 31 23:59:59 2008";
    const std::string path = folder_.writeFile("dated.avi", movie.bytes());
    EXPECT_EQ(propertiesFor(reader_, path).contentCreationDate, 1230767999.0);
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
        EXPECT_EQ(properties.totalBitRate, std::stoll(probe->at("format").at("bit_rate").get<std::string>()))
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

}  // namespace
}  // namespace vexo
