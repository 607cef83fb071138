// The messages between the host and the program that reads movies, and the form in which answers are kept.
//
// Each message is one packet of JSON of bounded size:
//
//     reader → host, once:      {"mediaReader": 1}
//     host → reader:            {"request": 7, "readLimit": 67108864}, with the file's descriptor
//     reader → host:            {"request": 7, "mediaTypes": ["Video"], "pixelWidth": 1920, …}
//                           or  {"request": 7, "failure": "why"}
//
// The reader works on files from anywhere and may have been taken over by one: what it says is decoded as
// hostile input. Each decoding function answers nil for anything it does not fully understand; keys it does
// not know are passed over. Callable from any thread.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "framework/metadata/MediaProperties.h"

namespace vexo {

inline constexpr std::size_t maximumMessageBytes = 16384;
inline constexpr int readerProtocolVersion = 1;
// The descriptor on which the reader finds its end of the channel, a SOCK_SEQPACKET socket.
inline constexpr int readerChannelDescriptor = 3;

struct ReaderRequest {
    std::uint64_t number = 0;     // the reply carries the same
    std::uint64_t readLimit = 0;  // how many bytes of the file may be read, in total

    bool operator==(const ReaderRequest&) const = default;
};

struct ReaderReply {
    std::uint64_t number = 0;
    MediaReaderAnswer answer;

    bool operator==(const ReaderReply&) const = default;
};

std::string encodeGreeting();
bool isGreeting(std::string_view message);

std::string encodeRequest(const ReaderRequest& request);
std::optional<ReaderRequest> decodeRequest(std::string_view message);

std::string encodeReply(const ReaderReply& reply);
std::optional<ReaderReply> decodeReply(std::string_view message);

// An answer alone. A failure is decoded as one of the file's.
std::string encodeAnswer(const MediaReaderAnswer& answer);
std::optional<MediaReaderAnswer> decodeAnswer(std::string_view text);

}  // namespace vexo
