#include "platform/SmallMutex.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <vector>

namespace platform {
namespace {

TEST(SmallMutexTest, OneThreadAtATimeHoldsIt) {
    SmallMutex mutex;
    std::atomic<int> holders = 0;
    std::atomic<bool> wasAlone = true;
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&] {
            for (int round = 0; round < 2000; ++round) {
                Locked lock(mutex);
                if (++holders != 1)
                    wasAlone = false;
                std::this_thread::yield();  // so that others try meanwhile
                --holders;
            }
        });
    }
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_TRUE(wasAlone);
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
