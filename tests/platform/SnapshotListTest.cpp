#include "platform/SnapshotList.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <mutex>
#include <random>
#include <thread>

namespace platform {
namespace {

using testing::ElementsAre;
using Numbers = SnapshotList<int>;

// Counts how often elements are copied or moved into place.
struct Counted {
    static inline std::size_t transfers = 0;
    int value = 0;

    Counted() = default;
    explicit Counted(int number) : value(number) {}
    Counted(const Counted& other) : value(other.value) { ++transfers; }
    Counted& operator=(const Counted& other) {
        value = other.value;
        ++transfers;
        return *this;
    }
};

TEST(SnapshotListTest, AnEmptyListHasNoElements) {
    EXPECT_TRUE(Numbers().empty());
    EXPECT_THAT(Numbers(), ElementsAre());
    EXPECT_THAT(Numbers(std::vector<int>()), ElementsAre());
    EXPECT_THAT(Numbers(std::vector<int>()).appending(1), ElementsAre(1));
}

TEST(SnapshotListTest, AListHoldsWhatItIsMadeOf) {
    const Numbers list{1, 2, 3};
    EXPECT_THAT(list, ElementsAre(1, 2, 3));
    EXPECT_EQ(list.size(), 3u);
    EXPECT_EQ(list.front(), 1);
    EXPECT_EQ(list.back(), 3);
    EXPECT_EQ(list[1], 2);
    EXPECT_THAT(Numbers(std::vector<int>{4, 5}), ElementsAre(4, 5));
}

TEST(SnapshotListTest, AppendingLeavesTheOldListAsItWas) {
    const Numbers one{1};
    const Numbers two = one.appending(2);
    const Numbers three = two.appending(3);
    EXPECT_THAT(one, ElementsAre(1));
    EXPECT_THAT(two, ElementsAre(1, 2));
    EXPECT_THAT(three, ElementsAre(1, 2, 3));
}

TEST(SnapshotListTest, TwoAppendsToOneListDoNotMeet) {
    const Numbers list = Numbers{1, 2}.appending(3);  // in a buffer with room
    const Numbers left = list.appending(4);
    const Numbers right = list.appending(5);
    const Numbers rightOn = right.appending(6);
    const Numbers leftOn = left.appending(7);
    EXPECT_THAT(list, ElementsAre(1, 2, 3));
    EXPECT_THAT(left, ElementsAre(1, 2, 3, 4));
    EXPECT_THAT(leftOn, ElementsAre(1, 2, 3, 4, 7));
    EXPECT_THAT(rightOn, ElementsAre(1, 2, 3, 5, 6));
}

TEST(SnapshotListTest, ListsFreeTheirElements) {
    const auto element = std::make_shared<int>(1);
    {
        SnapshotList<std::shared_ptr<int>> list;
        for (int i = 0; i < 10; ++i)
            list = list.appending(element);
        EXPECT_EQ(element.use_count(), 11);
    }
    EXPECT_EQ(element.use_count(), 1);
}

TEST(SnapshotListTest, GrowingOneByOneMovesEachElementAFewTimesOnly) {
    constexpr int count = 100'000;
    Counted::transfers = 0;
    SnapshotList<Counted> list;
    for (int i = 0; i < count; ++i)
        list = list.appending(Counted(i));
    ASSERT_EQ(list.size(), static_cast<std::size_t>(count));
    EXPECT_EQ(list[count / 2].value, count / 2);
    EXPECT_LT(Counted::transfers, 4u * count);
}

TEST(SnapshotListTest, AVectorIsTakenOverAsItIs) {
    std::vector<Counted> elements(10);
    elements[7].value = 7;
    Counted::transfers = 0;
    const SnapshotList<Counted> list(std::move(elements));
    EXPECT_EQ(list.size(), 10u);
    EXPECT_EQ(list[7].value, 7);
    EXPECT_EQ(Counted::transfers, 0u);
}

TEST(SnapshotListTest, AgreesWithPlainVectorsWhateverGrowsFromWhat) {
    std::mt19937 random(11);
    std::vector<Numbers> lists(1);
    std::vector<std::vector<int>> expected(1);
    for (int i = 0; i < 2000; ++i) {
        const std::size_t origin = random() % lists.size();
        const std::size_t other = random() % lists.size();
        const bool joins = random() % 8 == 0 && lists[origin].size() + lists[other].size() < 1000;
        lists.push_back(joins ? Numbers::joining({lists[origin], lists[other]}) : lists[origin].appending(i));
        expected.push_back(expected[origin]);
        if (joins)
            expected.back().insert(expected.back().end(), expected[other].begin(), expected[other].end());
        else
            expected.back().push_back(i);
    }
    for (std::size_t i = 0; i < lists.size(); ++i) {
        ASSERT_EQ(std::vector<int>(lists[i].begin(), lists[i].end()), expected[i]);
        ASSERT_EQ(lists[i].size(), expected[i].size());
        for (std::size_t place = 0; place < expected[i].size(); ++place)
            ASSERT_EQ(lists[i][place], expected[i][place]);
    }
}

TEST(SnapshotListTest, ThreadsMayAppendToCopiesOfOneList) {
    const Numbers shared = Numbers{1, 2}.appending(3);
    std::vector<Numbers> grown(4, shared);
    std::vector<std::thread> threads;
    for (std::size_t thread = 0; thread < grown.size(); ++thread) {
        threads.emplace_back([&list = grown[thread], number = static_cast<int>(thread)] {
            for (int i = 0; i < 1000; ++i)
                list = list.appending(number);
        });
    }
    for (std::thread& thread : threads)
        thread.join();
    for (std::size_t thread = 0; thread < grown.size(); ++thread) {
        std::vector<int> expected{1, 2, 3};
        expected.resize(1003, static_cast<int>(thread));
        EXPECT_EQ(std::vector<int>(grown[thread].begin(), grown[thread].end()), expected);
    }
}

TEST(SnapshotListTest, ListsAreJoinedInTheirOrder) {
    EXPECT_THAT(Numbers::joining({{1, 2}, {}, {3}, {4, 5}}), ElementsAre(1, 2, 3, 4, 5));
    EXPECT_TRUE(Numbers::joining({}).empty());
    EXPECT_TRUE(Numbers::joining({{}, {}}).empty());
}

TEST(SnapshotListTest, JoinedListsAreListsLikeAnyOther) {
    Numbers joined = Numbers::joining({{1, 2}, {3}, {4, 5}});
    EXPECT_EQ(joined.size(), 5u);
    EXPECT_EQ(joined.front(), 1);
    EXPECT_EQ(joined.back(), 5);
    for (int i = 0; i < 5; ++i)
        EXPECT_EQ(joined[static_cast<std::size_t>(i)], i + 1);
    const Numbers longer = joined.appending(6);
    EXPECT_THAT(longer, ElementsAre(1, 2, 3, 4, 5, 6));
    EXPECT_THAT(joined, ElementsAre(1, 2, 3, 4, 5));
    EXPECT_THAT(Numbers::joining({joined, {}, longer}), ElementsAre(1, 2, 3, 4, 5, 1, 2, 3, 4, 5, 6));
    Numbers other{7};
    joined.swap(other);
    EXPECT_THAT(joined, ElementsAre(7));
    EXPECT_THAT(other, ElementsAre(1, 2, 3, 4, 5));
}

TEST(SnapshotListTest, AJoinedListJoinedWithEmptyOnesIsThatList) {
    const Numbers joined = Numbers::joining({{1, 2}, {3}});
    EXPECT_EQ(Numbers::joining({{}, joined, {}}).begin(), joined.begin());
}

TEST(SnapshotListTest, AJoinedListIsWalkedAsLongAsACopyLives) {
    auto joined = std::make_unique<Numbers>(Numbers::joining({{1, 2}, {3}}));
    const Numbers copy = *joined;
    auto place = joined->begin();
    joined = nullptr;
    EXPECT_EQ(*++place, 2);
    EXPECT_EQ(*++place, 3);
    EXPECT_EQ(++place, copy.end());
}

TEST(SnapshotListTest, AListMayBeJoinedWithThoseThatItGrewFrom) {
    const Numbers three = Numbers{1, 2}.appending(3);
    const Numbers four = three.appending(4);  // in the same buffer
    EXPECT_THAT(Numbers::joining({four, three, three}), ElementsAre(1, 2, 3, 4, 1, 2, 3, 1, 2, 3));
}

TEST(SnapshotListTest, JoiningCopiesNoElement) {
    const SnapshotList<Counted> few(std::vector<Counted>(3));
    const SnapshotList<Counted> more(std::vector<Counted>(5));
    Counted::transfers = 0;
    EXPECT_EQ(SnapshotList<Counted>::joining({few, more}).size(), 8u);
    EXPECT_EQ(Counted::transfers, 0u);
}

TEST(SnapshotListTest, AListJoinedWithEmptyOnesIsThatList) {
    const Numbers list{1, 2, 3};
    const Numbers joined = Numbers::joining({{}, list, {}});
    EXPECT_EQ(joined.begin(), list.begin());
    EXPECT_EQ(joined.size(), 3u);
    EXPECT_THAT(joined.appending(4), ElementsAre(1, 2, 3, 4));
    EXPECT_EQ(list.size(), 3u);
}

TEST(SnapshotListTest, AReaderSeesAWholeListWhileItGrows) {
    constexpr int count = 5000;
    std::mutex guard;
    Numbers published;
    std::thread writer([&] {
        for (int i = 0; i < count; ++i) {
            const std::lock_guard lock(guard);
            published = published.appending(i);
        }
    });
    const auto snapshot = [&] {
        const std::lock_guard lock(guard);
        return published;
    };
    bool isWhole = true;
    for (std::size_t seen = 0; seen < count;) {
        const Numbers list = snapshot();
        seen = list.size();
        for (std::size_t i = 0; i < seen; ++i)
            isWhole = isWhole && list[i] == static_cast<int>(i);
    }
    writer.join();
    EXPECT_TRUE(isWhole);
}

}  // namespace
}  // namespace platform
