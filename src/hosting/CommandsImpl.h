// CommandsImpl: the state behind a Tarn::Commands. Its pools and nodes are guarded by one lock, so
// pools and nodes may be created from several threads; they are only destroyed at teardown.
#ifndef TARN_SRC_HOSTING_COMMANDSIMPL_H_
#define TARN_SRC_HOSTING_COMMANDSIMPL_H_

#include <map>
#include <memory>
#include <mutex>
#include <vector>

#include "Nimbo/Context.h"
#include "Nimbo/Hypervisor.h"
#include "Nimbo/NodesLauncher.h"
#include "Tarn/Commands.h"
#include "Tarn/Response.h"
#include "Tarn/Types.h"

namespace Tarn {

class DeclarativeContext;
class Node;
class Pool;

class CommandsImpl {
public:
    // Borrows `context` when given, else creates one.
    explicit CommandsImpl(const Nimbo::Context* context);
    ~CommandsImpl();
    CommandsImpl(const CommandsImpl&) = delete;
    CommandsImpl& operator=(const CommandsImpl&) = delete;

    Pool& GetPool(const ZelUnicodeString& name);
    // Launches the kernel node of `node`; on success the Commands owns `node` from now on.
    // Fails once teardown has begun.
    bool LaunchNode(Node* node, Nimbo::Node& kernel);
    bool LaunchNode(Node* node, Nimbo::CallbackNode& kernel);
    const Nimbo::Context& GetContext() const { return *context_; }
    Types& GetTypes() { return types_; }
    Commands& GetOwner() const { return *owner_; }
    Response& GetDefaultResponse() { return defaultResponse_; }

    long StartHypervisor(const Nimbo::HypervisorSettings* settings);
    long Execute(const ZelUnicodeString& name, int policy);
    long WaitAll();

    Commands* owner_ = nullptr;

private:
    // Declared first, destroyed last: everything below may use the context.
    std::unique_ptr<Nimbo::Context> ownedContext_;
    const Nimbo::Context* context_;
    Types types_;
    std::mutex lock_;
    bool tearingDown_ = false;
    std::map<ZelUnicodeString, Pool*> pools_;
    std::vector<Node*> nodes_;
    std::unique_ptr<Nimbo::NodesLauncher> launcher_;
    std::unique_ptr<Nimbo::Hypervisor> hypervisor_;
    Response defaultResponse_;
};

class CommandsInternal {
public:
    static CommandsImpl& Impl(const Commands& commands) { return *commands.impl_; }
    static Types& GetTypes(const Commands& commands) { return commands.GetTypes(); }
};

}  // namespace Tarn

#endif  // TARN_SRC_HOSTING_COMMANDSIMPL_H_
