#include "platform/URL.h"

#include <glib.h>
#include <gtest/gtest.h>

#include <random>

namespace platform {
namespace {

std::string textOf(std::string path) {
    return URL::fileURLWithPath(std::move(path)).absoluteString();
}

// "nil" when the text is no file URL.
std::string pathOf(std::string_view text) {
    const auto url = URL::fileURLWithString(text);
    return url ? url->path() : "nil";
}

TEST(URLTest, APlainPathStandsForItself) {
    EXPECT_EQ(textOf("/Movies/a-b_c.d~1.mov"), "file:///Movies/a-b_c.d~1.mov");
    EXPECT_EQ(textOf("/a!$&'()*+,=:@"), "file:///a!$&'()*+,=:@");
}

TEST(URLTest, EverythingElseIsEscaped) {
    EXPECT_EQ(textOf("/My Movies/100%.mov"), "file:///My%20Movies/100%25.mov");
    EXPECT_EQ(textOf("/2008-12-31 23;59;59?#[]"), "file:///2008-12-31%2023%3B59%3B59%3F%23%5B%5D");
    EXPECT_EQ(textOf("/é\xFF\n"), "file:///%C3%A9%FF%0A");
}

TEST(URLTest, AFolderHasNoSlashAtItsEnd) {
    EXPECT_EQ(textOf("/a/b/"), "file:///a/b");
    EXPECT_EQ(textOf("/"), "file:///");
    EXPECT_EQ(textOf("//"), "file:///");
}

TEST(URLTest, TextsOfPathsAreThoseOfTheDesktopsPrograms) {
    for (int byte = 1; byte < 256; ++byte) {
        if (byte == '/')
            continue;
        const std::string path = std::string("/a") + static_cast<char>(byte) + "b";
        char* const expected = g_filename_to_uri(path.c_str(), nullptr, nullptr);
        EXPECT_EQ(textOf(path), expected) << byte;
        g_free(expected);
    }
}

TEST(URLTest, APathComesBackByteForByte) {
    std::mt19937 random(5);
    for (int i = 0; i < 20'000; ++i) {
        std::string path = "/";
        for (unsigned length = random() % 10; length > 0; --length)
            path += static_cast<char>(random() % 255 + 1);
        path += 'x';
        const URL url = URL::fileURLWithPath(path);
        const auto again = URL::fileURLWithString(url.absoluteString());
        ASSERT_TRUE(again) << url.absoluteString();
        ASSERT_EQ(*again, url) << url.absoluteString();
        ASSERT_EQ(again->path(), path);
    }
}

TEST(URLTest, TheLocalHostIsThisOne) {
    EXPECT_EQ(pathOf("file:///a/b"), "/a/b");
    EXPECT_EQ(pathOf("file://localhost/a/b"), "/a/b");
    EXPECT_EQ(pathOf("FILE://LocalHost/a/b"), "/a/b");
}

TEST(URLTest, OtherHostsAndSchemesAreRefused) {
    for (const char* text :
         {"", "file:", "file://", "file:/a", "/a", "a", "http:///a", "file://server/a", "file://localhost",
          "file://localhost.com/a", "file://localhost:80/a", "files:///a"})
        EXPECT_EQ(pathOf(text), "nil") << text;
}

TEST(URLTest, ATrailingSlashIsDropped) {
    EXPECT_EQ(pathOf("file:///a/b/"), "/a/b");
    EXPECT_EQ(pathOf("file:///a/b//"), "/a/b");
    EXPECT_EQ(pathOf("file:///"), "/");
    EXPECT_EQ(pathOf("file:////"), "/");
}

TEST(URLTest, EscapesAreReadInAnyCase) {
    EXPECT_EQ(pathOf("file:///a%20%c3%A9%25"), "/a é%");
    EXPECT_EQ(pathOf("file:///%61"), "/a");
}

TEST(URLTest, BadEscapesAreRefused) {
    for (const char* text : {"file:///%", "file:///a%2", "file:///%G0", "file:///%0G", "file:///% 1",
                             "file:///%-1", "file:///%00", "file:///a%2Fb", "file:///a/b%2f"})
        EXPECT_EQ(pathOf(text), "nil") << text;
}

TEST(URLTest, QueriesFragmentsAndNulAreRefused) {
    EXPECT_EQ(pathOf("file:///a?b"), "nil");
    EXPECT_EQ(pathOf("file:///a#b"), "nil");
    EXPECT_EQ(pathOf(std::string_view("file:///a\0b", 11)), "nil");
}

TEST(URLTest, BytesThatShouldHaveBeenEscapedStandForThemselves) {
    EXPECT_EQ(pathOf("file:///My Movies/é\xFF"), "/My Movies/é\xFF");
}

}  // namespace
}  // namespace platform
