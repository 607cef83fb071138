#include "platform/SmallMutex.h"

#include <gtest/gtest.h>

#include <thread>
#include <vector>

namespace platform {
namespace {

TEST(SmallMutexTest, OneThreadAtATimeHoldsIt) {
    constexpr int threadCount = 4;
    constexpr int rounds = 20'000;
    SmallMutex mutex;
    long count = 0;
    std::vector<std::thread> threads;
    for (int i = 0; i < threadCount; ++i) {
        threads.emplace_back([&] {
            for (int round = 0; round < rounds; ++round) {
                Locked lock(mutex);
                ++count;
            }
        });
    }
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(count, threadCount * rounds);
}

TEST(SmallMutexTest, EveryThreadThatWaitsGetsIt) {
    SmallMutex mutex;
    int holders = 0;
    std::vector<std::thread> threads;
    mutex.lock();
    for (int i = 0; i < 8; ++i) {
        threads.emplace_back([&] {
            Locked lock(mutex);
            ++holders;
        });
    }
    mutex.unlock();
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(holders, 8);
}

TEST(SmallMutexTest, ItIsSmall) {
    EXPECT_EQ(sizeof(SmallMutex), 4u);
}

}  // namespace
}  // namespace platform
