// Tarn::NodeId: the library's handle on a kernel node id, as filled by Node::Select.
#ifndef TARN_NODEID_H_
#define TARN_NODEID_H_

#include "Tarn/Export.h"

namespace Nimbo {
class NodeId;
}

namespace Tarn {

class TARN_EXPORT NodeId {
public:
    NodeId();
    // Copies the kernel id; the validity mark starts over as a failure.
    NodeId(const NodeId& other);
    // Assigns the kernel id only.
    NodeId& operator=(const NodeId& other);
    ~NodeId();
    operator Nimbo::NodeId() const;  // NOLINT
    long IsValid() const { return valid_; }

private:
    friend class Node;
    friend class NodeIdInternal;
    Nimbo::NodeId& GetNimboNodeId() const { return *id_; }
    void SetValid(long valid) { valid_ = valid; }

    Nimbo::NodeId* id_;
    long valid_;
};

}  // namespace Tarn

#endif  // TARN_NODEID_H_
