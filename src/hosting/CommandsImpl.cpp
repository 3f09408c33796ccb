#include "hosting/CommandsImpl.h"

#include "Nimbo/ResultCodes.h"
#include "Tarn/Node.h"
#include "Tarn/Parameters.h"
#include "Tarn/Pool.h"
#include "hosting/NodeAdapter.h"
#include "hosting/NodeImpl.h"

namespace Tarn {

CommandsImpl::CommandsImpl(const Nimbo::Context* context)
    : ownedContext_(context == nullptr ? std::make_unique<Nimbo::Context>() : nullptr),
      context_(context != nullptr ? context : ownedContext_.get()),
      types_(*context_),
      launcher_(std::make_unique<Nimbo::NodesLauncher>(*context_)) {}

CommandsImpl::~CommandsImpl() {
    std::vector<Node*> nodes;
    {
        std::lock_guard<std::mutex> hold(lock_);
        tearingDown_ = true;  // no node is launched from here on
        nodes = nodes_;
    }
    // 1. No message reaches a node from here on.
    for (Node* node : nodes) {
        NodeImpl& impl = NodeInternal::Impl(*node);
        if (auto* adapter = impl.kernelNode.exchange(nullptr)) adapter->Bind(nullptr);
        if (auto* adapter = impl.callbackNode.exchange(nullptr)) adapter->Bind(nullptr);
    }
    // 2. The kernel stops its nodes, waits for deliveries under way, and releases them. A command
    // still running may ask for pools meanwhile; they are taken below with the others.
    launcher_.reset();
    // 3 and 4. Nodes, then pools.
    std::map<ZelUnicodeString, Pool*> pools;
    {
        std::lock_guard<std::mutex> hold(lock_);
        nodes.swap(nodes_);
        pools.swap(pools_);
    }
    for (Node* node : nodes) delete node;
    for (auto& pool : pools) delete pool.second;
    // 5. The hypervisor; the registry and the context go with the members, context last.
    hypervisor_.reset();
}

Pool& CommandsImpl::GetPool(const ZelUnicodeString& name) {
    std::lock_guard<std::mutex> hold(lock_);
    auto found = pools_.find(name);
    if (found != pools_.end()) return *found->second;
    Pool* pool = new Pool(name, *this);
    pools_.emplace(name, pool);
    // The commands deployed for this pool are attached here once declarations are read.
    return *pool;
}

bool CommandsImpl::LaunchNode(Node* node, Nimbo::Node& kernel) {
    std::lock_guard<std::mutex> hold(lock_);
    if (tearingDown_ || !launcher_->Launch(kernel)) return false;
    nodes_.push_back(node);
    return true;
}

bool CommandsImpl::LaunchNode(Node* node, Nimbo::CallbackNode& kernel) {
    std::lock_guard<std::mutex> hold(lock_);
    if (tearingDown_ || !launcher_->Launch(kernel)) return false;
    nodes_.push_back(node);
    return true;
}

long CommandsImpl::StartHypervisor(const Nimbo::HypervisorSettings* settings) {
    std::lock_guard<std::mutex> hold(lock_);
    if (hypervisor_) return E_FAIL;
    if (settings == nullptr) {
        hypervisor_ = std::make_unique<Nimbo::Hypervisor>(*context_);
        hypervisor_->Start();
        hypervisor_->ListenOnWebSocket();
        return S_OK;
    }
    hypervisor_ = std::make_unique<Nimbo::Hypervisor>(*context_, *settings);
    long result = hypervisor_->Start();
    if (result < 0) return result;
    return hypervisor_->ListenOnWebSocket();
}

long CommandsImpl::Execute(const ZelUnicodeString& name, int policy) {
    Nimbo::Hypervisor* hypervisor;
    {
        std::lock_guard<std::mutex> hold(lock_);
        hypervisor = hypervisor_.get();
    }
    if (hypervisor == nullptr) return E_FAIL;
    return hypervisor->Execute(name, static_cast<Nimbo::ExecutePolicy>(policy));
}

long CommandsImpl::WaitAll() {
    // Only the nodes that existed when the wait began are known to have stopped; a node created
    // meanwhile keeps running and stays bound.
    std::vector<Node*> nodes;
    {
        std::lock_guard<std::mutex> hold(lock_);
        nodes = nodes_;
    }
    long result = launcher_->WaitAll();
    for (Node* node : nodes) {
        // The stopped kernel node stays with the launcher; the callback node stays bound.
        if (auto* adapter = NodeInternal::Impl(*node).kernelNode.exchange(nullptr)) {
            adapter->Bind(nullptr);
        }
    }
    return result;
}

// --- Commands --------------------------------------------------------------------------------------

Commands::Commands(const Nimbo::Context& context) : impl_(new CommandsImpl(&context)) {
    impl_->owner_ = this;
}

Commands::Commands() : impl_(new CommandsImpl(nullptr)) { impl_->owner_ = this; }

Commands::~Commands() { delete impl_; }

Pool& Commands::GetPool(const ZelUnicodeString& name) { return impl_->GetPool(name); }

Parameters Commands::CreateParameters() const { return impl_->GetTypes().CreateParameters(); }

long Commands::Execute(const ZelUnicodeString& name, int policy) {
    return impl_->Execute(name, policy);
}

long Commands::HypervisorExecute(const ZelUnicodeString&) { return E_NOTIMPL; }

bool Commands::HasHypervisor() { return Nimbo::Context::HasHypervisor(); }

long Commands::StartHypervisor() { return impl_->StartHypervisor(nullptr); }

long Commands::StartHypervisor(const Nimbo::HypervisorSettings& settings) {
    return impl_->StartHypervisor(&settings);
}

long Commands::WaitAll() { return impl_->WaitAll(); }

Response& Commands::GetDefaultResponse() { return impl_->GetDefaultResponse(); }

Types& Commands::GetTypes() const { return impl_->GetTypes(); }

}  // namespace Tarn
