// Numbers that stand for none.
#pragma once

#include <limits>

namespace testing_support {

constexpr double infinity = std::numeric_limits<double>::infinity();
constexpr double notANumber = std::numeric_limits<double>::quiet_NaN();

}  // namespace testing_support
