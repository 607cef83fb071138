// While one exists, a request to end the program (Ctrl-C, a closed terminal, kill) is only noted, so that
// what is being made can be removed first. One at a time.
#pragma once

#include <csignal>

#include <array>

namespace vexo {

class Interruption {
  public:
    Interruption();
    ~Interruption();
    Interruption(const Interruption&) = delete;
    Interruption& operator=(const Interruption&) = delete;

    static bool requested();

  private:
    static constexpr std::array signals{SIGINT, SIGTERM, SIGHUP};
    std::array<struct sigaction, signals.size()> previous_{};
};

}  // namespace vexo
