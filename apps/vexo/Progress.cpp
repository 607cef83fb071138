#include "apps/vexo/Progress.h"

#include <unistd.h>

#include <chrono>
#include <iostream>

#include "apps/vexo/Terminal.h"

namespace vexo {
namespace {

using namespace std::chrono_literals;

constexpr auto redrawInterval = 200ms;
constexpr auto patience = 500ms;  // what is shorter than this shows no progress line
constexpr const char* eraseLine = "\r\033[K";

}  // namespace

void showWarning(const std::string& warning) {
    const char* const erase = isatty(STDERR_FILENO) ? eraseLine : "";
    std::cerr << erase + ("vexo: warning: " + printable(warning) + "\n") << std::flush;
}

void loadWithProgress(Host& host) {
    host.startLoading();
    const bool onTerminal = isatty(STDERR_FILENO);
    const auto start = std::chrono::steady_clock::now();
    bool shown = false;
    while (!host.waitUntilLoaded(redrawInterval)) {
        const auto elapsed = std::chrono::steady_clock::now() - start;
        if (!onTerminal || elapsed < patience)
            continue;
        const auto seconds = std::chrono::duration_cast<std::chrono::seconds>(elapsed).count();
        std::cerr << eraseLine << "Reading the libraries… " << seconds << " s" << std::flush;
        shown = true;
    }
    if (shown)
        std::cerr << eraseLine << std::flush;
}

}  // namespace vexo
