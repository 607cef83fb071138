#include "apps/media-reader/Channel.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cerrno>

namespace reader {

namespace {

constexpr int channel = vexo::readerChannelDescriptor;

// Runs at each event on the channel; a request that arrives is no reason to do anything.
void endWhenHostIsGone(int) {
    const int interrupted = errno;
    pollfd host{channel, 0, 0};
    if (poll(&host, 1, 0) > 0 && (host.revents & POLLHUP))
        _exit(0);
    errno = interrupted;
}

// The file and the memory.
using Descriptors = std::array<platform::FileDescriptor, 2>;
using ControlData = std::array<char, CMSG_SPACE(sizeof(int) * std::tuple_size_v<Descriptors>)>;

Descriptors descriptorsIn(msghdr& header) {
    Descriptors descriptors;
    const cmsghdr* control = CMSG_FIRSTHDR(&header);
    if (!control || control->cmsg_level != SOL_SOCKET || control->cmsg_type != SCM_RIGHTS)
        return descriptors;
    const auto* numbers = reinterpret_cast<const int*>(CMSG_DATA(control));
    const std::size_t count = (control->cmsg_len - CMSG_LEN(0)) / sizeof(int);
    for (std::size_t i = 0; i < std::min(count, descriptors.size()); ++i)
        descriptors[i] = platform::FileDescriptor(numbers[i]);
    return descriptors;
}

ssize_t retried(auto call) {
    ssize_t result;
    do
        result = call();
    while (result < 0 && errno == EINTR);
    return result;
}

}  // namespace

bool Channel::isOpen() {
    int type = 0;
    socklen_t size = sizeof type;
    return getsockopt(channel, SOL_SOCKET, SO_TYPE, &type, &size) == 0 && type == SOCK_SEQPACKET;
}

// The signal that the system can send at a parent's death will not do: it follows the thread that started the
// process, and a host's threads come and go.
void Channel::endWithHost() {
    struct sigaction action {};
    action.sa_handler = endWhenHostIsGone;
    action.sa_flags = SA_RESTART;
    sigaction(SIGIO, &action, nullptr);
    fcntl(channel, F_SETOWN, getpid());
    fcntl(channel, F_SETFL, fcntl(channel, F_GETFL) | O_ASYNC);
}

std::optional<Job> Channel::receive() {
    std::string message(vexo::maximumMessageBytes, '\0');
    iovec content{message.data(), message.size()};
    alignas(cmsghdr) ControlData control;
    msghdr header{};
    header.msg_iov = &content;
    header.msg_iovlen = 1;
    header.msg_control = control.data();
    header.msg_controllen = control.size();
    const ssize_t size = retried([&] { return recvmsg(channel, &header, MSG_CMSG_CLOEXEC); });
    if (size <= 0)
        return std::nullopt;
    Descriptors descriptors = descriptorsIn(header);
    message.resize(static_cast<std::size_t>(size));
    const auto request = vexo::decodeRequest(message);
    if (!request)
        return std::nullopt;
    return Job{*request, std::move(descriptors[0]), std::move(descriptors[1])};
}

bool Channel::send(const std::string& message) {
    return retried([&] { return ::send(channel, message.data(), message.size(), MSG_NOSIGNAL); }) >= 0;
}

}  // namespace reader
