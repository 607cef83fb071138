#include "platform/Drawing.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <thread>

#include "platform/Duration.h"
#include "tests/platform/OddNumbers.h"
#include "tests/support/Pixels.h"

namespace platform {
namespace {

using testing::Each;
using testing::Not;
using testing_support::areAlike;
using testing_support::blended;
using testing_support::infinity;
using testing_support::notANumber;
using testing_support::opaqueBlue;
using testing_support::opaqueRed;
using testing_support::pixel;
using testing_support::transparent;

constexpr double oddNumbers[] = {notANumber, infinity, -infinity, 1e9, -1e9, 1e308, -1e308, 0, -1, 0.5};

constexpr Color red{1, 0, 0, 1};
constexpr Color clear{0, 0, 0, 0};

// At `scale` pixels a point.
Bitmap pixelsOf(Drawing& drawing, int scale = 1) {
    const ImageRef image = drawing.image();
    return image->picture()
        ->draw(int(image->size().width) * scale, int(image->size().height) * scale)
        .value();
}

// The pixels that are not transparent, as the smallest rectangle around them; y from the top.
struct Extent {
    int left = INT_MAX, top = INT_MAX, right = 0, bottom = 0;
    bool operator==(const Extent&) const = default;
};
void PrintTo(const Extent& extent, std::ostream* stream) {
    *stream << extent.left << ".." << extent.right << " x " << extent.top << ".." << extent.bottom;
}

Extent extentOf(const Bitmap& bitmap) {
    Extent extent;
    for (int y = 0; y < bitmap.height; ++y) {
        for (int x = 0; x < bitmap.width; ++x) {
            if (pixel(bitmap, x, y) == transparent)
                continue;
            extent = {std::min(extent.left, x), std::min(extent.top, y), std::max(extent.right, x + 1),
                      std::max(extent.bottom, y + 1)};
        }
    }
    return extent;
}

AttributedString boldText(std::string text, double size = 10) {
    return {std::move(text), boldSystemFontOfSize(size), whiteColor};
}

Image redBesideBlueImage() {
    return Image(pictureWithBitmap({2, 1, {opaqueRed, opaqueBlue}}));
}

TEST(Drawing, OfNothingIsTransparentAndAsLargeAsWasSaid) {
    Drawing drawing({6, 4});
    EXPECT_EQ(drawing.size(), (Size{6, 4}));
    const ImageRef image = drawing.image();
    EXPECT_EQ(image->size(), (Size{6, 4}));
    EXPECT_TRUE(image->isValid());
    EXPECT_THAT(image->picture()->draw(6, 4).value().pixels, Each(transparent));
}

TEST(Drawing, EachMakesAnImageOfItsOwn) {
    EXPECT_NE(Drawing({6, 4}).image(), Drawing({6, 4}).image());
}

TEST(Drawing, CountsFromTheLowerLeftCorner) {
    Drawing drawing({6, 4});
    drawing.setColor(red);
    drawing.fillRect({1, 0, 2, 1});
    EXPECT_EQ(extentOf(pixelsOf(drawing)), (Extent{1, 3, 3, 4}));
}

TEST(Drawing, IsExactAtEveryWholeScale) {
    for (const int scale : {1, 2, 3}) {
        Drawing drawing({6, 4});
        drawing.setColor(red);
        drawing.fillRect({1, 1, 2, 2});
        const Bitmap bitmap = pixelsOf(drawing, scale);
        for (int y = 0; y < bitmap.height; ++y) {
            for (int x = 0; x < bitmap.width; ++x) {
                const bool isInside = x / scale >= 1 && x / scale < 3 && y / scale >= 1 && y / scale < 3;
                ASSERT_EQ(pixel(bitmap, x, y), isInside ? opaqueRed : transparent) << x << ", " << y;
            }
        }
    }
}

TEST(Drawing, FillsInBlackBeforeAColourIsSet) {
    Drawing drawing({1, 1});
    drawing.fillRect({0, 0, 1, 1});
    EXPECT_THAT(pixelsOf(drawing).pixels, Each(0xff000000u));
}

TEST(Drawing, ARectangleTakesItsColourOnWhateverWasThere) {
    Drawing drawing({2, 1});
    drawing.setColor(red);
    drawing.fillRect({0, 0, 2, 1});
    drawing.setColor(clear);
    drawing.fillRect({1, 0, 1, 1});
    EXPECT_EQ(pixelsOf(drawing).pixels, (std::vector{opaqueRed, transparent}));
}

TEST(Drawing, WhatLiesOutsideLeavesNoMark) {
    Drawing drawing({6, 4});
    drawing.setColor(red);
    for (const Rect& rect : {Rect{0, -1, 6, 1}, Rect{0, 4, 6, 1}, Rect{-2, 0, 2, 4}, Rect{6, 0, 2, 4}}) {
        drawing.fillRect(rect);
        drawing.fillRoundedRect(rect, 1);
        drawing.drawImage(redBesideBlueImage(), rect);
        drawing.drawString(boldText("|||"), rect);
    }
    EXPECT_THAT(pixelsOf(drawing).pixels, Each(transparent));
}

TEST(Drawing, ARectangleThatIsTooLargeFillsTheImage) {
    Drawing drawing({6, 4});
    drawing.setColor(red);
    drawing.fillRect({-1e12, -1e12, 2e12, 2e12});
    EXPECT_THAT(pixelsOf(drawing).pixels, Each(opaqueRed));
}

TEST(Drawing, ARoundedRectangleLeavesItsCornersFreeAndMixesWithWhatIsThere) {
    Drawing drawing({16, 16});
    drawing.setColor({1, 1, 1, 1});
    drawing.fillRect({0, 0, 16, 8});
    drawing.setColor({0, 0, 0, 0.5});
    drawing.fillRoundedRect({0, 0, 16, 16}, 6);
    const Bitmap bitmap = pixelsOf(drawing);
    EXPECT_EQ(pixel(bitmap, 0, 0), transparent);
    EXPECT_EQ(pixel(bitmap, 0, 15), 0xffffffffu);
    EXPECT_THAT(pixel(bitmap, 8, 4) >> 24, testing::AnyOf(127u, 128u));
    EXPECT_EQ(pixel(bitmap, 8, 12) >> 24, 255u);
    EXPECT_NEAR(int(pixel(bitmap, 8, 12) & 255), 128, 1);
}

TEST(Drawing, ARadiusMayBeAnyNumber) {
    for (const double radius : oddNumbers) {
        Drawing drawing({8, 8});
        drawing.fillRoundedRect({0, 0, 8, 8}, radius);
        EXPECT_TRUE(drawing.image()->picture()->draw(8, 8)) << radius;
    }
}

TEST(Drawing, AnImageFillsItsRectangleAtEveryScale) {
    for (const int scale : {1, 2, 3}) {
        Drawing drawing({6, 4});
        drawing.drawImage(redBesideBlueImage(), {1, 1, 2, 1});
        const Bitmap bitmap = pixelsOf(drawing, scale);
        EXPECT_EQ(extentOf(bitmap), (Extent{scale, 2 * scale, 3 * scale, 3 * scale}));
        EXPECT_EQ(pixel(bitmap, scale, 2 * scale), opaqueRed);
        EXPECT_EQ(pixel(bitmap, 3 * scale - 1, 3 * scale - 1), opaqueBlue);
    }
}

TEST(Drawing, AnImageIsDrawnOverWhatIsThere) {
    Drawing drawing({1, 1});
    drawing.setColor(red);
    drawing.fillRect({0, 0, 1, 1});
    drawing.drawImage(Image(pictureWithBitmap({1, 1, {0x80000080}})), {0, 0, 1, 1});
    const Bitmap bitmap = pixelsOf(drawing);
    EXPECT_NEAR(int(bitmap.pixels[0] >> 16 & 255), 127, 1);
    EXPECT_EQ(bitmap.pixels[0] & 255, 0x80u);
}

TEST(Drawing, AnImageThatCannotBeDrawnSpoilsNothing) {
    Drawing drawing({6, 4});
    drawing.setColor(red);
    drawing.drawImage(Image(pictureWithData({})), {0, 0, 6, 4});
    drawing.drawImage(Image(nullptr), {0, 0, 6, 4});
    drawing.fillRect({0, 0, 6, 1});
    EXPECT_EQ(extentOf(pixelsOf(drawing)), (Extent{0, 3, 6, 4}));
}

TEST(Drawing, ADrawingCanBeDrawnOnAnother) {
    Drawing inner({2, 2});
    inner.setColor(red);
    inner.fillRect({0, 0, 2, 2});
    Drawing outer({6, 4});
    outer.drawImage(*inner.image(), {4, 2, 2, 2});
    EXPECT_EQ(extentOf(pixelsOf(outer)), (Extent{4, 0, 6, 2}));
}

TEST(Drawing, OfASizeThatCannotBeDrawnIsNotDrawable) {
    std::vector<Size> sizes{{20000, 20}, {16000, 16000}};
    for (const double number : oddNumbers) {
        sizes.push_back({number, 20});
        sizes.push_back({20, number});
    }
    for (const Size& size : sizes) {
        Drawing drawing(size);
        drawing.fillRect({0, 0, size.width, size.height});
        drawing.drawString(boldText("0:00"), {size.width - 20, 0, 20, 12});
        const ImageRef image = drawing.image();
        EXPECT_FALSE(image->isValid()) << size.width << " x " << size.height;
        EXPECT_FALSE(image->picture()->draw(20, 20)) << size.width << " x " << size.height;
    }
}

TEST(Drawing, OddNumbersDrawNothingOrFillTheImage) {
    for (const double position : oddNumbers) {
        for (const double extent : oddNumbers) {
            Drawing drawing({20, 20});
            for (const Rect& rect : {Rect{position, 1, extent, 9}, Rect{1, position, 9, extent}}) {
                drawing.fillRect(rect);
                drawing.fillRoundedRect(rect, 3);
                drawing.drawImage(redBesideBlueImage(), rect);
                drawing.drawString(boldText("0:00"), rect);
            }
            EXPECT_EQ(pixelsOf(drawing).pixels.size(), 400u) << position << ", " << extent;
        }
    }
}

TEST(Drawing, StaysDrawableAfterOddNumbers) {
    Drawing drawing({6, 4});
    drawing.fillRect({notANumber, 0, 1, 1});
    drawing.drawImage(redBesideBlueImage(), {0, 0, infinity, 1e9});
    drawing.drawString(boldText("0:00", notANumber), {0, 0, 6, 4});
    drawing.setColor(red);
    drawing.fillRect({0, 0, 6, 1});
    EXPECT_EQ(extentOf(pixelsOf(drawing)), (Extent{0, 3, 6, 4}));
}

TEST(Drawing, TextIsAsLargeAsItsFontAndGrowsWithIt) {
    const Size ten = boldText("12:34").size();
    const Size twenty = boldText("12:34", 20).size();
    EXPECT_GT(ten.width, 15);
    EXPECT_GE(ten.height, 10);
    EXPECT_LT(ten.height, 16);
    EXPECT_NEAR(twenty.width, 2 * ten.width, 0.1);
    EXPECT_NEAR(twenty.height, 2 * ten.height, 0.1);
}

TEST(Drawing, BoldTextIsDarkerThanPlain) {
    EXPECT_NE(AttributedString("12:34", {10, true}, whiteColor).size(),
              AttributedString("12:34", {10, false}, whiteColor).size());
}

TEST(Drawing, TextFillsTheWidthItWasMeasuredAtEveryScale) {
    for (const int scale : {1, 2, 3, 8}) {
        const AttributedString text = boldText("12:34");
        const Size size = text.size();
        Drawing drawing({60, 20});
        drawing.drawString(text, {10, 4, size.width, size.height});
        const Extent extent = extentOf(pixelsOf(drawing, scale));
        EXPECT_NEAR(extent.left / double(scale), 10, 1.5);
        EXPECT_NEAR(extent.right / double(scale), 10 + size.width, 1.5);
        EXPECT_GE(extent.top / double(scale), 16 - std::ceil(size.height));
        EXPECT_LE(extent.bottom / double(scale), 16);
    }
}

TEST(Drawing, TextIsGreyAtItsEdgesAndNeverColoured) {
    Drawing drawing({60, 20});
    drawing.drawString(boldText("12:34"), {0, 0, 60, 20});
    const Bitmap bitmap = pixelsOf(drawing);
    EXPECT_THAT(bitmap.pixels, testing::Contains(0xffffffffu));
    for (const std::uint32_t value : bitmap.pixels)
        ASSERT_EQ(value, (value & 255) * 0x01010101u);
}

TEST(Drawing, TextBeginsAtTheTopOfItsRectangleAndEndsWhereThatDoes) {
    Drawing drawing({60, 40});
    drawing.drawString(boldText("WWWWWWWWWWWWWWWWWWWW"), {10, 10, 20, 25});
    const Extent extent = extentOf(pixelsOf(drawing));
    EXPECT_GE(extent.left, 10);
    EXPECT_EQ(extent.right, 30);
    EXPECT_GE(extent.top, 5);
    EXPECT_LE(extent.bottom, 18);
}

TEST(Drawing, TextIsOneLineWhateverIsInIt) {
    using namespace std::string_literals;
    const double height = boldText("12:34").size().height;
    EXPECT_NEAR(boldText("1\n2\r\n3\xE2\x80\xA9"s + "4").size().height, height, 1);
    EXPECT_NEAR(boldText("1 2 3 4 5 6 7 8 9 0 1 2 3 4 5 6").size().height, height, 0.01);
}

TEST(Drawing, TextMayHoldAnyBytes) {
    using namespace std::string_literals;
    for (const std::string& text : {""s, "\0"s, "a\0b"s, "\xff\xfe"s, "\xed\xa0\x80"s, "\u202E0:00"s, "%n%s"s,
                                    "\u0301\u0301\u0301"s, "\U0010FFFF"s, std::string(999, 'W')}) {
        Drawing drawing({20, 20});
        drawing.drawString(boldText(text), {0, 0, 20, 20});
        EXPECT_TRUE(drawing.image()->picture()->draw(20, 20)) << testing::PrintToString(text);
        EXPECT_GE(boldText(text).size().width, 0) << testing::PrintToString(text);
    }
}

TEST(Drawing, TextThatCannotBeDrawnTakesUpNothing) {
    for (const double size : {notANumber, infinity, -infinity, 1e9, 1001.0, 0.0, -1.0})
        EXPECT_EQ(boldText("12:34", size).size(), Size()) << size;
    EXPECT_EQ(boldText(std::string(100'000, 'W')).size(), Size());
}

TEST(Drawing, KeepsNoMoreTextThanAFew) {
    const Size first = boldText("0").size();
    for (int i = 0; i < 1000; ++i)
        ASSERT_GT(boldText(std::to_string(i)).size().width, 0);
    EXPECT_EQ(boldText("0").size(), first);
}

// What laying a drawing over a picture is to come to.
Bitmap laidOver(Bitmap ground, const Picture& picture) {
    const Bitmap drawn = picture.draw(ground.width, ground.height).value();
    for (std::size_t i = 0; i < drawn.pixels.size(); ++i)
        ground.pixels[i] = blended(drawn.pixels[i], ground.pixels[i]);
    return ground;
}

Bitmap redAndBlueGround(int width, int height) {
    Bitmap ground{width, height, {}};
    for (int i = 0; i < width * height; ++i)
        ground.pixels.push_back(i % 3 == 0 ? opaqueRed : i % 3 == 1 ? opaqueBlue : 0x40204010);
    return ground;
}

void expectLaidOverAsDrawn(const Picture& picture) {
    for (const auto& [width, height] : {std::pair(40, 20), std::pair(80, 40), std::pair(31, 17)}) {
        Bitmap bitmap = redAndBlueGround(width, height);
        const Bitmap expected = laidOver(bitmap, picture);
        ASSERT_TRUE(picture.drawOver(bitmap));
        for (std::size_t i = 0; i < expected.pixels.size(); ++i)
            ASSERT_TRUE(areAlike(bitmap.pixels[i], expected.pixels[i]))
                << i % std::size_t(width) << ", " << i / std::size_t(width) << " of " << width << std::hex
                << ": " << bitmap.pixels[i] << ", not " << expected.pixels[i];
    }
}

TEST(Drawing, LiesOverAPictureAsIfItWereDrawnByItself) {
    Drawing drawing({40, 20});
    drawing.setColor({0, 0, 0, 0.5});
    drawing.fillRect({0, 0, 40, 6});
    drawing.drawImage(redBesideBlueImage(), {2, 1, 10, 10});
    drawing.setColor(red);
    drawing.fillRect({4, 3, 10, 10});
    drawing.setColor({1, 1, 0, 0.25});
    drawing.fillRoundedRect({20, 2, 15, 12}, 4);
    drawing.drawString(boldText("2:05"), {18, 2, 40, 15});
    expectLaidOverAsDrawn(*drawing.image()->picture());
}

TEST(Drawing, WhatARectangleReplacedIsNotSeenOverAPictureEither) {
    Drawing drawing({40, 20});
    drawing.drawImage(redBesideBlueImage(), {0, 0, 30, 20});
    drawing.setColor({0, 0, 0, 0.5});
    drawing.fillRect({10, 5, 20, 10});
    drawing.setColor(clear);
    drawing.fillRect({12, 7, 5, 5});
    expectLaidOverAsDrawn(*drawing.image()->picture());
}

TEST(Drawing, EveryPictureLiesOverAnother) {
    expectLaidOverAsDrawn(*pictureWithBitmap({2, 1, {0x80400000, opaqueBlue}}));
    expectLaidOverAsDrawn(*Drawing({6, 4}).image()->picture());
}

// A picture of a plug-in's, which may draw whatever it likes.
class FixedPicture final : public Picture {
  public:
    explicit FixedPicture(Bitmap bitmap) : bitmap_(std::move(bitmap)) {}

    Size naturalSize() const override { return {4, 4}; }
    bool isDrawable() const override { return true; }
    std::optional<Bitmap> draw(int, int) const override { return bitmap_; }

  private:
    const Bitmap bitmap_;
};

TEST(Drawing, APictureThatDrawsItselfInAnotherSizeIsScaled) {
    Bitmap bitmap = redAndBlueGround(4, 4);
    EXPECT_TRUE(FixedPicture({1, 1, {opaqueBlue}}).drawOver(bitmap));
    EXPECT_EQ(pixel(bitmap, 1, 1), opaqueBlue);
}

TEST(Drawing, APictureThatDrawsItselfWithTooFewPixelsIsLeftOut) {
    const auto broken = std::make_shared<FixedPicture>(Bitmap{100, 100, {opaqueBlue}});
    Bitmap bitmap = redAndBlueGround(4, 4);
    EXPECT_FALSE(broken->drawOver(bitmap));
    EXPECT_EQ(bitmap.pixels, redAndBlueGround(4, 4).pixels);
    Drawing drawing({4, 4});
    drawing.drawImage(Image(broken), {0, 0, 4, 4});
    EXPECT_THAT(pixelsOf(drawing).pixels, Each(transparent));
}

TEST(Drawing, LiesOverNothingThatIsNoBitmap) {
    Drawing drawing({40, 20});
    drawing.fillRect({0, 0, 40, 20});
    const ImageRef image = drawing.image();
    for (const Bitmap& broken : {Bitmap{}, Bitmap{4, 4, {1, 2, 3}}, Bitmap{-1, -1, {1}}}) {
        Bitmap bitmap = broken;
        EXPECT_FALSE(image->picture()->drawOver(bitmap));
        EXPECT_FALSE(pictureWithBitmap({1, 1, {opaqueRed}})->drawOver(bitmap));
        EXPECT_EQ(bitmap.pixels, broken.pixels);
    }
    Bitmap bitmap = redAndBlueGround(4, 4);
    EXPECT_FALSE(Drawing({0, 4}).image()->picture()->drawOver(bitmap));
    EXPECT_FALSE(pictureWithBitmap({})->drawOver(bitmap));
    EXPECT_EQ(bitmap.pixels, redAndBlueGround(4, 4).pixels);
}

TEST(Drawing, IsMadeAndDrawnOnManyThreadsAtOnce) {
    const auto draw = [] {
        const AttributedString text = boldText("12:34");
        Drawing drawing({40, 20});
        drawing.setColor(red);
        drawing.fillRect({0, 0, 40, 10});
        drawing.drawImage(redBesideBlueImage(), {2, 2, 8, 4});
        drawing.drawString(text, {4, 4, text.size().width, text.size().height});
        return drawing.image();
    };
    const ImageRef shared = draw();
    const auto expected = shared->picture()->draw(40, 20)->pixels;
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&] {
            for (int repeat = 0; repeat < 25; ++repeat) {
                EXPECT_EQ(shared->picture()->draw(40, 20)->pixels, expected);
                EXPECT_EQ(draw()->picture()->draw(40, 20)->pixels, expected);
            }
        });
    }
    for (auto& thread : threads)
        thread.join();
}

struct DurationSample {
    double duration;
    long minutes;
    long seconds;
};

TEST(Duration, IsCutOffTowardZeroAndMinutesAreNotWrapped) {
    constexpr long largest = std::numeric_limits<long>::max();
    const DurationSample samples[] = {
        {0.9, 0, 0},
        {59.9, 0, 59},
        {60, 1, 0},
        {125.0, 2, 5},
        {3600, 60, 0},
        {86'399.99, 1439, 59},
        {1e300, largest, largest},
        {infinity, largest, largest},
    };
    for (const DurationSample& sample : samples) {
        const auto [minutes, seconds] = minutesAndSeconds(sample.duration);
        EXPECT_EQ(minutes, sample.minutes) << sample.duration;
        EXPECT_EQ(seconds, sample.seconds) << sample.duration;
    }
}

}  // namespace
}  // namespace platform
