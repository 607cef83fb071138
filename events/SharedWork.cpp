#include "events/SharedWork.h"

#include <utility>

namespace reelix {

using platform::Locked;

void SharedWork::help() {
    {
        Locked lock(mutex_);
        if (isFinished_)
            return;
        ++helpers_;
    }
    doPieces();
    Locked lock(mutex_);
    --helpers_;
    helperLeft_.notify_all();
}

void SharedWork::finish() {
    doPieces();
    std::exception_ptr failure;
    {
        Locked lock(mutex_);
        isFinished_ = true;
        while (helpers_ > 0)
            helperLeft_.wait(mutex_);
        failure = failure_;
    }
    if (failure)
        std::rethrow_exception(failure);
}

void SharedWork::doPieces() {
    try {
        while (!hasFailed() && doPiece_()) {
        }
    } catch (...) {
        fail(std::current_exception());
    }
}

void SharedWork::fail(std::exception_ptr failure) {
    Locked lock(mutex_);
    if (!failure_)
        failure_ = std::move(failure);
}

bool SharedWork::hasFailed() const {
    Locked lock(mutex_);
    return failure_ != nullptr;
}

}  // namespace reelix
