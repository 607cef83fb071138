#include "events/SharedWork.h"

#include <utility>

namespace reelix {

using platform::Locked;

void SharedWork::help() {
    {
        Locked lock(mutex_);
        if (isEnded_)
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
    abandon();
    Locked lock(mutex_);
    while (helpers_ > 0)
        helperLeft_.wait(mutex_);
    if (failure_)
        std::rethrow_exception(failure_);
}

void SharedWork::abandon() {
    Locked lock(mutex_);
    isEnded_ = true;
}

void SharedWork::doPieces() {
    try {
        while (!isEnded_ && doPiece_()) {
        }
    } catch (...) {
        fail(std::current_exception());
    }
}

void SharedWork::fail(std::exception_ptr failure) {
    Locked lock(mutex_);
    isEnded_ = true;
    if (!failure_)
        failure_ = std::move(failure);
}

}  // namespace reelix
