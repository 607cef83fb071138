#include "framework/pathwatcher/WakeSignal.h"

#include <sys/eventfd.h>

namespace vexo {

WakeSignal::WakeSignal() : counter_(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {}

void WakeSignal::raise() const {
    eventfd_write(counter_.number(), 1);
}

void WakeSignal::clear() const {
    eventfd_t count = 0;
    eventfd_read(counter_.number(), &count);
}

}  // namespace vexo
