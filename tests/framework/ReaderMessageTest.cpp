// The messages between the host and the reader program.
#include "framework/metadata/ReaderMessage.h"

#include <gtest/gtest.h>

#include <cmath>

namespace vexo {
namespace {

MediaProperties everyProperty() {
    return {{"Video", "Sound"},
            1920,
            1080,
            12.48,
            {"h264", "aac"},
            -1.5,
            29.97,
            2,
            48000,
            18'000'000,
            "R\u00e4der \"am\" Flu\u00df",
            "Camera Works",
            "CW 100"};
}

MediaProperties readAgain(const MediaProperties& properties) {
    const auto reply = decodeReply(encodeReply({1, properties}));
    return reply ? std::get<MediaProperties>(reply->findings) : MediaProperties{};
}

std::optional<std::string> titleReadAgain(const std::string& title) {
    MediaProperties properties{.mediaTypes = {"Video"}};
    properties.title = title;
    return readAgain(properties).title;
}

TEST(ReaderMessage, AReplyReadsAsItWasWritten) {
    const ReaderReply movie{7, everyProperty()};
    const ReaderReply frame{8, FrameSize{256, 144}};
    const ReaderReply failure{9, MediaFailure{"no movie"}};
    EXPECT_EQ(decodeReply(encodeReply(movie)), movie);
    EXPECT_EQ(decodeReply(encodeReply(frame)), frame);
    EXPECT_EQ(decodeReply(encodeReply(failure)), failure);
}

TEST(ReaderMessage, ARequestReadsAsItWasWritten) {
    const ReaderRequest forProperties{9, 10, 11};
    const ReaderRequest forFrame{9, 10, 11, 256};
    EXPECT_EQ(decodeRequest(encodeRequest(forProperties)), forProperties);
    EXPECT_EQ(decodeRequest(encodeRequest(forFrame)), forFrame);
}

TEST(ReaderMessage, AGreetingReadsAsItWasWritten) {
    const std::vector<std::string> confinement{"limits", "seccomp"};
    EXPECT_EQ(decodeGreeting(encodeGreeting(confinement)), confinement);
    EXPECT_EQ(decodeGreeting(encodeGreeting({})), std::vector<std::string>());
}

TEST(ReaderMessage, WhatIsLongIsCutAndStillUnderstood) {
    const ReaderReply reply{1, MediaFailure{std::string(5000, '\xff')}};
    EXPECT_TRUE(decodeReply(encodeReply(reply)));
    const ReaderReply many{2, MediaProperties{std::vector<std::string>(500, std::string(500, '\1'))}};
    EXPECT_TRUE(decodeReply(encodeReply(many)));
    EXPECT_TRUE(decodeGreeting(encodeGreeting(std::vector<std::string>(500, std::string(500, '\1')))));
}

TEST(ReaderMessage, TheLongestOfEverythingFitsIntoAMessage) {
    MediaProperties longest = everyProperty();
    longest.mediaTypes = longest.codecs = std::vector<std::string>(500, std::string(500, '\1'));
    longest.title = longest.acquisitionMake = longest.acquisitionModel = std::string(5000, '"');
    const auto reply = decodeReply(encodeReply({~std::uint64_t{0}, longest}));
    ASSERT_TRUE(reply);
    EXPECT_EQ(std::get<MediaProperties>(reply->findings).title->size(), 900u);
}

TEST(ReaderMessage, ATextIsCutBetweenCharacters) {
    std::string title = "x";
    for (int i = 0; i < 1000; ++i)
        title += "\u00e4";
    EXPECT_EQ(titleReadAgain(title), title.substr(0, 899));
}

TEST(ReaderMessage, ATextHasNoControlCharacters) {
    EXPECT_EQ(titleReadAgain("a\x1b[31m\r\nb\x7f\u0085c\u00a0d"), "a[31mbc\u00a0d");
    EXPECT_EQ(titleReadAgain("\n"), std::nullopt);
    EXPECT_EQ(titleReadAgain(""), std::nullopt);
}

TEST(ReaderMessage, BytesThatAreNoTextAreReplaced) {
    EXPECT_EQ(titleReadAgain("a\xff\xc2"), "a\ufffd\ufffd");
}

TEST(ReaderMessage, NumbersThatMakeNoSenseAreLeftOut) {
    MediaProperties absurd{.mediaTypes = {"Video"}};
    absurd.pixelWidth = absurd.pixelHeight = -1;
    absurd.durationSeconds = absurd.frameRate = std::nan("");
    absurd.contentCreationDate = INFINITY;
    absurd.audioChannelCount = absurd.audioSampleRate = 0;
    absurd.totalBitRate = INT64_MAX;
    EXPECT_EQ(readAgain(absurd), MediaProperties{.mediaTypes = {"Video"}});
}

TEST(ReaderMessage, OnlyWhatWasAskedForIsAReply) {
    const ReaderRequest forProperties{7, 1, 1};
    const ReaderRequest forFrame{7, 1, 1, 256};
    const ReaderReply properties{7, everyProperty()}, failure{7, MediaFailure{}};
    EXPECT_TRUE(isReplyTo(forProperties, properties));
    EXPECT_TRUE(isReplyTo(forProperties, failure));
    EXPECT_TRUE(isReplyTo(forFrame, failure));
    EXPECT_TRUE(isReplyTo(forFrame, {7, FrameSize{256, 1}}));

    EXPECT_FALSE(isReplyTo(forFrame, properties));
    EXPECT_FALSE(isReplyTo(forFrame, {7, FrameSize{257, 1}}));
    EXPECT_FALSE(isReplyTo(forFrame, {7, FrameSize{1, 257}}));
    EXPECT_FALSE(isReplyTo(forProperties, {7, FrameSize{1, 1}}));
    EXPECT_FALSE(isReplyTo(forProperties, {6, everyProperty()}));
    EXPECT_FALSE(isReplyTo(forFrame, {8, FrameSize{1, 1}}));
}

TEST(ReaderMessage, NonsenseIsNotUnderstood) {
    for (const char* message : {"",
                                "{",
                                "[]",
                                "7",
                                "null",
                                "{}",
                                R"({"request":1})",
                                R"({"request":-1,"failure":"x"})",
                                R"({"request":1,"failure":7})",
                                R"({"request":1,"mediaTypes":"Video"})",
                                R"({"request":1,"mediaTypes":[]})",
                                R"({"request":1,"mediaTypes":[1]})",
                                R"({"request":1,"mediaTypes":["Video"],"pixelWidth":0})",
                                R"({"request":1,"mediaTypes":["Video"],"pixelWidth":1e3})",
                                R"({"request":1,"mediaTypes":["Video"],"pixelWidth":4294967297})",
                                R"({"request":1,"mediaTypes":["Video"],"durationSeconds":-1})",
                                R"({"request":1,"mediaTypes":["Video"],"durationSeconds":1e300})",
                                R"({"request":1,"mediaTypes":["Video"],"durationSeconds":"long"})",
                                R"({"request":1,"mediaTypes":["Video"],"frameRate":0})",
                                R"({"request":1,"mediaTypes":["Video"],"audioChannelCount":-2})",
                                R"({"request":1,"mediaTypes":["Video"],"audioSampleRate":48000.5})",
                                R"({"request":1,"mediaTypes":["Video"],"totalBitRate":18446744073709551615})",
                                R"({"request":1,"mediaTypes":["Video"],"title":""})",
                                R"({"request":1,"mediaTypes":["Video"],"title":"\u001b[31m"})",
                                R"({"request":1,"mediaTypes":["Video"],"title":"\u0085"})",
                                "{\"request\":1,\"mediaTypes\":[\"Video\"],\"title\":\"\xff\"}",
                                R"({"request":1,"frameWidth":16})",
                                R"({"request":1,"frameWidth":0,"frameHeight":16})",
                                R"({"request":1,"frameWidth":-16,"frameHeight":16})",
                                R"({"request":1,"frameWidth":1025,"frameHeight":16})",
                                R"({"request":1,"frameWidth":16.5,"frameHeight":16})",
                                R"({"request":1,"frameWidth":4294967312,"frameHeight":16})"})
        EXPECT_FALSE(decodeReply(message)) << message;
    EXPECT_FALSE(decodeReply(std::string(maximumMessageBytes, '[')));
    EXPECT_FALSE(decodeReply(R"({"request":1,"failure":"x"})" + std::string(maximumMessageBytes, ' ')));
    EXPECT_FALSE(decodeGreeting(R"({"mediaReader":1})"));
    EXPECT_FALSE(decodeGreeting(R"({"mediaReader":2,"confinement":"seccomp"})"));
    EXPECT_FALSE(decodeRequest(R"({"request":1,"fileSize":1,"readLimit":1,"longestSide":0})"));
    EXPECT_FALSE(decodeRequest(R"({"request":1,"fileSize":1,"readLimit":1,"longestSide":1025})"));
    EXPECT_FALSE(decodeRequest(R"({"request":1,"readLimit":1})"));
}

}  // namespace
}  // namespace vexo
