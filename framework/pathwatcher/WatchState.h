// How changes at a path are learnt of.
#pragma once

#include <string>

namespace vexo {

struct WatchState {
    enum class How { events, polling, none };

    How how = How::none;
    std::string why;  // a sentence for people, without a full stop
};

}  // namespace vexo
