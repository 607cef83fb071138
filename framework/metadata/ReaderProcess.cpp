#include "framework/metadata/ReaderProcess.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/wait.h>

#include <algorithm>
#include <cerrno>

#include "framework/metadata/ReaderMessage.h"

// The C library's header forgets to say that its functions are C functions.
extern "C" {
#include <sys/pidfd.h>
}

namespace vexo {

namespace {

using std::chrono::milliseconds;

// How long a killed process may take to go. One that waits for a dead file server goes later than anybody
// wants to wait for it.
constexpr int reapingMilliseconds = 500;

// What the helper starts with: its end of the channel and standard error, no other descriptor of the host's,
// no blocked signals, and a process group of its own, so that a Ctrl-C for the host does not end it over a
// file.
class SpawnSettings {
  public:
    explicit SpawnSettings(int channel) {
        posix_spawn_file_actions_init(&actions_);
        posix_spawn_file_actions_adddup2(&actions_, channel, readerChannelDescriptor);
        posix_spawn_file_actions_addopen(&actions_, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
        posix_spawn_file_actions_addopen(&actions_, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
        posix_spawn_file_actions_addclosefrom_np(&actions_, readerChannelDescriptor + 1);
        posix_spawnattr_init(&attributes_);
        sigset_t none, all;
        sigemptyset(&none);
        sigfillset(&all);
        posix_spawnattr_setsigmask(&attributes_, &none);
        posix_spawnattr_setsigdefault(&attributes_, &all);
        posix_spawnattr_setpgroup(&attributes_, 0);
        posix_spawnattr_setflags(&attributes_,
                                 POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF | POSIX_SPAWN_SETPGROUP);
    }
    ~SpawnSettings() {
        posix_spawn_file_actions_destroy(&actions_);
        posix_spawnattr_destroy(&attributes_);
    }
    SpawnSettings(const SpawnSettings&) = delete;
    SpawnSettings& operator=(const SpawnSettings&) = delete;

    // False, and errno set, for a program that can't be started.
    bool spawn(pid_t& process, const std::string& program) const {
        std::string name = program;
        char* const arguments[] = {name.data(), nullptr};
        errno = posix_spawn(&process, program.c_str(), &actions_, &attributes_, arguments, environ);
        return errno == 0;
    }

  private:
    posix_spawn_file_actions_t actions_;
    posix_spawnattr_t attributes_;
};

// Milliseconds until `deadline` as poll takes them: rounded up, never negative.
int remaining(ReaderProcess::Deadline deadline) {
    const auto left = std::chrono::ceil<milliseconds>(deadline - std::chrono::steady_clock::now());
    return static_cast<int>(std::clamp<milliseconds::rep>(left.count(), 0, 3'600'000));
}

bool waitUntilReadable(int descriptor, ReaderProcess::Deadline deadline) {
    pollfd waited{descriptor, POLLIN, 0};
    int ready;
    do
        ready = poll(&waited, 1, remaining(deadline));
    while (ready < 0 && errno == EINTR);
    return ready > 0;
}

// A message with the control data that carries descriptors.
class DescriptorMessage {
  public:
    DescriptorMessage(std::string_view message, ReaderProcess::Descriptors descriptors)
        : content_{const_cast<char*>(message.data()), message.size()} {
        header_.msg_iov = &content_;
        header_.msg_iovlen = 1;
        header_.msg_control = control_;
        header_.msg_controllen = CMSG_SPACE(descriptors.size() * sizeof(int));
        cmsghdr* rights = CMSG_FIRSTHDR(&header_);
        rights->cmsg_level = SOL_SOCKET;
        rights->cmsg_type = SCM_RIGHTS;
        rights->cmsg_len = CMSG_LEN(descriptors.size() * sizeof(int));
        std::copy(descriptors.begin(), descriptors.end(), reinterpret_cast<int*>(CMSG_DATA(rights)));
    }

    const msghdr* header() const { return &header_; }

  private:
    iovec content_;
    msghdr header_{};
    alignas(cmsghdr) char control_[CMSG_SPACE(ReaderProcess::mostDescriptors * sizeof(int))] = {};
};

}  // namespace

std::unique_ptr<ReaderProcess> ReaderProcess::start(const std::string& program) {
    int ends[2];
    if (socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, ends) != 0)
        return nullptr;
    platform::FileDescriptor ours(ends[0]);
    const platform::FileDescriptor theirs(ends[1]);
    pid_t process;
    if (!SpawnSettings(theirs.number()).spawn(process, program))
        return nullptr;
    return std::unique_ptr<ReaderProcess>(new ReaderProcess(process, std::move(ours)));
}

ReaderProcess::ReaderProcess(pid_t process, platform::FileDescriptor channel)
    : process_(process), channel_(std::move(channel)), processDescriptor_(pidfd_open(process, 0)) {}

ReaderProcess::~ReaderProcess() {
    end();
    reap();
}

void ReaderProcess::end() {
    kill(process_, SIGKILL);
}

void ReaderProcess::reap() {
    const auto deadline = std::chrono::steady_clock::now() + milliseconds(reapingMilliseconds);
    if (processDescriptor_)
        waitUntilReadable(processDescriptor_.number(), deadline);
    waitpid(process_, nullptr, WNOHANG);
}

bool ReaderProcess::send(std::string_view message, Descriptors descriptors) {
    const DescriptorMessage packet(message, descriptors.first(std::min(descriptors.size(), mostDescriptors)));
    ssize_t sent;
    do
        sent = sendmsg(channel_.number(), packet.header(), MSG_NOSIGNAL | MSG_DONTWAIT);
    while (sent < 0 && errno == EINTR);
    return sent >= 0;
}

ReaderProcess::Reception ReaderProcess::receive(std::string& message, Deadline deadline) {
    message.resize(maximumMessageBytes + 1);
    for (;;) {
        if (!waitUntilReadable(channel_.number(), deadline))
            return Reception::late;
        const ssize_t size = recv(channel_.number(), message.data(), message.size(), MSG_DONTWAIT);
        if (size > 0) {
            message.resize(static_cast<std::size_t>(size));
            return Reception::message;
        }
        if (size == 0 || (errno != EINTR && errno != EAGAIN))
            return Reception::ended;
    }
}

}  // namespace vexo
