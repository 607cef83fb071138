// Work that is done together is done once, and to its end.
#include "events/SharedWork.h"

#include <gtest/gtest.h>

#include <array>
#include <atomic>
#include <latch>
#include <stdexcept>
#include <thread>

namespace reelix {
namespace {

TEST(SharedWorkTest, IsDoneWithoutHelp) {
    int left = 3;
    SharedWork work([&left] { return left-- > 0; });
    work.finish();
    EXPECT_EQ(left, -1);
}

TEST(SharedWorkTest, LateHelpersFindNothing) {
    int asked = 0;
    SharedWork work([&asked] { return ++asked < 2; });
    work.finish();
    work.help();
    EXPECT_EQ(asked, 2);
}

TEST(SharedWorkTest, EveryPieceIsDoneOnce) {
    constexpr int count = 10'000;
    std::array<std::atomic<int>, count> done{};
    std::atomic<int> next = 0;
    SharedWork work([&] {
        const int piece = next++;
        if (piece < count)
            ++done[static_cast<std::size_t>(piece)];
        return piece < count;
    });
    std::thread helper([&work] { work.help(); });
    work.finish();
    for (const auto& times : done)
        ASSERT_EQ(times, 1);
    helper.join();
}

TEST(SharedWorkTest, TheEndWaitsForWhatHelpersHaveTaken) {
    std::latch helperHasAPiece(1), nothingIsLeft(1);
    std::atomic<int> next = 0;
    std::atomic<bool> pieceIsDone = false;
    SharedWork work([&] {
        switch (next++) {
            case 0:
                helperHasAPiece.count_down();
                nothingIsLeft.wait();
                pieceIsDone = true;
                return true;
            case 1:
                nothingIsLeft.count_down();
                return false;
            default:
                return false;
        }
    });
    std::thread helper([&work] { work.help(); });
    helperHasAPiece.wait();
    work.finish();
    EXPECT_TRUE(pieceIsDone);
    helper.join();
}

TEST(SharedWorkTest, NoPieceOfAbandonedWorkIsBegun) {
    int asked = 0;
    SharedWork work([&asked] { return ++asked < 3; });
    work.abandon();
    work.help();
    work.finish();
    EXPECT_EQ(asked, 0);
}

TEST(SharedWorkTest, AbandoningDoesNotWaitForThePieceThatAHelperHasTaken) {
    std::latch helperHasAPiece(1), isAbandoned(1);
    std::atomic<int> begun = 0;
    SharedWork work([&] {
        ++begun;
        helperHasAPiece.count_down();
        isAbandoned.wait();
        return true;  // there is always more
    });
    std::thread helper([&work] { work.help(); });
    helperHasAPiece.wait();
    work.abandon();
    isAbandoned.count_down();
    helper.join();
    EXPECT_EQ(begun, 1);
}

TEST(SharedWorkTest, AnExceptionEndsTheWorkAndComesOutAtTheEnd) {
    int asked = 0;
    SharedWork work([&asked]() -> bool {
        ++asked;
        throw std::runtime_error("broken");
    });
    EXPECT_THROW(work.finish(), std::runtime_error);
    EXPECT_EQ(asked, 1);
}

TEST(SharedWorkTest, AnExceptionOfAHelperComesOutAtTheEndAsWell) {
    SharedWork work([]() -> bool { throw std::runtime_error("broken"); });
    work.help();
    EXPECT_THROW(work.finish(), std::runtime_error);
}

}  // namespace
}  // namespace reelix
