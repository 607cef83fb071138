// What a property list may hold when it is read whole. A few bytes of a file can stand for millions of
// values, because objects may be referred to again and again; what counts is what they grow to.
#pragma once

#include <cstdint>

#include "platform/PropertyListError.h"

namespace platform {

class PropertyListLimits {
  public:
    static constexpr int deepestNesting = 512;                           // arrays and dictionaries
    static constexpr std::uint64_t mostValues = std::uint64_t{1} << 20;  // keys included
    static constexpr std::uint64_t mostBytes = std::uint64_t{1} << 27;   // of all text and data
    static constexpr std::uint64_t largestXML = std::uint64_t{1} << 27;  // of the file

    // Each raises PropertyListError when the limit is passed.
    void countValue() {
        if (++values_ > mostValues)
            throw PropertyListError("too many values");
    }
    void countBytes(std::uint64_t bytes) {
        if (bytes > mostBytes - bytes_)
            throw PropertyListError("too much text");
        bytes_ += bytes;
    }
    static void checkNesting(int nesting) {
        if (nesting > deepestNesting)
            throw PropertyListError("nested too deeply or within itself");
    }

  private:
    std::uint64_t values_ = 0;
    std::uint64_t bytes_ = 0;
};

}  // namespace platform
