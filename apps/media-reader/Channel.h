// The reader's end of the channel to its host. For one thread.
#pragma once

#include <optional>
#include <string>

#include "framework/metadata/ReaderMessage.h"
#include "platform/linux/FileDescriptor.h"

namespace reader {

// A request with the file that it is about and the memory for a frame; without them when the host sent none.
struct Job {
    vexo::ReaderRequest request;
    platform::FileDescriptor file;
    platform::FileDescriptor memory;
};

class Channel {
  public:
    // Whether the descriptor on which the host leaves the channel is such a socket.
    static bool isOpen();

    // From now on the process ends when the host goes, even in the middle of a file.
    static void endWithHost();

    // nil when the host has closed the channel or sends nonsense.
    static std::optional<Job> receive();
    static bool send(const std::string& message);
};

}  // namespace reader
