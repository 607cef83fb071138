// The calls that a thread makes on the files of a folder, one of which can be made to fail. Linked into a
// program, this stands in place of the C library's functions, which it calls.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace testing_support {

struct SystemCall {
    std::string function;
    std::string path;
};

// Follows the calls of the thread that makes it, as long as it exists. One a thread.
class SystemCalls {
  public:
    // `folder` is a path without links.
    explicit SystemCalls(std::string folder);
    ~SystemCalls();
    SystemCalls(const SystemCalls&) = delete;
    SystemCalls& operator=(const SystemCalls&) = delete;

    // From now on the call with this number, the first being 0, fails with the errno.
    void failAt(std::size_t index, int error);
    // What is done right before each call.
    std::function<void(const SystemCall& call)> beforeCall;

    const std::vector<SystemCall>& calls() const { return calls_; }

    // The errno with which the call is to fail, 0 for none.
    static int errorFor(const char* function, int folder, const char* path);

  private:
    int errorFor(SystemCall call);

    const std::string folder_;
    std::vector<SystemCall> calls_;
    std::size_t failingIndex_ = SIZE_MAX;
    int error_ = 0;
    bool isBusy_ = false;  // with `beforeCall`, whose own calls don't count
};

}  // namespace testing_support
