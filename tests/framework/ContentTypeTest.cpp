#include "framework/metadata/ContentType.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <thread>

#include "tests/support/TemporaryFolder.h"

using namespace std::string_literals;
using namespace testing_support;
using namespace vexo;

namespace {

std::string typeNameOf(std::string_view beginning) {
    const FileType* type = typeOfContent(beginning);
    return type ? type->contentType : "none";
}

const std::string quickTimeMovie = "\0\0\0\x14"s + "ftypqt  " + std::string(8, '\0');

// The first atom of an ISO file.
std::string brands(const std::string& first, const std::string& others) {
    return "\0\0\0"s + static_cast<char>(16 + others.size()) + "ftyp" + first + "\0\0\0\0"s + others;
}

}  // namespace

TEST(ContentType, AMovieIsOne) {
    EXPECT_EQ(typeNameOf(quickTimeMovie), "com.norvale.quicktime-movie");
}

TEST(ContentType, TextPicturesAndProgramsAreWhatTheyAre) {
    EXPECT_EQ(typeNameOf("A text.\n"), "public.plain-text");
    EXPECT_EQ(typeNameOf("\x89PNG\r\n\x1a\n\0\0\0\rIHDR"s), "public.png");
    EXPECT_EQ(typeNameOf("%PDF-1.4\n"), "com.adobe.pdf");
    EXPECT_EQ(typeNameOf("#!/bin/sh\n"), "public.source-code");
}

TEST(ContentType, WhatNobodyKnowsHasNone) {
    EXPECT_EQ(typeNameOf(""), "none");
    EXPECT_EQ(typeNameOf("\0"s), "none");
    EXPECT_EQ(typeNameOf(std::string(4096, '\0')), "none");
    EXPECT_EQ(typeNameOf("\1\2\3\4\5\6\7"), "none");
}

TEST(ContentType, OfAMimeTypeThatTheTableLacksThereIsNone) {
    EXPECT_EQ(typeNameOf("\xd0\xcf\x11\xe0\xa1\xb1\x1a\xe1"), "none");
}

TEST(ContentType, ABrandThatNobodyKnowsGivesWayToTheOthers) {
    EXPECT_EQ(typeNameOf(brands("XYZW", "")), "none");
    EXPECT_EQ(typeNameOf(brands("XYZW", "abcdefgh")), "none");
    EXPECT_EQ(typeNameOf(brands("XYZW", "abcdmp42")), "public.mpeg-4");
    EXPECT_EQ(typeNameOf(brands("XYZW", "qt  mp42")), "com.norvale.quicktime-movie");
    EXPECT_EQ(typeNameOf(brands("heic", "mp42")), "public.heic");
}

TEST(ContentType, BrandsEndWhereTheirAtomDoes) {
    EXPECT_EQ(typeNameOf(brands("XYZW", "") + "mp42"), "none");
    EXPECT_EQ(typeNameOf("\xff\xff\xff\xff"s + "ftypXYZW\0\0\0\0mp4"s), "none");
    EXPECT_EQ(typeNameOf("\xff\xff\xff\xff"s + "ftypXYZW\0\0\0\0mp42"s), "public.mpeg-4");
    EXPECT_EQ(typeNameOf("\0\0\0\0ftypXYZW\0\0\0\0mp42"s), "none");
    EXPECT_EQ(typeNameOf("\0\0\0\x20"
                         "ftyp"s),
              "none");
}

TEST(ContentType, OnlyTheFirstBrandsAreTried) {
    std::string many;
    for (int i = 0; i < 1000; ++i)
        many += "abcd";
    const std::string size = "\0\0\x7f\xff"s;
    EXPECT_EQ(typeNameOf(size + "ftypXYZW\0\0\0\0"s + many + "mp42"), "none");
}

TEST(ContentType, ThreadsMayAskAtOnce) {
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i)
        threads.emplace_back([] {
            for (int j = 0; j < 100; ++j)
                EXPECT_EQ(typeNameOf(quickTimeMovie), "com.norvale.quicktime-movie");
        });
    for (std::thread& thread : threads)
        thread.join();
}

TEST(ContentTypeOfFile, IsThatOfItsBeginning) {
    const TemporaryFolder folder;
    const std::string movie = folder.writeFile("recording", quickTimeMovie + std::string(100'000, 'x'));
    EXPECT_EQ(typeOfContentOfFile(movie), typeForExtension("mov"));
    EXPECT_EQ(typeOfContentOfFile(folder.makeLink("link", movie)), typeForExtension("mov"));
}

TEST(ContentTypeOfFile, OnlyPlainFilesWithAContentHaveOne) {
    const TemporaryFolder folder;
    EXPECT_FALSE(typeOfContentOfFile(folder.path("missing")));
    EXPECT_FALSE(typeOfContentOfFile(folder.writeFile("empty")));
    EXPECT_FALSE(typeOfContentOfFile(folder.path()));
    EXPECT_FALSE(typeOfContentOfFile(folder.makeFifo("fifo")));
    EXPECT_FALSE(typeOfContentOfFile("/dev/zero"));
    EXPECT_FALSE(typeOfContentOfFile("/dev/tty"));
}
