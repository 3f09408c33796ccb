#include "hosting/NodeImpl.h"

#include "Tarn/TypesImpl.h"
#include "hosting/CommandsImpl.h"
#include "hosting/NodeAdapter.h"
#include "hosting/PoolImpl.h"
#include "protocol/ProtocolMessage.h"

namespace Tarn {

NodeImpl::NodeImpl(PoolImpl& pool, Node& node)
    : commands_(pool.GetCommands()),
      pool_(pool),
      node_(node),
      replyHeader_(commands_.GetTypes()) {
    replyHeader_.WriteUint8(Protocol::kProtocol, Protocol::kVersion);
}

NodeImpl::~NodeImpl() = default;

Nimbo::Node* NodeImpl::GetKernelNode() const {
    if (KernelNodeAdapter* node = kernelNode.load(std::memory_order_acquire)) return node;
    return callbackNode.load(std::memory_order_acquire);
}

const ZelUnicodeString& NodeImpl::GetKernelName() const { return pool_.GetName(); }

const TypesImpl& NodeImpl::GetTypesImpl() const { return commands_.GetTypes().GetImpl(); }

void NodeImpl::AddPending(const ZelUnicodeString& guid,
                          std::shared_ptr<const ResponseHandler> handler) {
    std::lock_guard<std::mutex> hold(lock_);
    pending_.emplace(guid, std::move(handler));
}

void NodeImpl::AddSubscription(const ZelUnicodeString& name,
                               std::shared_ptr<const ResponseHandler> handler) {
    std::lock_guard<std::mutex> hold(lock_);
    subscriptions_.emplace(name, std::move(handler));
}

std::size_t NodeImpl::PendingCount() const {
    std::lock_guard<std::mutex> hold(lock_);
    return pending_.size();
}

void NodeImpl::Log(const ZelUnicodeString& text, long code) const {
    if (Nimbo::Node* kernel = GetKernelNode()) GetTypesImpl().Monitor(*kernel, text, code);
}

}  // namespace Tarn
