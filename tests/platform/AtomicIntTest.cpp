#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <vector>

#include "Nimbo/AtomicInt.h"

namespace {

TEST(AtomicIntTest, IncrementAndDecrementReturnTheNewValue) {
    Nimbo::AtomicInt count(41);
    EXPECT_EQ(count.Increment(), 42);
    Nimbo::AtomicInt zero;
    EXPECT_EQ(zero.Decrement(), -1);
    EXPECT_EQ(zero.Get(), -1);
}

// A reference count with concurrent traffic: no update is lost, exactly one thread sees zero, and
// it sees what the others wrote before their last decrement (ThreadSanitizer checks the ordering).
TEST(AtomicIntTest, ThreadsCountAReferenceDownToZeroOnce) {
    constexpr int kThreads = 4;
    for (int round = 0; round < 20; ++round) {
        Nimbo::AtomicInt references(kThreads);
        int written[kThreads] = {};
        std::atomic<int> sawZero{0};
        std::atomic<bool> go{false};
        int sumSeenByLast = -1;
        std::vector<std::thread> threads;
        for (int t = 0; t < kThreads; ++t) {
            threads.emplace_back([&, t] {
                while (!go) std::this_thread::yield();
                for (int i = 0; i < 20000; ++i) {  // never reaches zero: this thread holds one
                    if (references.Increment() < 2 || references.Decrement() < 1) ++sawZero;
                }
                written[t] = t + 1;
                if (references.Decrement() == 0) {
                    ++sawZero;
                    sumSeenByLast = 0;
                    for (int value : written) sumSeenByLast += value;
                }
            });
        }
        go = true;
        for (std::thread& thread : threads) thread.join();
        EXPECT_EQ(sawZero, 1);
        EXPECT_EQ(sumSeenByLast, kThreads * (kThreads + 1) / 2);
        EXPECT_EQ(references.Get(), 0);
    }
}

}  // namespace
