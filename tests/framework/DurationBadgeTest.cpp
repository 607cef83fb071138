#include "framework/DurationBadge.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <limits>

#include "tests/support/HostEnvironment.h"

namespace vexo {
namespace {

using platform::Bitmap;
using platform::Size;

constexpr double infinity = std::numeric_limits<double>::infinity();
constexpr double notANumber = std::numeric_limits<double>::quiet_NaN();

std::uint32_t pixel(const Bitmap& bitmap, int x, int y) {
    return bitmap.pixels[std::size_t(y * bitmap.width + x)];
}

Bitmap pixelsOf(const platform::ImageRef& image, int scale = 1) {
    return image->picture()
        ->draw(int(image->size().width) * scale, int(image->size().height) * scale)
        .value();
}

int countOf(const Bitmap& bitmap, const std::function<bool(int x, int y)>& isCounted) {
    int count = 0;
    for (int y = 0; y < bitmap.height; ++y) {
        for (int x = 0; x < bitmap.width; ++x)
            count += pixel(bitmap, x, y) != 0 && isCounted(x, y);
    }
    return count;
}

class DurationBadgeTest : public testing::Test {
  protected:
    const testing_support::HostEnvironment environment;
};

TEST_F(DurationBadgeTest, IsAsLargeAsTheThumbnail) {
    const auto badge = durationBadge(125, {160, 120});
    ASSERT_NE(badge, nullptr);
    EXPECT_EQ(badge->size(), (Size{160, 120}));
    EXPECT_TRUE(badge->isValid());
}

TEST_F(DurationBadgeTest, LiesInTheLowerRightCornerAwayFromTheEdges) {
    for (const int scale : {1, 2, 3}) {
        const Bitmap bitmap = pixelsOf(durationBadge(125, {160, 120}), scale);
        const auto liesInCorner = [&](int x, int y) {
            return x >= 80 * scale && x < 156 * scale && y >= 100 * scale && y < 116 * scale;
        };
        EXPECT_GT(countOf(bitmap, liesInCorner), 300 * scale * scale);
        EXPECT_EQ(countOf(bitmap, std::not_fn(liesInCorner)), 0);
    }
}

TEST_F(DurationBadgeTest, IsDarkWithRoundedCornersAndWhiteText) {
    const Bitmap bitmap = pixelsOf(durationBadge(125, {160, 120}));
    EXPECT_LT(pixel(bitmap, 155, 115) >> 24, 100u);
    const std::uint32_t ground = pixel(bitmap, 154, 108);
    EXPECT_GT(ground >> 24, 150u);
    EXPECT_LT(ground & 255, 64u);
    EXPECT_THAT(bitmap.pixels, testing::Contains(0xffffffffu));
}

TEST_F(DurationBadgeTest, TellsTheDuration) {
    const Size size{160, 120};
    const auto pixels = [&](double duration) { return pixelsOf(durationBadge(duration, size)).pixels; };
    EXPECT_EQ(pixels(59.1), pixels(59.9));
    EXPECT_NE(pixels(59.9), pixels(60));
    EXPECT_NE(pixels(125), pixels(126));
}

TEST_F(DurationBadgeTest, IsNilWhereTheDurationIsNotKnown) {
    for (const double duration : {0.0, -1.0, notANumber, infinity, -infinity})
        EXPECT_EQ(durationBadge(duration, {160, 120}), nullptr) << duration;
}

TEST_F(DurationBadgeTest, IsNilForSizesThatAreNone) {
    for (const double none : {0.0, -1.0, -infinity, notANumber}) {
        EXPECT_EQ(durationBadge(125, {none, 120}), nullptr) << none;
        EXPECT_EQ(durationBadge(125, {160, none}), nullptr) << none;
    }
}

TEST_F(DurationBadgeTest, IsNilWhereItWouldCoverMuchOfTheThumbnail) {
    EXPECT_EQ(durationBadge(125, {60, 120}), nullptr);
    EXPECT_EQ(durationBadge(125, {160, 35.5}), nullptr);
    EXPECT_NE(durationBadge(125, {160, 36.5}), nullptr);
    EXPECT_NE(durationBadge(599, {80, 45}), nullptr);
}

TEST_F(DurationBadgeTest, IsNilWhereItsTextIsTooLong) {
    EXPECT_EQ(durationBadge(1e300, {160, 120}), nullptr);
}

TEST_F(DurationBadgeTest, OfAThumbnailThatIsTooLargeCannotBeDrawn) {
    for (const double number : {infinity, 1e9}) {
        const auto badge = durationBadge(125, {number, number});
        ASSERT_NE(badge, nullptr);
        EXPECT_FALSE(badge->isValid());
    }
}

TEST_F(DurationBadgeTest, WidthsThatAreNotWholeAreDrawn) {
    for (double width = 40; width < 130; width += 0.5) {
        const auto badge = durationBadge(125, {width, 90.5});
        EXPECT_TRUE(!badge || badge->isValid()) << width;
    }
}

}  // namespace
}  // namespace vexo
