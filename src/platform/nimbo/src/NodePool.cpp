#include "Nimbo/NodePool.h"

#include "ContextImpl.h"
#include "Nimbo/NodeId.h"
#include "Nimbo/ResultCodes.h"
#include "NodeCore.h"
#include "NodeInternal.h"

namespace Nimbo {

long NodePool::Select(NodeId& id) const { return Select(id, Criterion()); }

long NodePool::Select(NodeId& id, const Criterion& criterion) const {
    if (context_ == nullptr) return E_FAIL;
    std::shared_ptr<NodeCore> picked = context_->Select(name_, criterion);
    if (picked == nullptr) return E_FAIL;
    id = NodeInternal::MakeId(std::move(picked));
    return S_OK;
}

}  // namespace Nimbo
