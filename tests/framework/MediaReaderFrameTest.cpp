// Frames of real movies by the real program.
#include <gmock/gmock.h>

#include <atomic>
#include <thread>

#include "framework/metadata/MediaLimits.h"
#include "tests/framework/MediaReaderTest.h"
#include "tests/framework/RawMovie.h"
#include "tests/support/SampleMovie.h"

using testing::HasSubstr;
using testing_support::makeSampleMovie;

namespace vexo {
namespace {

using Colour = RawMovie::Colour;

constexpr Colour black = 0x000000, grey = 0x808080;
constexpr Colour red = 0xE02020, green = 0x20C040, blue = 0x3040E0, yellow = 0xE0D030;

// One colour for each quarter of a picture of 64 x 48.
Colour quarters(int x, int y) {
    if (y < 24)
        return x < 32 ? red : green;
    return x < 32 ? blue : yellow;
}

// That picture from one frame on, and before it all of one colour.
RawMovie beginningWith(Colour colour, int firstFrame, int frames) {
    return {.frames = frames, .colourAt = [=](int frame, int x, int y) {
                return frame < firstFrame ? colour : quarters(x, y);
            }};
}

Colour pixelAt(const platform::Bitmap& frame, int x, int y) {
    return frame.pixels.at(static_cast<std::size_t>(y * frame.width + x)) & 0xFFFFFF;
}

// Of a place in parts of the picture's size.
Colour colourAt(const platform::Bitmap& frame, double x, double y) {
    return pixelAt(frame, static_cast<int>(x * frame.width), static_cast<int>(y * frame.height));
}

int brightnessAt(const platform::Bitmap& frame, double x, double y) {
    const Colour colour = colourAt(frame, x, y);
    return static_cast<int>(((colour >> 16) + (colour >> 8 & 255) + (colour & 255)) / 3);
}

void expectQuarters(const platform::Bitmap& frame) {
    EXPECT_EQ(colourAt(frame, 0.25, 0.25), red);
    EXPECT_EQ(colourAt(frame, 0.75, 0.25), green);
    EXPECT_EQ(colourAt(frame, 0.25, 0.75), blue);
    EXPECT_EQ(colourAt(frame, 0.75, 0.75), yellow);
}

using WidthAndHeight = std::pair<int, int>;

WidthAndHeight sizeOf(const platform::Bitmap& frame) {
    return {frame.width, frame.height};
}

class MovieFrame : public RealMediaReader {
  protected:
    platform::Bitmap frameOf(const RawMovie& movie, int longestSide = 256) {
        return frameFor(reader_, folder_.writeFile("raw.avi", movie.bytes()), longestSide);
    }
};

TEST_F(MovieFrame, ShowsWhatTheMovieShows) {
    const platform::Bitmap frame = frameOf(beginningWith(black, 0, 10));
    expectQuarters(frame);
    EXPECT_EQ(sizeOf(frame), WidthAndHeight(64, 48));
    EXPECT_EQ(frame.pixels.size(), 64u * 48u);
}

TEST_F(MovieFrame, IsOpaque) {
    for (const std::uint32_t pixel : frameOf(beginningWith(black, 0, 2)).pixels)
        ASSERT_EQ(pixel >> 24, 255u);
}

TEST_F(MovieFrame, IsScaledDownToTheLongestSide) {
    const RawMovie movie = beginningWith(black, 0, 10);
    EXPECT_EQ(sizeOf(frameOf(movie, 32)), WidthAndHeight(32, 24));
    EXPECT_EQ(sizeOf(frameOf(movie, 10)), WidthAndHeight(10, 8));
    EXPECT_EQ(sizeOf(frameOf(movie, 1)), WidthAndHeight(1, 1));
    EXPECT_EQ(sizeOf(frameOf(movie, 0)), WidthAndHeight(1, 1));
    expectQuarters(frameOf(movie, 32));
}

TEST_F(MovieFrame, IsNeverLargerThanTheLargest) {
    const RawMovie wide{.width = 2048, .height = 16, .frames = 2, .colourAt = [](int, int x, int) {
                            return static_cast<Colour>(x / 8);
                        }};
    EXPECT_EQ(sizeOf(frameOf(wide, 1'000'000)), WidthAndHeight(largestFrameSide, 8));
}

TEST_F(MovieFrame, OfAHighMovieIsAsHighAsTheLongestSide) {
    const RawMovie high{.width = 30, .height = 300, .frames = 2, .colourAt = [](int, int, int y) {
                            return static_cast<Colour>(y);
                        }};
    EXPECT_EQ(sizeOf(frameOf(high, 100)), WidthAndHeight(10, 100));
}

TEST_F(MovieFrame, OfTheTiniestMovies) {
    for (const auto& [width, height] : {WidthAndHeight(1, 1), WidthAndHeight(2, 2), WidthAndHeight(1, 40),
                                        WidthAndHeight(40, 1), WidthAndHeight(3, 5)}) {
        const RawMovie tiny{
            .width = width, .height = height, .frames = 3, .colourAt = [](int, int, int) { return yellow; }};
        const platform::Bitmap frame = frameOf(tiny);
        EXPECT_EQ(sizeOf(frame), WidthAndHeight(width, height));
        EXPECT_EQ(colourAt(frame, 0, 0), yellow);
    }
}

TEST_F(MovieFrame, OfAMovieThatBeginsBlackIsALaterOne) {
    expectQuarters(frameOf(beginningWith(black, 40, 100)));
}

TEST_F(MovieFrame, OfAMovieThatBeginsFlatIsALaterOne) {
    expectQuarters(frameOf(beginningWith(grey, 70, 100)));
}

TEST_F(MovieFrame, OfAMovieWithOneKeyFrameIsALaterOne) {
    RawMovie movie = beginningWith(black, 40, 100);
    movie.everyFrameIsKey = false;
    expectQuarters(frameOf(movie));
}

TEST_F(MovieFrame, OfAMovieThatShowsNothingIsBlack) {
    const platform::Bitmap frame = frameOf(beginningWith(black, 10, 10));
    EXPECT_EQ(sizeOf(frame), WidthAndHeight(64, 48));
    EXPECT_EQ(colourAt(frame, 0.5, 0.5), black);
}

TEST_F(MovieFrame, IsTheLeastFlatOneWhenAllAre) {
    RawMovie movie = beginningWith(black, 100, 100);
    movie.colourAt = [](int frame, int, int) { return frame == 50 ? grey : black; };
    EXPECT_EQ(colourAt(frameOf(movie), 0.5, 0.5), grey);
}

TEST_F(MovieFrame, ComesFromEachFormat) {
    for (const char* format : {"mov", "mp4", "m4v", "3gp", "mkv", "webm", "avi", "mpg"}) {
        const std::string path = folder_.path(std::string("clip.") + format);
        makeSampleMovie(path, {.size = "352x288"});
        const platform::Bitmap frame = frameFor(reader_, path, 128);
        EXPECT_EQ(frame.width, 128) << format;
        // The test card is dark above and light below.
        EXPECT_LT(brightnessAt(frame, 0.5, 0.02) + 30, brightnessAt(frame, 0.5, 0.98)) << format;
    }
}

// --- As it is shown

// Where the four sides of the test card have come to lie: its upper one is darkest, and a white disc lies on
// its left one.
struct Turn {
    int degrees;
    double darkX, darkY, lightX, lightY, discX, discY;
};

void PrintTo(const Turn& turn, std::ostream* out) {
    *out << turn.degrees;
}

class TurnedMovieFrame : public RealMediaReader, public testing::WithParamInterface<Turn> {};

TEST_P(TurnedMovieFrame, IsUpright) {
    const Turn& turn = GetParam();
    const std::string path = folder_.path("turned.mp4");
    makeSampleMovie(path, {.size = "640x360", .rotation = turn.degrees});
    const platform::Bitmap frame = frameFor(reader_, path, 320);

    EXPECT_EQ(sizeOf(frame), turn.degrees % 180 == 0 ? WidthAndHeight(320, 180) : WidthAndHeight(180, 320));
    EXPECT_LT(brightnessAt(frame, turn.darkX, turn.darkY) + 30,
              brightnessAt(frame, turn.lightX, turn.lightY));
    EXPECT_GT(brightnessAt(frame, turn.discX, turn.discY), 170);
    EXPECT_LT(brightnessAt(frame, 1 - turn.discX, 1 - turn.discY), 170);
}

constexpr double low = 0.02, half = 0.5, high = 0.98, onDisc = 0.1;
INSTANTIATE_TEST_SUITE_P(Each, TurnedMovieFrame,
                         testing::Values(Turn{0, half, low, half, high, onDisc, half},
                                         Turn{90, high, half, low, half, half, onDisc},
                                         Turn{180, half, high, half, low, 1 - onDisc, half},
                                         Turn{270, low, half, high, half, half, 1 - onDisc}),
                         testing::PrintToStringParamName());

TEST_F(MovieFrame, HasTheShapeInWhichItIsShown) {
    const std::string path = folder_.path("clip.dv");
    makeSampleMovie(path, {.size = "720x576", .seconds = 0.2});
    const platform::Bitmap frame = frameFor(reader_, path, 400);
    EXPECT_EQ(frame.width, 400);
    EXPECT_NEAR(frame.height, 300, 10);  // four to three, in either way of counting lines
}

// --- What has no picture

TEST_F(MovieFrame, OfSoundAloneIsNone) {
    const std::string path = folder_.path("sound.m4v");
    makeSampleMovie(path, {.hasVideo = false});
    EXPECT_EQ(failureIn(frameAnswerFor(reader_, path, 256), path), MediaFailure{"no picture in it"});
}

TEST_F(MovieFrame, OfTextIsNone) {
    const std::string path = folder_.writeFile("text.mov", std::string(5000, 'a') + "\n");
    EXPECT_THAT(failureIn(frameAnswerFor(reader_, path, 256), path).reason, HasSubstr("no movie or sound"));
}

TEST_F(MovieFrame, OfAFolderIsNoFaultOfIts) {
    EXPECT_EQ(failureIn(frameAnswerFor(reader_, folder_.path(), 256), "folder").cause,
              FailureCause::elsewhere);
}

TEST_F(MovieFrame, OfATruncatedMovieIsAnswered) {
    for (const char* format : {"mov", "mkv", "avi", "mpg"}) {
        const std::string whole = folder_.path(std::string("whole.") + format);
        makeSampleMovie(whole, {.size = "160x120"});
        const std::string bytes = contentOf(whole);
        for (std::size_t size = 1; size < bytes.size(); size += 1 + bytes.size() / 20) {
            const std::string path = folder_.writeFile("part", std::string_view(bytes).substr(0, size));
            const MediaFrameAnswer answer = frameAnswerFor(reader_, path, 128);
            const auto* failure = std::get_if<MediaFailure>(&answer);
            EXPECT_FALSE(failure && failure->reason.starts_with("the media reader"))
                << format << " of " << size;
        }
    }
    EXPECT_EQ(reader_.startedHelpers(), 1);
}

TEST_F(MovieFrame, OfAMovieThatLacksItsEndIsWhatThereIs) {
    const std::string bytes = beginningWith(black, 0, 100).bytes();
    const std::string path = folder_.writeFile("part.avi", bytes.substr(0, bytes.size() / 4));
    expectQuarters(frameFor(reader_, path, 256));
}

TEST_F(MovieFrame, OfAFlatMovieThatIsShorterThanItSaysIsFlat) {
    RawMovie movie = beginningWith(grey, 10, 10);
    movie.everyFrameIsKey = false;
    movie.missingFrames = 90;
    EXPECT_EQ(colourAt(frameOf(movie), 0.5, 0.5), grey);
}

// --- From several threads

TEST_F(MovieFrame, IsThatOfItsOwnMovieWhenThreadsTakeTurns) {
    const auto flat = [](Colour colour) {
        return RawMovie{.frames = 2, .colourAt = [=](int, int, int) { return colour; }}.bytes();
    };
    const std::string paths[] = {folder_.writeFile("red.avi", flat(red)),
                                 folder_.writeFile("blue.avi", flat(blue))};
    std::atomic<int> right{0};
    const auto look = [&](const std::string& path, Colour colour) {
        for (int i = 0; i < 20; ++i)
            right += colourAt(frameFor(reader_, path, 64), 0.5, 0.5) == colour;
    };
    std::thread one(look, paths[0], red);
    std::thread other(look, paths[1], blue);
    one.join();
    other.join();
    EXPECT_EQ(right, 40);
    EXPECT_EQ(reader_.startedHelpers(), 1);
}

}  // namespace
}  // namespace vexo
