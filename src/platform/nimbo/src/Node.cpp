#include "Nimbo/Node.h"

#include "ContextImpl.h"
#include "Nimbo/Hypervisor.h"
#include "Nimbo/ResultCodes.h"
#include "NodeCore.h"
#include "NodeInternal.h"

namespace Nimbo {

Node::Node(const ZelUnicodeString& name) : Node(name, NodeSettings()) {}

Node::Node(const ZelUnicodeString& name, const NodeSettings& settings)
    : core_(std::make_shared<NodeCore>(*this, name, settings, false)) {}

Node::Node(const ZelUnicodeString& name, CallbackKind)
    : core_(std::make_shared<NodeCore>(*this, name, NodeSettings(), true)) {}

Node::~Node() { core_->Stop(); }

long Node::OnBinary(const Binary&, Channel&) { return S_OK; }

long Node::OnText(const ZelUnicodeString&, Channel&) { return S_OK; }

void Node::OnHypervisorConnect() {}

void Node::OnHypervisorDisconnect() {}

long Node::AllowWebAccess() { return S_OK; }

long Node::Stop() { return core_->Stop(); }

long Node::Execute(const ZelUnicodeString&, ExecutePolicy) { return E_NOTIMPL; }

long Node::SendBinary(const NodeId& target, const Binary& message) {
    return core_->Send(NodeInternal::Core(target), message);
}

long Node::SendBinaryAndWait(const NodeId& target, const Binary& message) {
    return core_->SendAndWait(NodeInternal::Core(target), message);
}

long Node::SendBinaryOnDisconnection(const NodeId& target, const Binary& message) {
    return core_->ArmNotice(NodeInternal::Core(target), message);
}

long Node::EmitBinary(const ZelUnicodeString& name, const Binary& message) {
    return core_->Emit(name, message);
}

long Node::Subscribe(const NodeId& emitter, const ZelUnicodeString& name) {
    return core_->SubscribeTo(NodeInternal::Core(emitter), name);
}

long Node::Connect(const ZelUnicodeString& poolName, NodePool& pool) {
    ContextImpl* context = core_->GetContext();
    if (!core_->IsRunning() || context == nullptr) return E_FAIL;
    NodeInternal::Bind(pool, *context, poolName);
    return S_OK;
}

long Node::SelectMyself(NodeId& id) {
    if (!core_->IsRunning()) return E_FAIL;
    id = NodeInternal::MakeId(core_);
    return S_OK;
}

const ZelUnicodeString& Node::GetName() const { return core_->GetName(); }

}  // namespace Nimbo
