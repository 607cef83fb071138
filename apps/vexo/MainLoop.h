// The main loop of a command that stays. Belongs to the main thread, which makes it before anything else
// runs.
#pragma once

#include <chrono>
#include <memory>
#include <optional>

namespace vexo {

class MainLoop {
  public:
    using Seconds = std::chrono::duration<double>;

    // From now on SIGINT and SIGTERM end the loop instead of the program.
    MainLoop();
    ~MainLoop();
    MainLoop(const MainLoop&) = delete;
    MainLoop& operator=(const MainLoop&) = delete;

    // Does what is due, without waiting.
    void runPending();
    // Runs until the loop is ended, `atMost` as long; nil for no limit.
    void run(const std::optional<Seconds>& atMost);
    void end();
    bool isEnded() const;

  private:
    struct State;
    const std::unique_ptr<State> state_;
};

}  // namespace vexo
