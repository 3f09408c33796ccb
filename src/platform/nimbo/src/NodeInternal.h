// NodeInternal: the kernel's own access to the private state of its public handles, kept out of
// their public interface.
#ifndef NIMBO_SRC_NODEINTERNAL_H_
#define NIMBO_SRC_NODEINTERNAL_H_

#include <memory>
#include <utility>

#include "Nimbo/Node.h"
#include "Nimbo/NodeId.h"
#include "Nimbo/NodePool.h"

namespace Nimbo {

class NodeInternal {
public:
    static const std::shared_ptr<NodeCore>& Core(const Node& node) { return node.core_; }
    static const std::shared_ptr<NodeCore>& Core(const NodeId& id) { return id.core_; }
    static NodeId MakeId(std::shared_ptr<NodeCore> core) { return NodeId(std::move(core)); }
    static void Bind(NodePool& pool, ContextImpl& context, const ZelUnicodeString& name) {
        pool.context_ = &context;
        pool.name_ = name;
    }
    static ContextImpl* GetContext(const NodePool& pool) { return pool.context_; }
};

}  // namespace Nimbo

#endif  // NIMBO_SRC_NODEINTERNAL_H_
