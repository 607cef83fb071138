#include "platform/linux/drawing/VectorCheck.h"

#include <gtest/gtest.h>

#include <string>
#include <string_view>

#include "platform/Image.h"

namespace platform {
namespace {

const std::string beginning =
    "<svg xmlns='http://www.w3.org/2000/svg' xmlns:xlink='http://www.w3.org/1999/xlink' "
    "xmlns:xi='http://www.w3.org/2001/XInclude' width='4' height='4'>";
const std::string entity = "<!DOCTYPE svg [<!ENTITY e 'text'>]>";

std::string svg(const std::string& content) {
    return beginning + content + "</svg>";
}

std::string utf16(std::string_view ascii) {
    std::string text = "\xff\xfe";
    for (const char c : ascii)
        (text += c) += '\0';
    return text;
}

// What the check says and what becomes of the picture are one.
bool isHarmless(std::string_view text) {
    const auto bytes = std::as_bytes(std::span(text));
    const bool isHarmless = isHarmlessVector(bytes);
    EXPECT_EQ(pictureWithData(bytes)->isDrawable(), isHarmless) << text.substr(0, 200);
    return isHarmless;
}

TEST(VectorCheck, ShapesAndReferencesWithinThePictureAreHarmless) {
    EXPECT_TRUE(isHarmless(svg("<rect id='a' width='2' height='2'/><use xlink:href='#a'/><use href='#a'/>")));
    EXPECT_TRUE(isHarmless("<?xml version='1.0' encoding='utf-8'?>" + svg("<title>größer</title>")));
    EXPECT_TRUE(isHarmless("\xef\xbb\xbf<!DOCTYPE svg>" + svg("")));
    EXPECT_TRUE(isHarmless(svg("<a href='https://data:80/'/>")));
}

TEST(VectorCheck, EntitiesAreRefusedInEveryEncoding) {
    EXPECT_FALSE(isHarmless(entity + svg("&e;")));
    EXPECT_FALSE(isHarmless("<!DOCTYPE svg [<!ENTITY % e 'text'>]>" + svg("")));
    EXPECT_FALSE(isHarmless(utf16(entity + svg("&e;"))));
    EXPECT_FALSE(
        isHarmless("<?xml version='1.0' encoding='UTF-7'?>"
                   "<!DOCTYPE svg [+ADwAIQ-ENTITY e 'text'>]>" +
                   svg("&e;")));
}

TEST(VectorCheck, OtherEncodingsAreRefused) {
    EXPECT_FALSE(isHarmless(utf16(svg(""))));
    EXPECT_FALSE(isHarmless(svg("<title>\xe4</title>")));
    EXPECT_FALSE(isHarmless("<?xml version='1.0' encoding='ISO-8859-1'?>" + svg("")));
}

TEST(VectorCheck, EmbeddedFilesAreRefusedHoweverTheyAreSpelled) {
    for (const std::string reference : {"data:image/png;base64,", "&#100;ata:,", " DATA:,", "da&#10;ta:,",
                                        "&#1;data:,", "d\na\nt\na\n:,"}) {
        EXPECT_FALSE(isHarmless(svg("<image xlink:href='" + reference + "'/>"))) << reference;
        EXPECT_FALSE(isHarmless(svg("<xi:include href='" + reference + "'/>"))) << reference;
    }
}

TEST(VectorCheck, MoreElementsThanAnyIconHasAreRefused) {
    std::string shapes;
    for (int i = 0; i < 20'000; ++i)
        shapes += "<g/>";
    EXPECT_FALSE(isHarmless(svg(shapes)));
    EXPECT_TRUE(isHarmless(svg(shapes.substr(4))));
}

TEST(VectorCheck, MoreTextThanAnyIconShowsIsRefused) {
    const std::string text(4096, 'x');
    EXPECT_TRUE(isHarmless(svg("<text>" + text + "</text><title>" + text + "</title>")));
    EXPECT_FALSE(isHarmless(svg("<text>" + text + "</text><text>x</text>")));
    EXPECT_FALSE(isHarmless(svg("<text><tspan>x</tspan>" + text + "</text>")));
}

TEST(VectorCheck, WhatIsLargerThanAnyIconIsRefused) {
    const std::string rest = svg("<title></title>");
    const std::string title(1024 * 1024 - rest.size(), 'x');
    EXPECT_TRUE(isHarmless(svg("<title>" + title + "</title>")));
    EXPECT_FALSE(isHarmless(svg("<title>x" + title + "</title>")));
}

TEST(VectorCheck, WhatIsNoXMLIsRefused) {
    for (const std::string text : {"", "no picture", "<svg", "<svg></g>", "<svg/><svg/>"})
        EXPECT_FALSE(isHarmless(text)) << text;
}

}  // namespace
}  // namespace platform
