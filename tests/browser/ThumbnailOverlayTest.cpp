// What is drawn over thumbnails, compared with pictures made here pixel by pixel.
#include <cmath>
#include <limits>
#include <thread>

#include "framework/DurationBadge.h"
#include "platform/Drawing.h"
#include "tests/support/Pixels.h"
#include "tests/support/PluginTest.h"

namespace reelix {
namespace {

using platform::Bitmap;
using platform::ImageRef;
using platform::Size;
using testing_support::areAlike;
using testing_support::blended;
using testing_support::channel;
using testing_support::pixel;
using vexo::VXMediaObjectRef;

constexpr double infinity = std::numeric_limits<double>::infinity();
constexpr double notANumber = std::numeric_limits<double>::quiet_NaN();

std::uint32_t& pixel(Bitmap& bitmap, int x, int y) {
    return bitmap.pixels[std::size_t(y * bitmap.width + x)];
}

// In pixels from the upper left corner, right and bottom excluded.
struct Box {
    int left = 0, top = 0, right = 0, bottom = 0;
    bool contains(int x, int y) const { return x >= left && x < right && y >= top && y < bottom; }
};

int pixelsAt(double points, int scale) {
    return int(std::lround(points * scale));
}

Bitmap drawn(const ImageRef& image, int scale = 1) {
    return image->picture()
        ->draw(pixelsAt(image->size().width, scale), pixelsAt(image->size().height, scale))
        .value();
}

// The overlay without its text: the band over the lower twelve points, the icon two points from the left,
// standing on the edge or one point below it.
Bitmap expectedOverlay(Size size, int scale, bool hasBand, const ImageRef& icon) {
    Bitmap bitmap{pixelsAt(size.width, scale), pixelsAt(size.height, scale), {}};
    bitmap.pixels.resize(std::size_t(bitmap.width) * std::size_t(bitmap.height));
    for (int y = std::max(0, bitmap.height - 12 * scale); hasBand && y < bitmap.height; ++y) {
        for (int x = 0; x < bitmap.width; ++x)
            pixel(bitmap, x, y) = 0x80000000;
    }
    if (!icon)
        return bitmap;
    const Bitmap iconPixels = icon->picture()->draw(20 * scale, 20 * scale).value();
    const int top = bitmap.height - (hasBand ? 19 : 20) * scale;
    for (int y = std::max(0, -top); y < iconPixels.height && top + y < bitmap.height; ++y) {
        for (int x = 0; x < iconPixels.width && 2 * scale + x < bitmap.width; ++x) {
            std::uint32_t& under = pixel(bitmap, 2 * scale + x, top + y);
            under = blended(pixel(iconPixels, x, y), under);
        }
    }
    return bitmap;
}

// Where the text stands, in whole pixels around it.
Box textBox(const std::string& text, Size size, int scale) {
    const Size textSize =
        platform::AttributedString(text, platform::boldSystemFontOfSize(10), platform::whiteColor).size();
    return {int(std::floor((size.width - textSize.width - 3) * scale)),
            int(std::floor((size.height + 0.5 - textSize.height) * scale)),
            int(std::ceil((size.width - 3) * scale)), pixelsAt(size.height, scale)};
}

void expectAlikeOutside(const Box& box, const Bitmap& bitmap, const Bitmap& expected) {
    ASSERT_EQ(bitmap.width, expected.width);
    ASSERT_EQ(bitmap.height, expected.height);
    for (int y = 0; y < bitmap.height; ++y) {
        for (int x = 0; x < bitmap.width; ++x) {
            if (box.contains(x, y))
                continue;
            ASSERT_TRUE(areAlike(pixel(bitmap, x, y), pixel(expected, x, y)))
                << "at " << x << ", " << y << std::hex << ": " << pixel(bitmap, x, y) << ", not "
                << pixel(expected, x, y);
        }
    }
}

int whitePixelsIn(const Box& box, const Bitmap& bitmap) {
    int count = 0;
    for (int y = box.top; y < box.bottom; ++y) {
        for (int x = box.left; x < box.right; ++x)
            count += channel(pixel(bitmap, x, y), 0) > 200;
    }
    return count;
}

class ThumbnailOverlayTest : public testing_support::PluginTest {
  protected:
    VXMediaObjectRef newClip(double duration) {
        auto clip = plugin().newMediaObjectWithType(vexo::VXMediaTypeMovie, "clip", "clip");
        clip->setAttribute(duration, vexo::VXMediaObjectDurationKey);
        return clip;
    }
    VXMediaObjectRef newProjectMovie(double duration, platform::Value formatVersion = "7") {
        auto movie = newClip(duration);
        movie->setAttribute(std::move(formatVersion), vexo::VXReelixProjectFormatVersion);
        return movie;
    }
    ImageRef overlay(const VXMediaObjectRef& item, Size size) {
        return plugin().thumbnailOverlayForMediaObject(item, {}, size);
    }
    ImageRef icon(std::string_view name = MBReelixAppIconSmall) { return plugin().iconNamed(name); }

    void expectOverlay(Size size, double duration, bool hasBand) {
        const ImageRef image = overlay(newProjectMovie(duration), size);
        ASSERT_NE(image, nullptr);
        EXPECT_EQ(image->size(), size);
        expectAlikeOutside({}, drawn(image), expectedOverlay(size, 1, hasBand, icon()));
    }
    // Whether the overlay for that duration shows the text, and shows it where it belongs.
    bool shows(double duration, const std::string& text, Size size = {160, 120}) {
        platform::Drawing drawing(size);
        drawing.setColor({0, 0, 0, 0.5});
        drawing.fillRect({0, 0, size.width, 12});
        drawing.drawImage(*icon(), {2, -1, 20, 20});
        const platform::AttributedString string(text, platform::boldSystemFontOfSize(10),
                                                platform::whiteColor);
        const Size textSize = string.size();
        drawing.drawString(string, {size.width - textSize.width - 3, -0.5, textSize.width, textSize.height});
        return drawn(overlay(newProjectMovie(duration), size), 3).pixels == drawn(drawing.image(), 3).pixels;
    }
};

TEST_F(ThumbnailOverlayTest, IsNilUpToAWidthOfForty) {
    for (const double width : {-infinity, -1.0, 0.0, 0.5, 30.0, 39.5, 40.0, notANumber}) {
        EXPECT_EQ(overlay(newProjectMovie(125), {width, 90}), nullptr) << width;
        EXPECT_EQ(overlay(newClip(125), {width, 90}), nullptr) << width;
    }
}

TEST_F(ThumbnailOverlayTest, IsTheIconAloneUpToAWidthOfFifty) {
    for (const double width : {41.0, 42.0, 49.0, 50.0})
        expectOverlay({width, 40}, 125, /*hasBand=*/false);
}

TEST_F(ThumbnailOverlayTest, ABandBeginsBeyondFifty) {
    for (const double width : {51.0, 52.0, 80.0, 320.0})
        expectOverlay({width, 90}, 0, /*hasBand=*/true);
}

// At two pixels a point, where half a point is a whole pixel.
TEST_F(ThumbnailOverlayTest, HalfPointsCountAtBothWidths) {
    ASSERT_NE(overlay(newProjectMovie(125), {40.5, 40}), nullptr);
    expectAlikeOutside({}, drawn(overlay(newProjectMovie(125), {40.5, 40}), 2),
                       expectedOverlay({40.5, 40}, 2, /*hasBand=*/false, icon()));
    expectAlikeOutside({}, drawn(overlay(newProjectMovie(0), {50.5, 40}), 2),
                       expectedOverlay({50.5, 40}, 2, /*hasBand=*/true, icon()));
    EXPECT_TRUE(shows(125, "2:05", {50.5, 40}));
}

TEST_F(ThumbnailOverlayTest, AKnownDurationStandsAtTheLowerRight) {
    for (const int scale : {1, 2, 3}) {
        const Size size{160, 120};
        const Bitmap bitmap = drawn(overlay(newProjectMovie(125), size), scale);
        const Box box = textBox("2:05", size, scale);
        expectAlikeOutside(box, bitmap, expectedOverlay(size, scale, /*hasBand=*/true, icon()));
        EXPECT_GT(whitePixelsIn(box, bitmap), 10 * scale * scale);
    }
}

TEST_F(ThumbnailOverlayTest, ADurationIsMinutesAndSeconds) {
    EXPECT_TRUE(shows(59.9, "0:59"));
    EXPECT_TRUE(shows(125.0, "2:05"));
    EXPECT_TRUE(shows(3600, "60:00"));
    EXPECT_TRUE(shows(0.25, "0:00"));
    EXPECT_FALSE(shows(125.0, "2:06"));
}

TEST_F(ThumbnailOverlayTest, AHugeDurationIsTheLargestNumberThereIs) {
    for (const double duration : {1e300, infinity})
        EXPECT_TRUE(shows(duration, "9223372036854775807:9223372036854775807")) << duration;
}

TEST_F(ThumbnailOverlayTest, ADurationThatIsNotKnownIsNotShown) {
    for (const double duration : {0.0, -0.0, -5.0, -infinity, notANumber})
        expectOverlay({160, 120}, duration, /*hasBand=*/true);
}

TEST_F(ThumbnailOverlayTest, AMovieWithoutAnyDurationGetsTheBandAndTheIcon) {
    const auto movie = plugin().newMediaObjectWithType(vexo::VXMediaTypeMovie, "movie", "movie");
    movie->setAttribute("7", vexo::VXReelixProjectFormatVersion);
    expectAlikeOutside({}, drawn(overlay(movie, {80, 60})), expectedOverlay({80, 60}, 1, true, icon()));
}

TEST_F(ThumbnailOverlayTest, TheFormatVersionChoosesTheIcon) {
    for (const platform::Value& current : {platform::Value("7"), {"7.5"}, {" 7"}, {7}, {7.0}})
        expectAlikeOutside({}, drawn(overlay(newProjectMovie(0, current), {80, 60})),
                           expectedOverlay({80, 60}, 1, true, icon(MBReelixAppIconSmall)));
    for (const platform::Value& other :
         {platform::Value("6"), {"70"}, {"-7"}, {""}, {"seven"}, {8}, {platform::Array{"7"}}})
        expectAlikeOutside({}, drawn(overlay(newProjectMovie(0, other), {80, 60})),
                           expectedOverlay({80, 60}, 1, true, icon(MBReelixIcon)));
}

TEST_F(ThumbnailOverlayTest, AMissingIconLeavesTheRest) {
    environment.bundle->replacedIcons[std::string(MBReelixAppIconSmall)] = nullptr;
    const Size size{160, 120};
    const Bitmap bitmap = drawn(overlay(newProjectMovie(125), size));
    const Box box = textBox("2:05", size, 1);
    expectAlikeOutside(box, bitmap, expectedOverlay(size, 1, /*hasBand=*/true, nullptr));
    EXPECT_GT(whitePixelsIn(box, bitmap), 10);
}

TEST_F(ThumbnailOverlayTest, ADamagedIconLeavesTheRest) {
    environment.bundle->replacedIcons[std::string(MBReelixAppIconSmall)] =
        std::make_shared<platform::Image>(platform::pictureWithData({}));
    expectAlikeOutside({}, drawn(overlay(newProjectMovie(0), {80, 60})),
                       expectedOverlay({80, 60}, 1, /*hasBand=*/true, nullptr));
}

TEST_F(ThumbnailOverlayTest, IsTheHostsWithoutAFormatVersion) {
    for (const Size size : {Size{80, 60}, {160, 120}, {41, 41}}) {
        const ImageRef image = overlay(newClip(125), size);
        const ImageRef hosts = vexo::durationBadge(125, size);
        ASSERT_EQ(image == nullptr, hosts == nullptr) << size.width;
        if (image) {
            EXPECT_EQ(drawn(image).pixels, drawn(hosts).pixels) << size.width;
        }
    }
    EXPECT_NE(overlay(newClip(125), {80, 60}), nullptr);
}

TEST_F(ThumbnailOverlayTest, IsTheHostsWithoutAHeight) {
    for (const double height : {0.0, -0.0, -1.0, -infinity, notANumber})
        EXPECT_EQ(overlay(newProjectMovie(125), {160, height}), nullptr) << height;
}

TEST_F(ThumbnailOverlayTest, OfAnyHeightIsAsLargeAsWasAsked) {
    for (const double height : {1.0, 5.0, 11.0, 12.0, 13.0, 19.0})
        expectOverlay({80, height}, 0, /*hasBand=*/true);
}

TEST_F(ThumbnailOverlayTest, OfASizeThatCannotBeDrawnIsNotDrawable) {
    for (const Size size : {Size{infinity, 90}, {1e9, 1e9}, {160, infinity}, {160, 0.5}}) {
        const ImageRef image = overlay(newProjectMovie(125), size);
        ASSERT_NE(image, nullptr) << size.width << " x " << size.height;
        EXPECT_EQ(image->size(), size);
        EXPECT_FALSE(image->isValid());
    }
}

TEST_F(ThumbnailOverlayTest, IsDrawnAfreshEachTime) {
    const auto movie = newProjectMovie(125);
    const ImageRef first = overlay(movie, {160, 120});
    EXPECT_NE(first, overlay(movie, {160, 120}));

    movie->setAttribute(126.0, vexo::VXMediaObjectDurationKey);
    EXPECT_NE(drawn(overlay(movie, {160, 120})).pixels, drawn(first).pixels);
}

TEST_F(ThumbnailOverlayTest, IsMadeAndDrawnOnManyThreadsAtOnce) {
    const auto movie = newProjectMovie(125);
    const auto clip = newClip(125);
    const auto expected = drawn(overlay(movie, {160, 120})).pixels;
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&] {
            for (int repeat = 0; repeat < 10; ++repeat) {
                EXPECT_EQ(drawn(overlay(movie, {160, 120})).pixels, expected);
                EXPECT_TRUE(overlay(clip, {160, 120})->isValid());
            }
        });
    }
    for (auto& thread : threads)
        thread.join();
}

}  // namespace
}  // namespace reelix
