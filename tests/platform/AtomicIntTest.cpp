#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <vector>

#include "Nimbo/AtomicInt.h"

namespace {

TEST(AtomicIntTest, IncrementAndDecrementReturnTheNewValue) {
    Nimbo::AtomicInt count;
    EXPECT_EQ(count.Get(), 0);
    EXPECT_EQ(count.Increment(), 1);
    EXPECT_EQ(count.Increment(), 2);
    EXPECT_EQ(count.Decrement(), 1);
    EXPECT_EQ(count.Decrement(), 0);
    EXPECT_EQ(count.Decrement(), -1);
    EXPECT_EQ(count.Get(), -1);

    Nimbo::AtomicInt start(41);
    EXPECT_EQ(start.Increment(), 42);
}

TEST(AtomicIntTest, ThreadsLoseNoUpdate) {
    constexpr int kThreads = 4;
    constexpr int kSteps = 20000;
    Nimbo::AtomicInt count;
    std::vector<std::thread> threads;
    for (int t = 0; t < kThreads; ++t) {
        threads.emplace_back([&count, t] {
            for (int i = 0; i < kSteps; ++i) {
                if (t % 2 == 0) {
                    count.Increment();
                    count.Increment();
                } else {
                    count.Decrement();
                }
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(count.Get(), kThreads / 2 * kSteps);
}

// A reference count: exactly one thread sees zero, and it sees what the others wrote before
// their decrements (the sanitizer build checks the ordering).
TEST(AtomicIntTest, ThreadsSeeZeroExactlyOnce) {
    constexpr int kThreads = 4;
    for (int round = 0; round < 50; ++round) {
        Nimbo::AtomicInt references(kThreads);
        int written[kThreads] = {};
        std::atomic<int> sawZero{0};
        int sumSeenByLast = -1;
        std::vector<std::thread> threads;
        for (int t = 0; t < kThreads; ++t) {
            threads.emplace_back([&, t] {
                written[t] = t + 1;
                if (references.Decrement() == 0) {
                    ++sawZero;
                    int sum = 0;
                    for (int value : written) sum += value;
                    sumSeenByLast = sum;
                }
            });
        }
        for (std::thread& thread : threads) thread.join();
        EXPECT_EQ(sawZero, 1);
        EXPECT_EQ(sumSeenByLast, kThreads * (kThreads + 1) / 2);
    }
}

}  // namespace
