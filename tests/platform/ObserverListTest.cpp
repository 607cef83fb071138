#include "platform/ObserverList.h"

#include <gtest/gtest.h>

namespace {

TEST(ObserverList, ObserversHearWhileTheirOwnersLive) {
    platform::ObserverList<int> observers;
    int first = 0, second = 0;
    auto firstOwner = std::make_shared<int>();
    const auto secondOwner = std::make_shared<int>();
    observers.add(firstOwner, [&](int number) { first += number; });
    observers.add(secondOwner, [&](int number) { second += number; });

    observers.notify(1);
    firstOwner.reset();
    observers.notify(10);
    EXPECT_EQ(first, 1);
    EXPECT_EQ(second, 11);
}

TEST(ObserverList, AnOwnerThatGoesMeanwhileIsAskedNothingMore) {
    platform::ObserverList<> observers;
    const auto firstOwner = std::make_shared<int>();
    auto secondOwner = std::make_shared<int>();
    int calls = 0;
    observers.add(firstOwner, [&] { secondOwner.reset(); });
    observers.add(secondOwner, [&] { ++calls; });
    observers.notify();
    EXPECT_EQ(calls, 0);
}

TEST(ObserverList, AnOwnerLivesWhileItsObserverIsCalled) {
    platform::ObserverList<> observers;
    auto owner = std::make_shared<int>();
    const std::weak_ptr<int> watched = owner;
    observers.add(owner, [&] {
        owner.reset();
        EXPECT_FALSE(watched.expired());
    });
    observers.notify();
    EXPECT_TRUE(watched.expired());
}

TEST(ObserverList, AnObserverMayAddAnother) {
    platform::ObserverList<> observers;
    const auto owner = std::make_shared<int>();
    int calls = 0;
    observers.add(owner, [&] { observers.add(owner, [&] { ++calls; }); });
    observers.notify();
    EXPECT_EQ(calls, 0);
    observers.notify();
    EXPECT_EQ(calls, 1);
}

}  // namespace
