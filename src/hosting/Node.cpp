#include "Tarn/Node.h"

#include "Nimbo/NodePool.h"
#include "Nimbo/ResultCodes.h"
#include "Tarn/CommandRequest.h"
#include "Tarn/IterativeRequest.h"
#include "Tarn/Message.h"
#include "Tarn/NodeId.h"
#include "Tarn/Request.h"
#include "Tarn/Types.h"
#include "hosting/CommandsImpl.h"
#include "hosting/NodeAdapter.h"
#include "hosting/NodeImpl.h"
#include "parameters/ParametersImpl.h"
#include "protocol/CommandRequestImpl.h"
#include "protocol/ProtocolMessage.h"

namespace Tarn {

Node::Node(PoolImpl& pool) : impl_(new NodeImpl(pool, *this)) {}

Node::~Node() { delete impl_; }

Types& Node::GetTypes() const { return impl_->GetCommands().GetTypes(); }

long Node::Stop() {
    if (auto* node = impl_->kernelNode.load()) node->Stop();
    if (auto* node = impl_->callbackNode.load()) node->Stop();
    return S_OK;
}

long Node::Execute(const ZelUnicodeString& name, int policy) {
    Nimbo::Node* kernel = impl_->GetKernelNode();
    if (kernel == nullptr) return E_FAIL;
    return kernel->Execute(name, static_cast<Nimbo::ExecutePolicy>(policy));
}

Nimbo::CallbackNode* Node::GetCallbackNode() const { return impl_->callbackNode.load(); }

void Node::SetData(void* data) { impl_->userData.store(data); }

void Node::GetData(void*& data) { data = impl_->userData.load(); }

Response& Node::GetDefaultResponse() { return impl_->GetCommands().GetDefaultResponse(); }

Parameters Node::CreateParameters() { return Parameters(GetTypes()); }

Message Node::CreateMessage() { return Message(impl_->GetCommands().GetOwner()); }

// --- Requests ------------------------------------------------------------------------------------

namespace {

CommandRequestImpl* NewRequest(NodeImpl& node, const Nimbo::NodeId& target,
                               const ZelUnicodeString& command, int version,
                               ResponseHandler handler) {
    auto* impl = new CommandRequestImpl();
    if (impl->Setup(node, target, command, version) >= 0) {
        node.AddPending(impl->GetGuid(),
                        std::make_shared<const ResponseHandler>(std::move(handler)));
    }
    return impl;
}

}  // namespace

long Node::CreateCommandRequest(const NodeId& target, const ZelUnicodeString& command,
                                int version, CommandRequest& request) {
    CommandRequestImpl& impl = CommandRequestInternal::Impl(request);
    if (impl.Setup(*impl_, target.GetNimboNodeId(), command, version) < 0) return E_FAIL;
    impl_->AddPending(impl.GetGuid(), std::make_shared<const ResponseHandler>(
                                          ResponseHandler::FromResponse(
                                              CommandRequestInternal::GetResponse(request))));
    return S_OK;
}

Request Node::CreateRequest(const Nimbo::NodeId& target, const ZelUnicodeString& command,
                            int version, Callback callback) {
    return Request(*NewRequest(*impl_, target, command, version,
                               ResponseHandler::FromFunction(callback)));
}

Request Node::CreateRequest(const Nimbo::NodeId& target, const ZelUnicodeString& command,
                            int version, const Callable& callback) {
    return Request(*NewRequest(*impl_, target, command, version,
                               ResponseHandler::FromCallable(callback)));
}

IterativeRequest Node::CreateIterativeRequest(const Nimbo::NodeId& target,
                                              const ZelUnicodeString& command, int version,
                                              Callback callback) {
    return IterativeRequest(*NewRequest(*impl_, target, command, version,
                                        ResponseHandler::FromFunction(callback)));
}

IterativeRequest Node::CreateIterativeRequest(const Nimbo::NodeId& target,
                                              const ZelUnicodeString& command, int version,
                                              const Callable& callback) {
    return IterativeRequest(*NewRequest(*impl_, target, command, version,
                                        ResponseHandler::FromCallable(callback)));
}

// --- Events --------------------------------------------------------------------------------------

long Node::Emit(const ZelUnicodeString& name, const Message& message) const {
    Nimbo::Node* kernel = impl_->GetKernelNode();
    if (kernel == nullptr) return E_FAIL;
    std::vector<ZelUnicodeString> names;
    if (message.GetDomainNames(names) < 0) return E_FAIL;
    Parameters emission = ParametersInternal::Make(impl_->GetTypesImpl());
    emission.WriteString(Protocol::kEmit, name);
    emission.WriteStringArray(Protocol::kDomainNames, names);
    ParametersInternal::PutObject(emission, Protocol::kDomains, message.GetDomains());
    emission.WriteUint8(Protocol::kProtocol, Protocol::kVersion);
    return kernel->EmitBinary(name, emission.ToBinary());
}

long Node::Emit(const ZelUnicodeString& name, const Parameters& parameters) const {
    Nimbo::Node* kernel = impl_->GetKernelNode();
    if (kernel == nullptr) return E_FAIL;
    Parameters emission = ParametersInternal::Make(impl_->GetTypesImpl());
    emission.WriteString(Protocol::kEmit, name);
    ParametersInternal::PutObject(emission, Protocol::kParams, parameters);
    emission.WriteUint8(Protocol::kProtocol, Protocol::kVersion);
    return kernel->EmitBinary(name, emission.ToBinary());
}

namespace {

long SubscribeWith(NodeImpl& node, const Nimbo::NodeId& source, const ZelUnicodeString& name,
                   ResponseHandler handler) {
    Nimbo::Node* kernel = node.GetKernelNode();
    if (kernel == nullptr) return E_FAIL;
    if (kernel->Subscribe(source, name) < 0) return E_FAIL;
    node.AddSubscription(name, std::make_shared<const ResponseHandler>(std::move(handler)));
    return S_OK;
}

}  // namespace

long Node::Subscribe(const NodeId& source, const ZelUnicodeString& name,
                     const Response& response) {
    return Subscribe(source.GetNimboNodeId(), name, response);
}

long Node::Subscribe(const Nimbo::NodeId& source, const ZelUnicodeString& name,
                     const Response& response) {
    return SubscribeWith(*impl_, source, name, ResponseHandler::FromResponse(response));
}

long Node::Subscribe(const Nimbo::NodeId& source, const ZelUnicodeString& name,
                     Callback callback) {
    return SubscribeWith(*impl_, source, name, ResponseHandler::FromFunction(callback));
}

long Node::Subscribe(const Nimbo::NodeId& source, const ZelUnicodeString& name,
                     const Callable& callback) {
    return SubscribeWith(*impl_, source, name, ResponseHandler::FromCallable(callback));
}

// --- Selection -----------------------------------------------------------------------------------

namespace {

// Asks the kernel to tell `target` when this node disconnects.
void ArmDisconnectNotice(NodeImpl& node, Nimbo::Node& kernel, const Nimbo::NodeId& target) {
    Parameters notice = ParametersInternal::Make(node.GetTypesImpl());
    notice.WriteInt8(Protocol::kDisconnect, 0);
    notice.WriteUint8(Protocol::kProtocol, Protocol::kVersion);
    kernel.SendBinaryOnDisconnection(target, notice.ToBinary());
}

long SelectFrom(NodeImpl& node, const ZelUnicodeString& poolName, Nimbo::NodeId& id,
                const Nimbo::Criterion* criterion) {
    Nimbo::Node* kernel = node.GetKernelNode();
    if (kernel == nullptr || poolName.IsEmpty()) return E_FAIL;
    Nimbo::NodePool pool;
    if (kernel->Connect(poolName, pool) < 0) return E_FAIL;
    long selected = criterion != nullptr ? pool.Select(id, *criterion) : pool.Select(id);
    if (selected < 0) return E_FAIL;
    ArmDisconnectNotice(node, *kernel, id);
    return S_OK;
}

}  // namespace

long Node::Select(const ZelUnicodeString& poolName, NodeId& id) {
    return SelectFrom(*impl_, poolName, id.GetNimboNodeId(), nullptr);
}

long Node::Select(const ZelUnicodeString& poolName, Nimbo::NodeId& id) {
    return SelectFrom(*impl_, poolName, id, nullptr);
}

long Node::Select(const ZelUnicodeString& poolName, Nimbo::NodeId& id,
                  const Nimbo::Criterion& criterion) {
    return SelectFrom(*impl_, poolName, id, &criterion);
}

long Node::SelectMyself(Nimbo::NodeId& id) {
    Nimbo::Node* kernel = impl_->GetKernelNode();
    if (kernel == nullptr) return E_FAIL;
    if (kernel->SelectMyself(id) < 0) return E_FAIL;
    ArmDisconnectNotice(*impl_, *kernel, id);
    return S_OK;
}

long Node::Connect(const ZelUnicodeString& poolName, NodeId& id) { return Select(poolName, id); }

// --- NodeId --------------------------------------------------------------------------------------

NodeId::NodeId() : id_(new Nimbo::NodeId()), valid_(E_FAIL) {}

NodeId::NodeId(const NodeId& other) : id_(new Nimbo::NodeId(*other.id_)), valid_(E_FAIL) {}

NodeId& NodeId::operator=(const NodeId& other) {
    *id_ = *other.id_;
    return *this;
}

NodeId::~NodeId() { delete id_; }

NodeId::operator Nimbo::NodeId() const { return *id_; }

}  // namespace Tarn
