#include "core/StableSort.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <numeric>
#include <random>
#include <string>

#include "platform/SnapshotList.h"

namespace reelix {
namespace {

using platform::ComparisonResult;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::UnorderedElementsAreArray;

ComparisonResult byNumber(int a, int b) {
    if (a == b)
        return ComparisonResult::same;
    return a < b ? ComparisonResult::ascending : ComparisonResult::descending;
}

ComparisonResult byInitial(const std::string& a, const std::string& b) {
    return byNumber(a.front(), b.front());
}

std::vector<int> numbersUpTo(int count) {
    std::vector<int> numbers(static_cast<std::size_t>(count));
    std::iota(numbers.begin(), numbers.end(), 0);
    return numbers;
}

TEST(StableSortTest, NothingAndOneElementStayAsTheyAreAndAreNotCompared) {
    const auto fail = [](int, int) {
        ADD_FAILURE() << "compared";
        return ComparisonResult::same;
    };
    EXPECT_THAT(stableSorted(std::vector<int>{}, fail), IsEmpty());
    EXPECT_THAT(stableSorted(std::vector<int>{7}, fail), ElementsAre(7));
}

TEST(StableSortTest, SortsAscendingAndLeavesTheSequenceAlone) {
    const std::vector<int> numbers{3, 1, 2, 5, 4};
    EXPECT_THAT(stableSorted(numbers, byNumber), ElementsAre(1, 2, 3, 4, 5));
    EXPECT_THAT(numbers, ElementsAre(3, 1, 2, 5, 4));
}

TEST(StableSortTest, TakesAnySequence) {
    const platform::SnapshotList<int> numbers{2, 3, 1};
    EXPECT_THAT(stableSorted(numbers, byNumber), ElementsAre(1, 2, 3));
}

TEST(StableSortTest, EqualElementsKeepTheirOrder) {
    const std::vector<std::string> words{"b1", "a1", "b2", "c1", "a2", "b3", "a3"};
    EXPECT_THAT(stableSorted(words, byInitial), ElementsAre("a1", "a2", "a3", "b1", "b2", "b3", "c1"));
}

TEST(StableSortTest, ElementsThatAreAllTheSameKeepTheirOrder) {
    const std::vector<int> numbers{3, 1, 2, 5, 4};
    EXPECT_EQ(stableSorted(numbers, [](int, int) { return ComparisonResult::same; }), numbers);
}

TEST(StableSortTest, AgreesWithTheStandardSortOnEveryLength) {
    std::mt19937 random(42);
    for (std::size_t length = 0; length < 70; ++length) {
        std::vector<std::pair<int, std::size_t>> pairs;
        for (std::size_t i = 0; i < length; ++i)
            pairs.emplace_back(static_cast<int>(random() % 10), i);
        const auto sorted =
            stableSorted(pairs, [](const auto& a, const auto& b) { return byNumber(a.first, b.first); });
        std::stable_sort(pairs.begin(), pairs.end(),
                         [](const auto& a, const auto& b) { return a.first < b.first; });
        EXPECT_EQ(sorted, pairs);
    }
}

TEST(StableSortTest, KeepsEveryElementWhenEachComesAfterTheOther) {
    const std::vector<int> numbers = numbersUpTo(100);
    const auto sorted = stableSorted(numbers, [](int, int) { return ComparisonResult::descending; });
    EXPECT_THAT(sorted, UnorderedElementsAreArray(numbers));
}

TEST(StableSortTest, KeepsTheOrderWhenEachComesBeforeTheOther) {
    const std::vector<int> numbers = numbersUpTo(100);
    EXPECT_EQ(stableSorted(numbers, [](int, int) { return ComparisonResult::ascending; }), numbers);
}

TEST(StableSortTest, KeepsEveryElementWhenTheOrderGoesInCircles) {
    const std::vector<int> numbers = numbersUpTo(99);
    const auto circle = [](int a, int b) {  // 0 before 1 before 2 before 0
        return (b - a + 3) % 3 == 1 ? ComparisonResult::ascending : ComparisonResult::descending;
    };
    EXPECT_THAT(stableSorted(numbers, circle), UnorderedElementsAreArray(numbers));
}

TEST(StableSortTest, KeepsEveryElementAndEndsSoonWhenTheOrderIsChance) {
    const std::vector<int> numbers = numbersUpTo(1024);
    for (unsigned seed = 0; seed < 20; ++seed) {
        std::mt19937 random(seed);
        int comparisons = 0;
        const auto chance = [&](int, int) {
            ++comparisons;
            return static_cast<ComparisonResult>(static_cast<int>(random() % 3) - 1);
        };
        EXPECT_THAT(stableSorted(numbers, chance), UnorderedElementsAreArray(numbers));
        EXPECT_LE(comparisons, 1024 * 10);  // elements times levels
    }
}

// An element that is the same as all others can hide that those around it are out of order.
TEST(StableSortTest, ElementsThatCompareAsSameWithEverythingKeepThePlacesTheMergesGiveThem) {
    constexpr int any = -1;
    const auto compare = [](int a, int b) {
        return a == any || b == any ? ComparisonResult::same : byNumber(a, b);
    };
    EXPECT_THAT(stableSorted(std::vector<int>{2, any, 1}, compare), ElementsAre(1, 2, any));
    EXPECT_THAT(stableSorted(std::vector<int>{2, 3, any, 1}, compare), ElementsAre(2, 3, any, 1));
}

}  // namespace
}  // namespace reelix
