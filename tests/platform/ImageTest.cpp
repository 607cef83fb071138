#include "platform/Image.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <thread>

#include "tests/support/HostEnvironment.h"
#include "tests/support/Pixels.h"
#include "tests/support/TemporaryFolder.h"

namespace platform {
namespace {

using testing::Each;
using testing_support::opaqueBlue;
using testing_support::opaqueRed;
using testing_support::pixel;
using testing_support::TemporaryFolder;
using testing_support::transparent;

std::shared_ptr<const Picture> pictureOf(std::string_view text) {
    return pictureWithData(std::as_bytes(std::span(text)));
}

std::string svg(std::string_view attributes, std::string_view content) {
    return "<svg xmlns='http://www.w3.org/2000/svg' xmlns:xlink='http://www.w3.org/1999/xlink' " +
           std::string(attributes) + ">" + std::string(content) + "</svg>";
}

// Red on the left, blue on the right.
std::string twoColours(std::string_view attributes = "width='4' height='2'") {
    return svg(attributes,
               "<rect width='2' height='2' fill='#f00'/><rect x='2' width='2' height='2' fill='#00f'/>");
}

Bitmap redBesideBlue() {
    return {2, 1, {opaqueRed, opaqueBlue}};
}

std::shared_ptr<const Picture> pngPictureOf(const Bitmap& bitmap) {
    return pictureWithData(pngData(bitmap));
}

auto startOfImageData(std::vector<std::byte>& png) {
    const std::string_view name = "IDAT";
    const auto marker = std::as_bytes(std::span(name));
    return std::search(png.begin(), png.end(), marker.begin(), marker.end());
}

TEST(Image, TakesItsSizeFromThePicture) {
    EXPECT_EQ(Image(pictureOf(twoColours())).size(), (Size{4, 2}));
}

TEST(Image, KeepsItsSizeOnceItIsGivenOne) {
    Image image(pictureOf(twoColours()));
    image.setSize({});
    EXPECT_EQ(image.size(), Size());
}

TEST(Image, WithoutAPictureHasNoSize) {
    EXPECT_EQ(Image(nullptr).size(), Size());
}

TEST(Image, ACopyIsAnotherObjectWithTheSamePictureNameSizeAndFlag) {
    Image image(pictureOf(twoColours()), "two");
    image.setSize({16, 16});
    image.setScalesWhenResized(true);

    const ImageRef copy = image.copy();

    EXPECT_NE(copy.get(), &image);
    EXPECT_EQ(copy->picture(), image.picture());
    EXPECT_EQ(copy->name(), "two");
    EXPECT_EQ(copy->size(), (Size{16, 16}));
    EXPECT_TRUE(copy->scalesWhenResized());
}

TEST(Image, ChangingACopyLeavesTheOriginalAlone) {
    Image image(pictureOf(twoColours()));
    image.copy()->setSize({16, 16});
    EXPECT_EQ(image.size(), (Size{4, 2}));
}

TEST(Image, IsValidOnlyWithAPictureThatCanBeDrawn) {
    EXPECT_TRUE(Image(pictureOf(twoColours())).isValid());
    EXPECT_FALSE(Image(pictureOf("<svg")).isValid());
    EXPECT_FALSE(Image(nullptr).isValid());
}

TEST(Picture, SVGIsSizedInPointsByWidthAndHeight) {
    EXPECT_EQ(pictureOf(twoColours("width='32' height='16' viewBox='0 0 4 2'"))->naturalSize(),
              (Size{32, 16}));
    EXPECT_EQ(pictureOf(twoColours("width='1in' height='12px'"))->naturalSize(), (Size{96, 12}));
}

TEST(Picture, KeepsItsOwnBytes) {
    std::string text = twoColours();
    const auto picture = pictureOf(text);
    text.assign(text.size(), ' ');
    EXPECT_TRUE(picture->isDrawable());
    EXPECT_EQ(picture->naturalSize(), (Size{4, 2}));
}

TEST(Picture, IsTheSameWhicheverThreadAsksFirst) {
    const auto picture = pictureOf(twoColours());
    std::vector<std::jthread> threads;
    std::array<Size, 4> sizes;
    for (Size& size : sizes)
        threads.emplace_back([&] { size = picture->naturalSize(); });
    threads.clear();
    EXPECT_THAT(sizes, Each(Size{4, 2}));
}

TEST(Picture, SVGWithoutWidthAndHeightIsSizedByItsViewBox) {
    EXPECT_EQ(pictureOf(twoColours("viewBox='0 0 4 2'"))->naturalSize(), (Size{4, 2}));
}

TEST(Picture, SVGOfUnknownSizeIsNotDrawable) {
    EXPECT_FALSE(pictureOf(twoColours(""))->isDrawable());
}

TEST(Picture, SVGIsCrispAtEverySize) {
    const auto picture = pictureOf(twoColours());
    for (int scale : {1, 7, 96}) {
        const auto bitmap = picture->draw(4 * scale, 2 * scale);
        ASSERT_TRUE(bitmap);
        ASSERT_EQ(bitmap->pixels.size(), std::size_t(8 * scale * scale));
        for (int y = 0; y < bitmap->height; ++y) {
            for (int x = 0; x < bitmap->width; ++x)
                ASSERT_EQ(pixel(*bitmap, x, y), x < 2 * scale ? opaqueRed : opaqueBlue) << x << ", " << y;
        }
    }
}

TEST(Picture, SVGIsTheSameWhenItIsDrawnAgain) {
    const auto picture = pictureOf(twoColours());
    std::map<std::pair<int, int>, Bitmap> drawn;
    for (int repeat = 0; repeat < 3; ++repeat) {
        for (const auto& [width, height] : {std::pair(4, 2), {8, 4}, {8, 2}, {4, 4}, {12, 6}, {400, 200}}) {
            const Bitmap bitmap = picture->draw(width, height).value();
            const auto known = drawn.emplace(std::pair(width, height), bitmap).first;
            EXPECT_EQ(bitmap.width, width);
            EXPECT_EQ(bitmap.height, height);
            EXPECT_EQ(bitmap.pixels, known->second.pixels);
        }
    }
}

TEST(Picture, FillsSizesOfOtherProportionsWhole) {
    for (const auto& picture : {pictureOf(twoColours()), pngPictureOf(redBesideBlue())}) {
        const auto bitmap = picture->draw(2, 12);
        ASSERT_TRUE(bitmap);
        EXPECT_EQ(pixel(*bitmap, 0, 0), opaqueRed);
        EXPECT_EQ(pixel(*bitmap, 1, 11), opaqueBlue);
    }
}

TEST(Picture, WhatAnSVGLeavesFreeIsTransparent) {
    const auto bitmap = pictureOf(svg("width='2' height='2'", ""))->draw(8, 8);
    ASSERT_TRUE(bitmap);
    EXPECT_THAT(bitmap->pixels, Each(transparent));
}

TEST(Picture, HalfTransparentColoursArePremultiplied) {
    const auto picture =
        pictureOf(svg("width='2' height='2'", "<rect width='2' height='2' fill='#fff' opacity='.5'/>"));
    const auto bitmap = picture->draw(2, 2);
    ASSERT_TRUE(bitmap);
    EXPECT_THAT(bitmap->pixels, Each(testing::AnyOf(0x80808080u, 0x7f7f7f7fu)));
}

TEST(Picture, PNGKeepsEveryPixel) {
    const Bitmap original{2, 2, {opaqueRed, opaqueBlue, transparent, 0x80800000}};
    const auto picture = pngPictureOf(original);
    ASSERT_TRUE(picture->isDrawable());
    EXPECT_EQ(picture->naturalSize(), (Size{2, 2}));
    EXPECT_EQ(picture->draw(2, 2)->pixels, original.pixels);
}

TEST(Picture, EnlargedPNGDoesNotFadeAtItsEdges) {
    const auto bitmap = pngPictureOf(redBesideBlue())->draw(64, 32);
    ASSERT_TRUE(bitmap);
    EXPECT_EQ(pixel(*bitmap, 0, 0), opaqueRed);
    EXPECT_EQ(pixel(*bitmap, 63, 31), opaqueBlue);
}

TEST(Picture, DamagedDataIsNotDrawable) {
    std::vector<std::byte> shortPNG = pngData(redBesideBlue());
    shortPNG.resize(shortPNG.size() / 2);
    std::vector<std::byte> brokenPNG = pngData(redBesideBlue());
    *(startOfImageData(brokenPNG) + 4) ^= std::byte{0xff};

    for (const auto& picture :
         {pictureWithData({}), pictureOf("no picture"), pictureOf(twoColours().substr(0, 90)),
          pictureWithData(shortPNG), pictureWithData(brokenPNG)}) {
        ASSERT_TRUE(picture);
        EXPECT_FALSE(picture->isDrawable());
        EXPECT_FALSE(picture->draw(16, 16));
        EXPECT_EQ(picture->naturalSize(), Size());
    }
}

TEST(Picture, EveryBeginningOfAPNGIsHarmless) {
    const std::vector<std::byte> png = pngData(redBesideBlue());
    for (std::size_t length = 0; length < png.size(); ++length)
        ASSERT_TRUE(pictureWithData(std::span(png).first(length)));
}

TEST(Picture, HugeSVGIsNotDrawable) {
    EXPECT_TRUE(pictureOf(twoColours("width='16384' height='4'"))->isDrawable());
    EXPECT_FALSE(pictureOf(twoColours("width='16385' height='4'"))->isDrawable());
    EXPECT_FALSE(pictureOf(twoColours("width='16384' height='16384'"))->isDrawable());
    EXPECT_FALSE(pictureOf(twoColours("width='1e300' height='4'"))->isDrawable());
    EXPECT_FALSE(pictureOf(twoColours("width='0' height='0'"))->isDrawable());
}

TEST(Picture, HugePNGIsRefusedBeforeItIsDecoded) {
    std::vector<std::byte> png = pngData(redBesideBlue());
    png[16] = std::byte{0x7f};  // the first byte of the declared width
    EXPECT_FALSE(pictureWithData(png)->isDrawable());
}

TEST(Picture, IsNotDrawnAtImpossibleSizes) {
    const auto picture = pictureOf(twoColours());
    EXPECT_FALSE(picture->draw(0, 16));
    EXPECT_FALSE(picture->draw(16, -1));
    EXPECT_FALSE(picture->draw(16385, 1));
    EXPECT_FALSE(picture->draw(16384, 16384));
}

TEST(Picture, SVGLoadsNoOtherFile) {
    const TemporaryFolder folder;
    const std::vector<std::byte> png = pngData(redBesideBlue());
    const std::string other =
        folder.writeFile("other.png", {reinterpret_cast<const char*>(png.data()), png.size()});
    for (const std::string& reference : {other, "file://" + other}) {
        const auto picture =
            pictureOf(svg("width='2' height='1'", "<image width='2' height='1' href='" + reference +
                                                      "' xlink:href='" + reference + "'/>"));
        const auto bitmap = picture->draw(2, 1);
        ASSERT_TRUE(bitmap);
        EXPECT_THAT(bitmap->pixels, Each(transparent));
    }
}

TEST(Picture, SVGIncludesNoOtherFile) {
    const TemporaryFolder folder;
    const std::string other = folder.writeFile("other.svg", twoColours());
    const auto picture = pictureOf(svg("width='4' height='2' xmlns:xi='http://www.w3.org/2001/XInclude'",
                                       "<xi:include href='file://" + other + "'/>"));
    const auto bitmap = picture->draw(4, 2);
    EXPECT_THAT(bitmap.value_or(Bitmap{}).pixels, Each(transparent));
}

TEST(Picture, SVGThatDeclaresEntitiesIsRefused) {
    EXPECT_FALSE(pictureOf("<!DOCTYPE svg [<!ENTITY red '#f00'>]>" + twoColours())->isDrawable());
    EXPECT_TRUE(pictureOf("<!DOCTYPE svg>" + twoColours())->isDrawable());
}

TEST(Picture, CompressedSVGIsRefused) {
    EXPECT_FALSE(pictureOf("\x1f\x8b\x08")->isDrawable());
}

TEST(Picture, DrawsOnManyThreadsAtOnce) {
    for (const auto& picture : {pictureOf(twoColours()), pngPictureOf(redBesideBlue())}) {
        const auto expected = picture->draw(32, 16)->pixels;
        std::vector<std::thread> threads;
        for (int i = 0; i < 4; ++i) {
            threads.emplace_back([&] {
                for (int repeat = 0; repeat < 50; ++repeat)
                    EXPECT_EQ(picture->draw(32, 16)->pixels, expected);
            });
        }
        for (auto& thread : threads)
            thread.join();
    }
}

class PictureFileTest : public testing::Test {
  protected:
    const testing_support::HostEnvironment host_;
    const TemporaryFolder& folder_ = host_.home;
};

TEST_F(PictureFileTest, IsReadAtOnce) {
    const std::string path = folder_.writeFile("icon.svg", twoColours());
    const auto picture = pictureWithContentsOfFile(path);
    folder_.remove("icon.svg");
    ASSERT_TRUE(picture);
    EXPECT_TRUE(picture->isDrawable());
    EXPECT_TRUE(picture->draw(4, 2));
}

TEST_F(PictureFileTest, IsToldByItsContentNotItsName) {
    EXPECT_TRUE(pictureWithContentsOfFile(folder_.writeFile("icon.png", twoColours()))->isDrawable());
}

TEST_F(PictureFileTest, ThatIsDamagedGivesAPictureThatIsNotDrawable) {
    const auto picture = pictureWithContentsOfFile(folder_.writeFile("icon.svg", "<svg"));
    ASSERT_TRUE(picture);
    EXPECT_FALSE(picture->isDrawable());
}

TEST_F(PictureFileTest, WhatIsNoPlainFileGivesNoPicture) {
    EXPECT_EQ(pictureWithContentsOfFile(folder_.path("missing.svg")), nullptr);
    EXPECT_EQ(pictureWithContentsOfFile(folder_.makeFolder("folder.svg")), nullptr);
    EXPECT_EQ(pictureWithContentsOfFile(folder_.makeFifo("pipe.svg")), nullptr);
    EXPECT_EQ(pictureWithContentsOfFile(folder_.makeLink("loop.svg", folder_.path("loop.svg"))), nullptr);
    EXPECT_EQ(pictureWithContentsOfFile(""), nullptr);
}

TEST_F(PictureFileTest, IsNotReadWhenItIsHuge) {
    const std::string path = folder_.writeFile("icon.svg", twoColours());
    std::filesystem::resize_file(path, 1ull << 40);
    EXPECT_EQ(pictureWithContentsOfFile(path), nullptr);
}

TEST(PNGData, IsEmptyForABitmapThatIsNotWhole) {
    EXPECT_TRUE(pngData({}).empty());
    EXPECT_TRUE(pngData({2, 2, {opaqueRed}}).empty());
    EXPECT_TRUE(pngData({-1, -1, {opaqueRed}}).empty());
}

}  // namespace
}  // namespace platform
