// Nimbo::Context: a registry of launched nodes.
//
// Applications usually have one; tests make as many as they like. Contexts never see each other's
// nodes: an id, a pool or an emission of one context does not reach a node of another. A Context
// must outlive every launcher, node pool and hypervisor made from it. Every operation is safe from
// any thread.
#ifndef NIMBO_CONTEXT_H_
#define NIMBO_CONTEXT_H_

#include <chrono>

namespace Nimbo {

class ContextImpl;

class Context {
public:
    Context();
    ~Context();
    Context(const Context&) = delete;
    Context& operator=(const Context&) = delete;

    // True while a started hypervisor exists anywhere in the process.
    static bool HasHypervisor();

    // Waits until no message of this context is queued or being delivered; false when `timeout`
    // ran out first. A node that keeps sending to itself never lets its context become idle.
    bool WaitUntilIdle(std::chrono::milliseconds timeout) const;

    // The kernel's own state of this context.
    ContextImpl& GetImpl() const { return *impl_; }

private:
    ContextImpl* impl_;
};

}  // namespace Nimbo

#endif  // NIMBO_CONTEXT_H_
