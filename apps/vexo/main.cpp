#include <clocale>
#include <exception>
#include <iostream>

#include "apps/vexo/CommandLine.h"
#include "platform/linux/DescriptorRoom.h"

int main(int argc, char** argv) {
    std::setlocale(LC_ALL, "");
    try {
        platform::requireRoomForDescriptors();
        return vexo::runCommandLine(argc, argv);
    } catch (const std::exception& error) {
        std::cerr << "vexo: " << error.what() << "\n";
    } catch (...) {
        std::cerr << "vexo: failed for an unknown reason\n";
    }
    return 1;
}
