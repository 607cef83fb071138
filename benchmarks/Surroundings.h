// What the benchmarks lean on: folders of their own, the platform's services, and what the process has used.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace bench {

// A folder that is removed with everything in it.
class Folder {
  public:
    Folder();
    ~Folder();
    Folder(const Folder&) = delete;
    Folder& operator=(const Folder&) = delete;

    const std::string& path() const { return path_; }
    // `count` folders in it, a hundred to a folder; answers their paths.
    std::vector<std::string> makeFolders(int count) const;

  private:
    std::string path_;
};

// The real services, in place as long as the object lives.
class Services {
  public:
    Services();
    ~Services();

  private:
    struct State;
    const std::unique_ptr<State> state_;
};

// Processor time of this process, its ended children left out.
std::chrono::nanoseconds processorTime();
std::chrono::nanoseconds processorTimeOfThread();
std::size_t residentBytes();
// How often any thread of the process has gone to sleep so far, which is how often one has woken up.
std::uint64_t wakeUps();

// Runs `work` in a child process and waits for it, so that its processor time is not ours.
void runInChild(const std::function<void()>& work);

}  // namespace bench
