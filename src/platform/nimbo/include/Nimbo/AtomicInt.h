// Nimbo::AtomicInt: an integer changed atomically; safe from any thread.
#ifndef NIMBO_ATOMICINT_H_
#define NIMBO_ATOMICINT_H_

#include <atomic>

namespace Nimbo {

class AtomicInt {
public:
    explicit AtomicInt(int value = 0) : value_(value) {}
    AtomicInt(const AtomicInt&) = delete;
    AtomicInt& operator=(const AtomicInt&) = delete;

    // Both return the new value.
    int Increment() { return value_.fetch_add(1, std::memory_order_relaxed) + 1; }
    // Acquire-release, so that the thread that sees 0 also sees every write made before the other
    // decrements and may release what the count guards.
    int Decrement() { return value_.fetch_sub(1, std::memory_order_acq_rel) - 1; }
    int Get() const { return value_.load(std::memory_order_acquire); }

private:
    std::atomic<int> value_;
};

}  // namespace Nimbo

#endif  // NIMBO_ATOMICINT_H_
