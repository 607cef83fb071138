// Standard error while something takes long: warnings, and a line that says what is going on.
#pragma once

#include <chrono>
#include <string>

#include "framework/Host.h"

namespace vexo {

void showWarning(const std::string& warning);

// A line on standard error that says what is going on and is redrawn as that changes; gone when it is over.
// Nothing is shown where standard error is no terminal, nor of what is soon over.
class ProgressLine {
  public:
    ProgressLine();
    ~ProgressLine();
    ProgressLine(const ProgressLine&) = delete;
    ProgressLine& operator=(const ProgressLine&) = delete;

    // May be called as often as one likes.
    void show(const std::string& text);
    std::chrono::seconds elapsed() const;

  private:
    using Clock = std::chrono::steady_clock;

    const bool onTerminal_;
    const Clock::time_point start_ = Clock::now();
    Clock::time_point lastDrawn_{};
    bool isDrawn_ = false;
};

// Loads the trees of all plug-ins and waits for them.
void loadWithProgress(Host& host);

// Reads the metadata of every movie in the trees that is not known yet.
void readMetadataWithProgress(Host& host);

}  // namespace vexo
