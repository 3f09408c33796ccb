#include "Nimbo/NodesLauncher.h"

#include <memory>

#include "ContextImpl.h"
#include "LauncherState.h"
#include "Nimbo/CallbackNode.h"
#include "Nimbo/Context.h"
#include "Nimbo/ResultCodes.h"
#include "NodeCore.h"
#include "NodeInternal.h"

namespace Nimbo {

class LauncherImpl {
public:
    explicit LauncherImpl(ContextImpl& context)
        : context_(context), state_(std::make_shared<LauncherState>()) {}

    ContextImpl& context_;
    const std::shared_ptr<LauncherState> state_;
};

void LauncherState::Add(Node& node) {
    std::lock_guard<std::mutex> hold(mutex_);
    nodes_.push_back(&node);
}

std::vector<Node*> LauncherState::TakeAll() {
    std::lock_guard<std::mutex> hold(mutex_);
    std::vector<Node*> nodes;
    nodes.swap(nodes_);
    return nodes;
}

void LauncherState::NodeFinished() {
    std::lock_guard<std::mutex> hold(mutex_);
    finished_.notify_all();
}

void LauncherState::WaitAll() {
    std::unique_lock<std::mutex> hold(mutex_);
    finished_.wait(hold, [this] {
        for (Node* node : nodes_) {
            const auto& core = NodeInternal::Core(*node);
            if (!core->IsCallback() && !core->IsFinished()) return false;
        }
        return true;
    });
}

NodesLauncher::NodesLauncher(const Context& context) : impl_(new LauncherImpl(context.GetImpl())) {}

NodesLauncher::~NodesLauncher() {
    const std::vector<Node*> nodes = impl_->state_->TakeAll();
    // Halting all before finishing any releases nodes that wait for an answer from one another.
    for (Node* node : nodes) NodeInternal::Core(*node)->Halt();
    for (Node* node : nodes) NodeInternal::Core(*node)->Finish();
    for (Node* node : nodes) delete node;
    delete impl_;
}

bool NodesLauncher::Launch(Node& node) {
    if (!NodeInternal::Core(node)->Launch(impl_->context_, impl_->state_)) return false;
    impl_->state_->Add(node);
    return true;
}

bool NodesLauncher::Launch(CallbackNode& node) { return Launch(static_cast<Node&>(node)); }

long NodesLauncher::WaitAll() {
    impl_->state_->WaitAll();
    return S_OK;
}

}  // namespace Nimbo
