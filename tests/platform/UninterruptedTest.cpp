// What is done again after a signal, and what is not.
#include "platform/linux/Uninterrupted.h"

#include <gtest/gtest.h>

namespace platform {
namespace {

const int something = 0;

TEST(Uninterrupted, ACallThatWasInterruptedIsMadeAgain) {
    int calls = 0;
    const auto call = [&calls] {
        errno = ++calls < 3 ? EINTR : 0;
        return errno ? -1 : 7;
    };
    EXPECT_EQ(uninterrupted(call), 7);
    EXPECT_EQ(calls, 3);
}

TEST(Uninterrupted, NilIsAFailureOfACallThatAnswersAPointer) {
    int calls = 0;
    const auto call = [&calls] {
        errno = ++calls < 3 ? EINTR : 0;
        return errno ? nullptr : &something;
    };
    EXPECT_EQ(uninterrupted(call), &something);
    EXPECT_EQ(calls, 3);
}

// errno means nothing then.
TEST(Uninterrupted, WhatSucceedsIsDoneOnce) {
    int calls = 0;
    const auto call = [&calls] {
        errno = calls == 0 ? EINTR : 0;
        return calls++;
    };
    EXPECT_EQ(uninterrupted(call), 0);
    EXPECT_EQ(calls, 1);
}

TEST(Uninterrupted, NilWithoutAnErrorIsAnAnswer) {
    int calls = 0;
    errno = EINTR;  // of something before
    const auto call = [&calls]() -> const int* {
        ++calls;
        return nullptr;
    };
    EXPECT_EQ(uninterrupted(call), nullptr);
    EXPECT_EQ(errno, 0);
    EXPECT_EQ(calls, 1);
}

TEST(Uninterrupted, AnyOtherFailureIsTheAnswer) {
    int calls = 0;
    const auto call = [&calls] {
        ++calls;
        errno = EIO;
        return -1;
    };
    EXPECT_EQ(uninterrupted(call), -1);
    EXPECT_EQ(errno, EIO);
    EXPECT_EQ(calls, 1);
}

}  // namespace
}  // namespace platform
