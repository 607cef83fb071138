#include "tests/support/LoopImage.h"

#include <sched.h>
#include <spawn.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <initializer_list>
#include <stdexcept>
#include <utility>
#include <vector>

namespace testing_support {

namespace {

// Programs of the administrator are not in everyone's PATH.
std::optional<std::string> administratorsProgram(const std::string& name) {
    for (const char* const folder : {"/usr/sbin/", "/sbin/", "/usr/bin/", "/bin/"})
        if (access((folder + name).c_str(), X_OK) == 0)
            return folder + name;
    return std::nullopt;
}

void runProgram(const std::string& name, std::initializer_list<std::string> arguments) {
    const auto program = administratorsProgram(name);
    if (!program)
        throw std::runtime_error("there is no " + name);
    std::vector<std::string> words{*program};
    words.insert(words.end(), arguments);
    std::vector<char*> argv;
    for (auto& word : words)
        argv.push_back(word.data());
    argv.push_back(nullptr);
    pid_t child = 0;
    int status = 0;
    if (posix_spawn(&child, program->c_str(), nullptr, nullptr, argv.data(), environ) != 0 ||
        waitpid(child, &status, 0) != child || status != 0)
        throw std::runtime_error(name + " failed");
}

void mountOrThrow(const char* source, const std::string& mountPoint, const char* fileSystem,
                  unsigned long flags) {
    if (mount(source, mountPoint.c_str(), fileSystem, flags, nullptr) != 0)
        throw std::runtime_error("cannot mount at " + mountPoint + ": " + std::strerror(errno));
}

std::optional<std::string> enterOwnMountTable() {
    if (unshare(CLONE_NEWNS) != 0 || mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0)
        return std::string("this process may not mount: ") + std::strerror(errno);
    return std::nullopt;
}

bool kernelKnows(const std::string& fileSystem) {
    std::ifstream list("/proc/filesystems");
    for (std::string word; list >> word;)
        if (word == fileSystem)
            return true;
    return false;
}

std::string programThatMakes(const std::string& fileSystem) {
    return fileSystem == "ext4" ? "mke2fs" : "mkfs." + fileSystem;
}

}  // namespace

std::optional<std::string> reasonAgainstMounting() {
    static const auto reason = enterOwnMountTable();
    return reason;
}

std::optional<std::string> reasonAgainstMounting(const std::string& fileSystem) {
    if (const auto reason = reasonAgainstMounting())
        return reason;
    if (!std::filesystem::exists("/dev/loop-control"))
        return "there are no loop devices";
    if (!administratorsProgram(programThatMakes(fileSystem)))
        return "there is no " + programThatMakes(fileSystem);
    if (!kernelKnows(fileSystem))
        return "the kernel has no " + fileSystem;
    return std::nullopt;
}

ScopedMount ScopedMount::bind(const std::string& source, const std::string& mountPoint) {
    mountOrThrow(source.c_str(), mountPoint, nullptr, MS_BIND);
    return ScopedMount(mountPoint);
}

ScopedMount ScopedMount::memory(const std::string& mountPoint) {
    mountOrThrow("memory", mountPoint, "ramfs", 0);
    return ScopedMount(mountPoint);
}

ScopedMount::ScopedMount(ScopedMount&& other) noexcept : mountPoint_(std::exchange(other.mountPoint_, {})) {}

ScopedMount::~ScopedMount() {
    if (!mountPoint_.empty())
        umount2(mountPoint_.c_str(), MNT_DETACH);
}

LoopImage::LoopImage(std::string path, const std::string& label, std::string fileSystem)
    : path_(std::move(path)), fileSystem_(std::move(fileSystem)) {
    constexpr std::uintmax_t size = 8 * 1024 * 1024;
    std::ofstream(path_).close();
    std::filesystem::resize_file(path_, size);
    if (fileSystem_ == "ext4")
        runProgram("mke2fs", {"-q", "-t", "ext4", "-L", label, path_});
    else
        runProgram(programThatMakes(fileSystem_), {"-n", label, path_});
}

ScopedMount LoopImage::mountAt(const std::string& mountPoint) const {
    runProgram("mount", {"-t", fileSystem_, "-o", "loop", path_, mountPoint});
    return ScopedMount(mountPoint);
}

}  // namespace testing_support
