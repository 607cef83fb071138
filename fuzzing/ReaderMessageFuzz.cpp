// What the media reader and its host send one another is decoded as if the other had been taken over. What
// was understood survives being written and read again.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "framework/metadata/ReaderMessage.h"

namespace {

void expectThat(bool holds) {
    if (!holds)
        std::abort();
}

void readAsHost(std::string_view message) {
    if (const auto confinement = vexo::decodeGreeting(message))
        expectThat(vexo::decodeGreeting(vexo::encodeGreeting(*confinement)) == confinement);
    if (const auto reply = vexo::decodeReply(message))
        expectThat(vexo::decodeReply(vexo::encodeReply(*reply)) == reply);
}

void readAsReader(std::string_view message) {
    if (const auto request = vexo::decodeRequest(message))
        expectThat(vexo::decodeRequest(vexo::encodeRequest(*request)) == request);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view message(reinterpret_cast<const char*>(data), size);
    readAsHost(message);
    readAsReader(message);
    return 0;
}
