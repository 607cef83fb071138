#include "platform/Services.h"

#include <atomic>
#include <stdexcept>

namespace platform {

namespace {

std::atomic<const Services*> current{nullptr};

}  // namespace

const Services& services() {
    const Services* inPlace = current.load(std::memory_order_acquire);
    if (!inPlace)
        throw std::logic_error("platform::services() was called while no ServicesScope exists");
    return *inPlace;
}

ServicesScope::ServicesScope(const Services& services)
    : services_(services), previous_(current.exchange(&services_, std::memory_order_acq_rel)) {}

ServicesScope::~ServicesScope() {
    current.store(previous_, std::memory_order_release);
}

}  // namespace platform
