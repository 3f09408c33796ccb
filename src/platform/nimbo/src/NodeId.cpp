#include "Nimbo/NodeId.h"

#include <utility>

#include "NodeCore.h"

namespace Nimbo {

NodeId::NodeId() = default;
NodeId::NodeId(const NodeId& other) = default;
NodeId& NodeId::operator=(const NodeId& other) = default;
NodeId::~NodeId() = default;
NodeId::NodeId(std::shared_ptr<NodeCore> core) : core_(std::move(core)) {}

long NodeId::GetStatus() const { return core_ != nullptr && core_->IsRunning() ? 1 : 0; }

bool NodeId::operator==(const NodeId& other) const {
    return (core_ ? core_->GetSerial() : 0) == (other.core_ ? other.core_->GetSerial() : 0);
}

bool NodeId::operator<(const NodeId& other) const {
    return (core_ ? core_->GetSerial() : 0) < (other.core_ ? other.core_->GetSerial() : 0);
}

}  // namespace Nimbo
