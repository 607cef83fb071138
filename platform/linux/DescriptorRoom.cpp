#include "platform/linux/DescriptorRoom.h"

#include <sys/eventfd.h>

#include <array>
#include <cerrno>
#include <system_error>

#include "platform/linux/FileDescriptor.h"

namespace platform {

namespace {

// One for a loop, one for GLib's own thread, one for the bus's, and one to spare.
constexpr std::size_t neededDescriptors = 4;

}  // namespace

void requireRoomForDescriptors() {
    std::array<FileDescriptor, neededDescriptors> descriptors;
    for (FileDescriptor& descriptor : descriptors) {
        descriptor = FileDescriptor(eventfd(0, EFD_CLOEXEC));
        if (!descriptor)
            throw std::system_error(errno, std::generic_category(), "too few files may be open at once");
    }
}

}  // namespace platform
