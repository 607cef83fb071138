// What the media reader sends is decoded as if the reader had been taken over.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "framework/metadata/ReaderMessage.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view message(reinterpret_cast<const char*>(data), size);
    vexo::isGreeting(message);
    vexo::decodeRequest(message);
    // What was understood survives being written and read again.
    if (const auto reply = vexo::decodeReply(message);
        reply && vexo::decodeReply(vexo::encodeReply(*reply)) != reply)
        std::abort();
    if (const auto answer = vexo::decodeAnswer(message);
        answer && vexo::decodeAnswer(vexo::encodeAnswer(*answer)) != answer)
        std::abort();
    return 0;
}
