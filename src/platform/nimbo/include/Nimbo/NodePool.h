// Nimbo::NodePool and Nimbo::Criterion: picking one of the live nodes that carry a name.
//
// Node::Connect(poolName, pool) binds a pool to a name in the node's context; Select then picks one
// of the nodes launched under that name and still running. Round robin by default: the rotation is
// kept by the context, per name, so successive selections spread over the nodes even through
// fresh NodePool objects. A Criterion can ask for the least loaded node instead, the one with the
// fewest queued messages (ties go round robin).
//
// Select is safe from any thread; binding (Connect, assignment) must not race with a Select on the
// same pool object. The pool's context must outlive it.
#ifndef NIMBO_NODEPOOL_H_
#define NIMBO_NODEPOOL_H_

#include "ZelUnicodeString.h"

namespace Nimbo {

class ContextImpl;
class NodeId;

class Criterion {
public:
    enum Policy { kRoundRobin = 0, kLeastLoaded = 1 };

    Criterion() = default;
    explicit Criterion(Policy policy) : policy_(policy) {}
    static Criterion LeastLoaded() { return Criterion(kLeastLoaded); }

    Policy GetPolicy() const { return policy_; }

private:
    Policy policy_ = kRoundRobin;
};

class NodePool {
public:
    // An unbound pool: Select fails until a Connect binds it.
    NodePool() = default;

    // Writes a live node of the pool's name into `id`. Fails (E_FAIL) when the pool is unbound or
    // no such node runs; `id` is then left as it was.
    long Select(NodeId& id) const;
    long Select(NodeId& id, const Criterion& criterion) const;

    // The name the pool was connected to, empty while unbound.
    const ZelUnicodeString& GetName() const { return name_; }

private:
    friend class NodeInternal;

    ContextImpl* context_ = nullptr;
    ZelUnicodeString name_;
};

}  // namespace Nimbo

#endif  // NIMBO_NODEPOOL_H_
