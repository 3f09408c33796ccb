#include "hosting/PoolImpl.h"

#include <exception>

#include "Nimbo/ResultCodes.h"
#include "Nimbo/NodeSettings.h"
#include "Tarn/Channel.h"
#include "Tarn/Node.h"
#include "Tarn/Parameters.h"
#include "Tarn/Pool.h"
#include "Tarn/TypesImpl.h"
#include "declarations/DefaultCompatibility.h"
#include "hosting/CommandsImpl.h"
#include "hosting/NodeAdapter.h"
#include "hosting/NodeImpl.h"
#include "protocol/FactoryCommand.h"

namespace Tarn {

PoolImpl::PoolImpl(const ZelUnicodeString& name, CommandsImpl& commands)
    : name_(name), commands_(commands) {}

PoolImpl::~PoolImpl() = default;

long PoolImpl::RegisterCommand(const ZelUnicodeString& name, int version,
                               std::unique_ptr<InProcessCommand> command) {
    if (name.IsEmpty() || !command) return E_FAIL;
    std::unique_lock<std::shared_mutex> hold(lock_);
    return inProcess_.emplace(std::make_pair(name, version), std::move(command)).second ? S_OK
                                                                                      : E_FAIL;
}

InProcessCommand* PoolImpl::FindInProcess(const ZelUnicodeString& name, int version) const {
    std::shared_lock<std::shared_mutex> hold(lock_);
    auto found = inProcess_.find(std::make_pair(name, version));
    return found != inProcess_.end() ? found->second.get() : nullptr;
}

template <typename Call>
long PoolImpl::Guarded(const CommandCallKey& key, const char* operation, Call call) {
    std::string what;
    try {
        return call();
    } catch (const std::exception& e) {
        what = e.what();
    } catch (...) {
        what = "unknown exception";
    }
    commands_.GetTypes().GetImpl().PublishError(
        "<" + key.name + ">::" + operation + " threw an exception, guid <" + key.guid.GetGuid() +
        ">: " + what);
    return E_FAIL;
}

// Deployed commands are served once the pool's declarations are read; until then only in-process
// commands exist, and any other command is unknown.

long PoolImpl::Create(const CommandCallKey& key, Node& node) {
    InProcessCommand* command = FindInProcess(key.name, key.version);
    if (command == nullptr) return E_FAIL;
    return Guarded(key, "create()", [&] { return command->create(key.guid, node); });
}

long PoolImpl::Check(int phase, const CommandCallKey& key, Parameters& parameters) {
    InProcessCommand* command = FindInProcess(key.name, key.version);
    if (command == nullptr) return S_OK;
    Parameters* defaults = phase == 0   ? command->beginDefaults
                           : phase == 1 ? command->sendDefaults
                                        : command->endDefaults;
    if (defaults == nullptr) return S_OK;
    return ReportDefaultIncompatibility(key.name, *defaults, parameters,
                                        commands_.GetTypes().GetImpl());
}

long PoolImpl::Begin(const CommandCallKey& key, Parameters& parameters, Channel& channel) {
    InProcessCommand* command = FindInProcess(key.name, key.version);
    if (command == nullptr) return E_FAIL;
    return Guarded(key, "OnBegin()",
                   [&] { return command->begin(key.guid, parameters, channel); });
}

long PoolImpl::Command(const CommandCallKey& key, Parameters& parameters, Channel& channel) {
    InProcessCommand* command = FindInProcess(key.name, key.version);
    if (command == nullptr) return E_FAIL;
    return Guarded(key, "OnCommand()", [&] {
        return command->command(key.guid, commands_.GetOwner(), parameters, channel);
    });
}

long PoolImpl::End(const CommandCallKey& key, Parameters& parameters, Channel& channel) {
    InProcessCommand* command = FindInProcess(key.name, key.version);
    if (command == nullptr) return E_FAIL;
    return Guarded(key, "OnEnd()", [&] { return command->end(key.guid, parameters, channel); });
}

long PoolImpl::Disconnect(const CommandCallKey& key) {
    InProcessCommand* command = FindInProcess(key.name, key.version);
    if (command == nullptr) return E_FAIL;
    long disconnected =
        Guarded(key, "OnDisconnect()", [&] { return command->disconnect(key.guid); });
    long deleted = Guarded(key, "delete()", [&] { return command->destroy(key.guid); });
    return disconnected == 0 && deleted == 0 ? S_OK : E_FAIL;
}

long PoolImpl::Delete(const CommandCallKey& key) {
    InProcessCommand* command = FindInProcess(key.name, key.version);
    if (command == nullptr) return E_FAIL;
    return Guarded(key, "delete()", [&] { return command->destroy(key.guid); });
}

// --- Pool ----------------------------------------------------------------------------------------

Pool::Pool(const ZelUnicodeString& name, CommandsImpl& commands)
    : impl_(new PoolImpl(name, commands)) {}

Pool::~Pool() { delete impl_; }

namespace {

// Creates a node on a kernel node of type Adapter, launches it, and hands it to the Commands.
template <typename Adapter>
Node* CreateNodeOn(PoolImpl& pool, std::unique_ptr<Adapter> adapter,
                   std::atomic<Adapter*> NodeImpl::*slot) {
    Node* node = NodeInternal::New(pool);
    NodeImpl& impl = NodeInternal::Impl(*node);
    // Bound before launch, so that no message that arrives once it runs is lost.
    adapter->Bind(&impl);
    (impl.*slot).store(adapter.get());
    if (!pool.GetCommands().LaunchNode(node, *adapter)) {
        (impl.*slot).store(nullptr);
        NodeInternal::Delete(node);
        return nullptr;
    }
    adapter.release();  // the launcher owns it now
    return node;
}

}  // namespace

Node* Pool::CreateNode() {
    return CreateNodeOn(*impl_, std::make_unique<KernelNodeAdapter>(impl_->GetName()),
                        &NodeImpl::kernelNode);
}

Node* Pool::CreateNode(const Nimbo::NodeSettings& settings) {
    return CreateNodeOn(*impl_, std::make_unique<KernelNodeAdapter>(impl_->GetName(), settings),
                        &NodeImpl::kernelNode);
}

Node* Pool::CreateNode(Nimbo::NodeSettings& settings) {
    return CreateNode(static_cast<const Nimbo::NodeSettings&>(settings));
}

Node* Pool::CreateCallbackNode() {
    return CreateNodeOn(*impl_, std::make_unique<KernelCallbackNodeAdapter>(impl_->GetName()),
                        &NodeImpl::callbackNode);
}

// A callback node takes a name only; the settings are accepted and not used.
Node* Pool::CreateCallbackNode(const Nimbo::NodeSettings&) { return CreateCallbackNode(); }

Node* Pool::CreateCallbackNode(Nimbo::NodeSettings&) { return CreateCallbackNode(); }

void Pool::deprecated() {}

long Pool::RegisterCommand(const ZelUnicodeString& name, int version, InProcessCommand* command) {
    return impl_->RegisterCommand(name, version, std::unique_ptr<InProcessCommand>(command));
}

long Pool::RegisterCommand(const ZelUnicodeString& name, int version,
                           std::function<CommandInterface*(Node&)> factory) {
    if (!factory) return E_FAIL;
    return impl_->RegisterCommand(name, version,
                                  std::make_unique<FactoryCommand>(std::move(factory)));
}

const ZelUnicodeString& Pool::GetName() const { return impl_->GetName(); }

}  // namespace Tarn
