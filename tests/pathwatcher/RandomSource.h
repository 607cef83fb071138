// Chance that can be repeated: the seed is shown when a test fails, and VEXO_TEST_SEED sets it.
#pragma once

#include <cstdlib>
#include <random>
#include <string>
#include <vector>

namespace testing_support {

class RandomSource {
  public:
    RandomSource() : RandomSource(chosenSeed()) {}
    explicit RandomSource(unsigned seed) : seed_(seed), engine_(seed_) {}

    unsigned seed() const { return seed_; }
    // 0 up to, but not including, `end`.
    std::size_t below(std::size_t end) {
        return std::uniform_int_distribution<std::size_t>(0, end - 1)(engine_);
    }
    bool oneIn(std::size_t times) { return below(times) == 0; }
    template <typename Value>
    const Value& among(const std::vector<Value>& values) {
        return values[below(values.size())];
    }

  private:
    static unsigned chosenSeed() {
        const char* const text = std::getenv("VEXO_TEST_SEED");
        return text ? static_cast<unsigned>(std::strtoul(text, nullptr, 10)) : std::random_device()();
    }

    const unsigned seed_;
    std::mt19937 engine_;
};

}  // namespace testing_support
