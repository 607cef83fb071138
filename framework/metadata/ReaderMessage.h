// The messages between the host and the program that reads movies.
//
// Each message is one packet of JSON of bounded size:
//
//     reader → host, once:      {"mediaReader": 2, "confinement": ["limits", …]}
//     host → reader:            {"request": 7, "fileSize": 81920, "readLimit": 67108864}, with the file's
//                               descriptor; for a frame also "longestSide": 256, with the descriptor of the
//                               memory for its pixels after the file's
//     reader → host:            {"request": 7, "mediaTypes": ["Video"], "pixelWidth": 1920, …}
//                           or  {"request": 7, "frameWidth": 256, "frameHeight": 144}, the pixels lying in
//                           that
//                               memory as a platform::Bitmap holds them
//                           or  {"request": 7, "failure": "why"}
//
// The reader works on files from anywhere and may have been taken over by one: what it says is decoded as
// hostile input. Each decoding function answers nil for anything it does not fully understand; keys it does
// not know are passed over. What is encoded is first made such that it can be decoded: texts are cut and
// cleaned, numbers out of their range left out. Callable from any thread.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "framework/metadata/MediaProperties.h"

namespace vexo {

inline constexpr std::size_t maximumMessageBytes = 16384;
inline constexpr int readerProtocolVersion = 2;
// The descriptor on which the reader finds its end of the channel, a SOCK_SEQPACKET socket.
inline constexpr int readerChannelDescriptor = 3;

struct ReaderRequest {
    std::uint64_t number = 0;  // the reply carries the same
    std::uint64_t fileSize = 0;
    std::uint64_t readLimit = 0;          // how many bytes of the file may be read, in total
    std::optional<int> longestSide = {};  // of the frame that is asked for; else for the properties

    bool operator==(const ReaderRequest&) const = default;
};

struct FrameSize {
    int width = 0;
    int height = 0;

    bool operator==(const FrameSize&) const = default;
};

using ReaderFindings = std::variant<MediaProperties, FrameSize, MediaFailure>;

struct ReaderReply {
    std::uint64_t number = 0;
    ReaderFindings findings;

    bool operator==(const ReaderReply&) const = default;
};

// What a frame of at most `longestSide` pixels a side needs at most.
constexpr std::size_t bytesOfFrame(int longestSide) {
    return static_cast<std::size_t>(longestSide) * static_cast<std::size_t>(longestSide) *
           sizeof(std::uint32_t);
}

// `confinement` names what the reader has given up.
std::string encodeGreeting(const std::vector<std::string>& confinement);
std::optional<std::vector<std::string>> decodeGreeting(std::string_view message);

std::string encodeRequest(const ReaderRequest& request);
std::optional<ReaderRequest> decodeRequest(std::string_view message);

std::string encodeReply(const ReaderReply& reply);
std::optional<ReaderReply> decodeReply(std::string_view message);
// Whether the reply is one to this request: of its number, of the kind it asks for and within its bounds.
bool isReplyTo(const ReaderRequest& request, const ReaderReply& reply);

}  // namespace vexo
