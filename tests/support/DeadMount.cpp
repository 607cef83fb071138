#include "tests/support/DeadMount.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <linux/fuse.h>
#include <poll.h>
#include <sys/mount.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <stdexcept>

#include "tests/support/LoopImage.h"

namespace testing_support {

using namespace std::chrono_literals;

namespace {

using Request = std::array<char, FUSE_MIN_READ_BUFFER>;

void readRequest(int server, Request& request) {
    if (read(server, request.data(), request.size()) < static_cast<ssize_t>(sizeof(fuse_in_header)))
        throw std::runtime_error(std::string("cannot read a request: ") + std::strerror(errno));
}

}  // namespace

std::optional<std::string> DeadMount::reasonAgainst() {
    if (const auto reason = reasonAgainstMounting())
        return reason;
    const platform::FileDescriptor device(open("/dev/fuse", O_RDWR | O_CLOEXEC));
    return device ? std::nullopt : std::optional<std::string>("/dev/fuse can't be opened");
}

DeadMount::DeadMount(const std::string& mountPoint)
    : mountPoint_(mountPoint), server_(open("/dev/fuse", O_RDWR | O_CLOEXEC)) {
    const char* const rootMode = std::filesystem::is_directory(mountPoint) ? "40000" : "100000";
    const std::string options =
        fmt::format("fd={},rootmode={},user_id=0,group_id=0", server_.number(), rootMode);
    if (!server_ || mount("me@gone:/", mountPoint.c_str(), "fuse.sshfs", 0, options.c_str()) != 0)
        throw std::runtime_error(std::string("cannot mount: ") + std::strerror(errno));
    greet();
}

DeadMount::~DeadMount() {
    umount2(mountPoint_.c_str(), MNT_DETACH);
}

// Without this the kernel holds all requests back.
void DeadMount::greet() const {
    Request request{};
    readRequest(server_.number(), request);
    fuse_in_header header{};
    std::memcpy(&header, request.data(), sizeof header);
    struct {
        fuse_out_header header;
        fuse_init_out answer;
    } reply{};
    reply.header = {sizeof reply, 0, header.unique};
    reply.answer.major = FUSE_KERNEL_VERSION;
    reply.answer.minor = FUSE_KERNEL_MINOR_VERSION;
    reply.answer.max_write = 4096;
    if (write(server_.number(), &reply, sizeof reply) != sizeof reply)
        throw std::runtime_error(std::string("cannot greet the kernel: ") + std::strerror(errno));
}

void DeadMount::takeRequest() const {
    awaitRequest();
    Request request{};
    readRequest(server_.number(), request);
}

bool DeadMount::hasRequest() const {
    return isAsked(0ms);
}

void DeadMount::awaitRequest() const {
    if (!isAsked(1min))
        throw std::runtime_error("nobody asks the server");
}

bool DeadMount::isAsked(std::chrono::milliseconds wait) const {
    pollfd request{server_.number(), POLLIN, 0};
    return poll(&request, 1, static_cast<int>(wait.count())) == 1;
}

}  // namespace testing_support
