// ContextImpl: the state behind a Nimbo::Context.
//
// It keeps the running nodes by name (for node pools, with the round-robin position of each name)
// and counts the messages that are queued or being delivered, for WaitUntilIdle. Every member is
// safe from any thread. The registry lock is never held while a node's own locks are taken, nor
// while user code runs.
#ifndef NIMBO_SRC_CONTEXTIMPL_H_
#define NIMBO_SRC_CONTEXTIMPL_H_

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <map>
#include <memory>
#include <mutex>
#include <vector>

#include "Nimbo/NodePool.h"
#include "ZelUnicodeString.h"

namespace Nimbo {

class Context;
class NodeCore;

class ContextImpl {
public:
    explicit ContextImpl(const Context& owner) : owner_(owner) {}
    ContextImpl(const ContextImpl&) = delete;
    ContextImpl& operator=(const ContextImpl&) = delete;

    const Context& GetContext() const { return owner_; }

    // Running nodes, by name. A node is registered when launched and removed when it stops.
    void Register(const std::shared_ptr<NodeCore>& node);
    void Unregister(const NodeCore& node);
    // A registered node named `name`, picked as `criterion` asks, or null when none runs.
    std::shared_ptr<NodeCore> Select(const ZelUnicodeString& name, const Criterion& criterion);

    // One message more, or less, queued or being delivered.
    void BeginWork() { pending_.fetch_add(1, std::memory_order_relaxed); }
    void EndWork() {
        // Sequentially consistent with the waiter count below: either the waiter sees 0 pending,
        // or this sees the waiter and wakes it.
        if (pending_.fetch_sub(1) == 1 && idleWaiters_.load() > 0) {
            std::lock_guard<std::mutex> hold(idleMutex_);
            idle_.notify_all();
        }
    }
    bool WaitUntilIdle(std::chrono::milliseconds timeout);

    // Hypervisors started and not yet destroyed, in the whole process.
    static std::atomic<int>& StartedHypervisors();

private:
    struct Pool {
        std::vector<std::shared_ptr<NodeCore>> nodes;  // in launch order
        std::size_t next = 0;                          // round-robin position
    };

    const Context& owner_;

    std::mutex registryMutex_;
    std::map<ZelUnicodeString, Pool> pools_;

    std::atomic<long> pending_{0};
    std::atomic<int> idleWaiters_{0};
    std::mutex idleMutex_;
    std::condition_variable idle_;
};

}  // namespace Nimbo

#endif  // NIMBO_SRC_CONTEXTIMPL_H_
