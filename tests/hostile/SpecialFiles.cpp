#include "tests/hostile/SpecialFiles.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <sys/un.h>

#include <cstring>
#include <filesystem>
#include <stdexcept>

#include "platform/linux/FileDescriptor.h"

namespace testing_support {
namespace {

// Only root may, and not in every container.
bool makeDevice(const std::string& path, mode_t kind, unsigned major, unsigned minor) {
    return mknod(path.c_str(), kind | 0666, makedev(major, minor)) == 0;
}

}  // namespace

std::vector<std::string> makeSpecialFiles(const TemporaryFolder& home, const std::string& path,
                                          const std::string& extension) {
    const std::string fifo = path + "fifo" + extension, socket = path + "socket" + extension;
    home.makeFifo(fifo);
    makeSocket(home.path(socket));
    std::vector<std::string> made{fifo, socket};
    const std::string endless = path + "endless" + extension, disk = path + "disk" + extension;
    if (makeDevice(home.path(endless), S_IFCHR, 1, 5))
        made.push_back(endless);
    if (makeDevice(home.path(disk), S_IFBLK, 7, 0))
        made.push_back(disk);
    return made;
}

// By way of the folder's descriptor: the address of a socket is shorter than most paths.
void makeSocket(const std::string& path) {
    const std::filesystem::path whole = path;
    const platform::FileDescriptor folder(open(whole.parent_path().c_str(), O_PATH | O_DIRECTORY));
    const platform::FileDescriptor end(socket(AF_UNIX, SOCK_STREAM, 0));
    sockaddr_un address{AF_UNIX, {}};
    const std::string name =
        "/proc/self/fd/" + std::to_string(folder.number()) + "/" + whole.filename().string();
    name.copy(address.sun_path, sizeof address.sun_path - 1);
    if (bind(end.number(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0)
        throw std::runtime_error("cannot make the socket " + path);
}

}  // namespace testing_support
