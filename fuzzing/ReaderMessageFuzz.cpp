// What the media reader and its host send one another is decoded as if the other had been taken over. What
// was understood survives being written and read again. And whatever texts a movie has, the host understands
// what the reader tells of it.
#include <cstddef>
#include <cstdint>

#include "framework/metadata/MediaLimits.h"
#include "framework/metadata/ReaderMessage.h"
#include "fuzzing/Require.h"

namespace {

void readAsHost(std::string_view message) {
    if (const auto confinement = vexo::decodeGreeting(message))
        require(vexo::decodeGreeting(vexo::encodeGreeting(*confinement)) == confinement);
    if (const auto reply = vexo::decodeReply(message))
        require(vexo::decodeReply(vexo::encodeReply(*reply)) == reply);
}

void readAsReader(std::string_view message) {
    if (const auto request = vexo::decodeRequest(message))
        require(vexo::decodeRequest(vexo::encodeRequest(*request)) == request);
}

void tellOfMovie(const std::string& text) {
    const std::vector<std::string> names(vexo::longestList + 1, text);
    vexo::MediaProperties properties;
    properties.mediaTypes = properties.codecs = names;
    properties.title = properties.acquisitionMake = properties.acquisitionModel = text;
    require(vexo::decodeReply(vexo::encodeReply({1, properties})).has_value());
    require(vexo::decodeReply(vexo::encodeReply({1, vexo::MediaFailure{text, {}}})).has_value());
    require(vexo::decodeGreeting(vexo::encodeGreeting(names)).has_value());
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view message(reinterpret_cast<const char*>(data), size);
    readAsHost(message);
    readAsReader(message);
    tellOfMovie(std::string(message.substr(0, vexo::longestText + 8)));  // what lies beyond is cut off
    return 0;
}
