// Has another process, a child, make a call of the system that its program does not make.
#pragma once

#include <sys/ptrace.h>
#include <sys/types.h>
#include <sys/user.h>
#include <sys/wait.h>

#include <array>
#include <cstring>
#include <optional>
#include <string>

namespace vexo {

// A child that is held at the entry of a call that it makes anyway, which is then exchanged for another. For
// one thread: the one that made the object. The child is let go with the object and is good for nothing more.
class ForeignCall {
  public:
    using Arguments = std::array<unsigned long long, 6>;

    explicit ForeignCall(pid_t process) : process_(process) {
        isHeld_ = ptrace(PTRACE_ATTACH, process_, nullptr, nullptr) == 0 && waitUntilItStops() && goToCall();
    }
    ~ForeignCall() { ptrace(PTRACE_KILL, process_, nullptr, nullptr); }
    ForeignCall(const ForeignCall&) = delete;
    ForeignCall& operator=(const ForeignCall&) = delete;

    // False where this system lets nobody do such things, or on another processor than x86-64.
    bool isPossible() const { return isHeld_; }

#ifdef __x86_64__
    // What the call answers: a negative errno for failure.
    long long make(long number, Arguments arguments) {
        user_regs_struct registers{};
        ptrace(PTRACE_GETREGS, process_, nullptr, &registers);
        const user_regs_struct before = registers;
        registers.orig_rax = static_cast<unsigned long long>(number);
        registers.rdi = arguments[0];
        registers.rsi = arguments[1];
        registers.rdx = arguments[2];
        registers.r10 = arguments[3];
        registers.r8 = arguments[4];
        registers.r9 = arguments[5];
        ptrace(PTRACE_SETREGS, process_, nullptr, &registers);
        goToCall();  // to where the call ends
        ptrace(PTRACE_GETREGS, process_, nullptr, &registers);
        const auto result = static_cast<long long>(registers.rax);
        beginAnew(before);
        return result;
    }

    // Puts text where the process can read it, and answers the address.
    unsigned long long place(const std::string& text) {
        user_regs_struct registers{};
        ptrace(PTRACE_GETREGS, process_, nullptr, &registers);
        const unsigned long long address = registers.rsp - 4096;
        for (std::size_t i = 0; i <= text.size(); i += sizeof(long)) {
            long word = 0;
            std::memcpy(&word, text.data() + i, std::min(sizeof word, text.size() - i));
            ptrace(PTRACE_POKEDATA, process_, address + i, word);
        }
        return address;
    }

  private:
    bool goToCall() {
        return ptrace(PTRACE_SYSCALL, process_, nullptr, nullptr) == 0 && waitUntilItStops();
    }

    // Has the process make its own call once more, and holds it there.
    void beginAnew(user_regs_struct registers) {
        constexpr int callInstruction = 2;  // bytes
        registers.rax = registers.orig_rax;
        registers.rip -= callInstruction;
        ptrace(PTRACE_SETREGS, process_, nullptr, &registers);
        goToCall();
    }
#else
    long long make(long, Arguments) {
        return 0;
    }
    unsigned long long place(const std::string&) {
        return 0;
    }

  private:
    bool goToCall() {
        return false;
    }
#endif

    bool waitUntilItStops() const {
        int status = 0;
        return waitpid(process_, &status, 0) == process_ && WIFSTOPPED(status);
    }

    const pid_t process_;
    bool isHeld_ = false;
};

}  // namespace vexo
