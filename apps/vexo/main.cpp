#include <sys/eventfd.h>

#include <array>
#include <cerrno>
#include <clocale>
#include <exception>
#include <iostream>
#include <system_error>

#include "apps/vexo/CommandLine.h"
#include "platform/linux/FileDescriptor.h"

namespace {

// GLib ends a program that can't open the few descriptors on which its loops wait; whatever else can't be
// opened is told of where it is missed.
void requireRoomForDescriptors() {
    std::array<platform::FileDescriptor, 4> descriptors;
    for (platform::FileDescriptor& descriptor : descriptors) {
        descriptor = platform::FileDescriptor(eventfd(0, EFD_CLOEXEC));
        if (!descriptor)
            throw std::system_error(errno, std::generic_category(), "too few files may be open at once");
    }
}

}  // namespace

int main(int argc, char** argv) {
    std::setlocale(LC_ALL, "");
    try {
        requireRoomForDescriptors();
        return vexo::runCommandLine(argc, argv);
    } catch (const std::exception& error) {
        std::cerr << "vexo: " << error.what() << "\n";
    } catch (...) {
        std::cerr << "vexo: failed for an unknown reason\n";
    }
    return 1;
}
