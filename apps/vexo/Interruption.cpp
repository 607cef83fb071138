#include "apps/vexo/Interruption.h"

#include <cstddef>

namespace vexo {
namespace {

volatile std::sig_atomic_t wasRequested = 0;

void note(int) {
    wasRequested = 1;
}

}  // namespace

// A signal that is ignored stays so, as nohup wants it.
Interruption::Interruption() {
    wasRequested = 0;
    struct sigaction action {};
    action.sa_handler = note;
    action.sa_flags = SA_RESTART;
    for (std::size_t i = 0; i < signals.size(); ++i) {
        sigaction(signals[i], nullptr, &previous_[i]);
        if (previous_[i].sa_handler != SIG_IGN)
            sigaction(signals[i], &action, nullptr);
    }
}

Interruption::~Interruption() {
    for (std::size_t i = 0; i < signals.size(); ++i)
        sigaction(signals[i], &previous_[i], nullptr);
}

bool Interruption::requested() {
    return wasRequested != 0;
}

}  // namespace vexo
