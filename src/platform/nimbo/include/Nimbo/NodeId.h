// Nimbo::NodeId: the address of one launched node.
//
// A NodeId is a value: it may be copied, compared and kept after its node stopped or was
// destroyed, and then simply reports the node as gone. Ids are unique in the process and ordered
// by the creation of their nodes. A default NodeId addresses nothing, and orders first. Reading one
// NodeId from several threads at once is safe; assigning it while another thread reads it is not.
#ifndef NIMBO_NODEID_H_
#define NIMBO_NODEID_H_

#include <memory>

namespace Nimbo {

class NodeCore;

class NodeId {
public:
    NodeId();
    NodeId(const NodeId& other);
    NodeId& operator=(const NodeId& other);
    ~NodeId();

    // Non-zero while the node runs; 0 for a default id and for a node that stopped.
    long GetStatus() const;

    bool operator==(const NodeId& other) const;
    bool operator!=(const NodeId& other) const { return !(*this == other); }
    bool operator<(const NodeId& other) const;

private:
    friend class NodeInternal;
    explicit NodeId(std::shared_ptr<NodeCore> core);

    std::shared_ptr<NodeCore> core_;
};

}  // namespace Nimbo

#endif  // NIMBO_NODEID_H_
