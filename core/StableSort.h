// A stable sort that finishes, and keeps every element, with any comparison.
//
// The orders of groups are not consistent: events without a year compare as same with every event, and two
// event libraries each come after the other. The standard sorts require a consistent order; this one only
// asks the comparison and merges by its answers.
#pragma once

#include <algorithm>
#include <cstddef>
#include <iterator>
#include <utility>
#include <vector>

#include "platform/Text.h"

namespace reelix {

namespace detail {

// Moves two neighbouring runs of `from` into one; the right element goes first only where the left one is
// greater.
template <typename T, typename Comparison>
void mergeRuns(std::vector<T>& from, std::size_t begin, std::size_t middle, std::size_t end,
               std::vector<T>& into, const Comparison& compare) {
    std::size_t left = begin;
    std::size_t right = middle;
    while (left < middle && right < end) {
        const bool rightFirst = compare(from[left], from[right]) == platform::ComparisonResult::descending;
        into.push_back(std::move(from[rightFirst ? right++ : left++]));
    }
    std::move(from.begin() + left, from.begin() + middle, std::back_inserter(into));
    std::move(from.begin() + right, from.begin() + end, std::back_inserter(into));
}

}  // namespace detail

// sortedArrayUsingSelector:; `compare(a, b)` answers a platform::ComparisonResult.
template <typename Sequence, typename Comparison>
auto stableSorted(const Sequence& sequence, const Comparison& compare) {
    std::vector<typename Sequence::value_type> sorted(sequence.begin(), sequence.end());
    for (std::size_t run = 1; run < sorted.size(); run *= 2) {
        std::vector<typename Sequence::value_type> merged;
        merged.reserve(sorted.size());
        for (std::size_t begin = 0; begin < sorted.size(); begin += 2 * run) {
            const std::size_t middle = std::min(begin + run, sorted.size());
            const std::size_t end = std::min(begin + 2 * run, sorted.size());
            detail::mergeRuns(sorted, begin, middle, end, merged, compare);
        }
        sorted.swap(merged);
    }
    return sorted;
}

}  // namespace reelix
