#include "Nimbo/Context.h"

#include <algorithm>

#include "ContextImpl.h"
#include "NodeCore.h"

namespace Nimbo {

Context::Context() : impl_(new ContextImpl(*this)) {}

Context::~Context() { delete impl_; }

bool Context::HasHypervisor() { return ContextImpl::StartedHypervisors().load() > 0; }

bool Context::WaitUntilIdle(std::chrono::milliseconds timeout) const {
    return impl_->WaitUntilIdle(timeout);
}

std::atomic<int>& ContextImpl::StartedHypervisors() {
    static std::atomic<int> started{0};
    return started;
}

void ContextImpl::Register(const std::shared_ptr<NodeCore>& node) {
    std::lock_guard<std::mutex> hold(registryMutex_);
    pools_[node->GetName()].nodes.push_back(node);
}

void ContextImpl::Unregister(const NodeCore& node) {
    std::lock_guard<std::mutex> hold(registryMutex_);
    auto pool = pools_.find(node.GetName());
    if (pool == pools_.end()) return;
    auto& nodes = pool->second.nodes;
    nodes.erase(
        std::remove_if(nodes.begin(), nodes.end(),
                       [&node](const std::shared_ptr<NodeCore>& n) { return n.get() == &node; }),
        nodes.end());
    // An empty name is forgotten, so that many short-lived names do not pile up.
    if (nodes.empty()) pools_.erase(pool);
}

std::shared_ptr<NodeCore> ContextImpl::Select(const ZelUnicodeString& name,
                                              const Criterion& criterion) {
    std::lock_guard<std::mutex> hold(registryMutex_);
    auto found = pools_.find(name);
    if (found == pools_.end() || found->second.nodes.empty()) return nullptr;
    Pool& pool = found->second;
    const std::size_t count = pool.nodes.size();
    std::size_t pick = pool.next % count;
    if (criterion.GetPolicy() == Criterion::kLeastLoaded) {
        // Scanning from the round-robin position makes ties rotate too.
        std::size_t least = pool.nodes[pick]->QueuedCount();
        for (std::size_t step = 1; step < count && least > 0; ++step) {
            const std::size_t at = (pool.next + step) % count;
            const std::size_t queued = pool.nodes[at]->QueuedCount();
            if (queued < least) {
                least = queued;
                pick = at;
            }
        }
    }
    pool.next = pick + 1;
    return pool.nodes[pick];
}

bool ContextImpl::WaitUntilIdle(std::chrono::milliseconds timeout) {
    std::unique_lock<std::mutex> hold(idleMutex_);
    idleWaiters_.fetch_add(1);
    const bool idle = idle_.wait_for(hold, timeout, [this] { return pending_.load() == 0; });
    idleWaiters_.fetch_sub(1);
    return idle;
}

}  // namespace Nimbo
