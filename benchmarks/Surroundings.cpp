#include "benchmarks/Surroundings.h"

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <stdexcept>

#include "framework/metadata/FileTypes.h"
#include "platform/Notification.h"
#include "platform/Services.h"
#include "platform/linux/LinuxDispatcher.h"
#include "platform/linux/LinuxFileManager.h"
#include "platform/linux/LinuxSystemLog.h"
#include "platform/linux/LinuxUserDefaults.h"
#include "platform/linux/LinuxWorkspace.h"
#include "platform/linux/MountTable.h"

namespace bench {

namespace fs = std::filesystem;

namespace {

std::chrono::nanoseconds clockTime(clockid_t clock) {
    timespec time{};
    clock_gettime(clock, &time);
    return std::chrono::seconds(time.tv_sec) + std::chrono::nanoseconds(time.tv_nsec);
}

std::uint64_t numberAfter(const fs::path& file, const std::string& label) {
    std::ifstream stream(file);
    for (std::string word; stream >> word;) {
        std::uint64_t number = 0;
        if (word == label && stream >> number)
            return number;
    }
    return 0;
}

}  // namespace

Folder::Folder() {
    std::string pattern = (fs::temp_directory_path() / "vexo-bench.XXXXXX").string();
    if (!mkdtemp(pattern.data()))
        throw std::runtime_error("cannot make a folder for the benchmark");
    path_ = pattern;
}

Folder::~Folder() {
    std::error_code ignored;
    fs::remove_all(path_, ignored);
}

std::vector<std::string> Folder::makeFolders(int count) const {
    std::vector<std::string> paths;
    for (int i = 0; i < count; ++i) {
        paths.push_back(path_ + "/" + std::to_string(i / 100) + "/" + std::to_string(i % 100));
        fs::create_directories(paths.back());
    }
    return paths;
}

struct Services::State {
    platform::LinuxSystemLog log{"vexo-bench", platform::LinuxSystemLog::StandardError::silent};
    platform::SystemMountTable mounts;
    platform::LinuxFileManager files{std::nullopt, mounts, log, vexo::isPackageExtension};
    platform::LinuxWorkspace workspace{mounts, log};
    platform::LinuxUserDefaults userDefaults{"/nonexistent", "com.vexo.bench", &log};
    platform::NotificationCenter notifications;
    std::unique_ptr<platform::LinuxDispatcher> dispatcher = std::make_unique<platform::LinuxDispatcher>(log);
    platform::ServicesScope scope{{files, workspace, userDefaults, *dispatcher, notifications, log}};
};

Services::Services() : state_(std::make_unique<State>()) {}

Services::~Services() {
    state_->dispatcher.reset();
}

std::chrono::nanoseconds processorTime() {
    return clockTime(CLOCK_PROCESS_CPUTIME_ID);
}

std::chrono::nanoseconds processorTimeOfThread() {
    return clockTime(CLOCK_THREAD_CPUTIME_ID);
}

std::size_t residentBytes() {
    return numberAfter("/proc/self/status", "VmRSS:") * 1024;
}

std::uint64_t wakeUps() {
    std::uint64_t count = 0;
    for (const auto& thread : fs::directory_iterator("/proc/self/task"))
        count += numberAfter(thread.path() / "status", "voluntary_ctxt_switches:");
    return count;
}

void runInChild(const std::function<void()>& work) {
    const pid_t child = fork();
    if (child == 0) {
        work();
        _exit(0);
    }
    int status = 0;
    if (child < 0 || waitpid(child, &status, 0) != child || status != 0)
        throw std::runtime_error("the benchmark's child failed");
}

}  // namespace bench
