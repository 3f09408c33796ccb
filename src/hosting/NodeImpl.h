// NodeImpl: the state behind a Tarn::Node.
//
// The kernel delivers the node's messages on its own thread (OnIncoming) while applications call
// the node from theirs. `lock_` guards the pending requests, subscriptions, live calls and the
// reply header; handlers are held by shared_ptr so that they are called after the lock is
// released. The kernel node pointers are atomic: WaitAll and teardown clear them while other
// threads read them.
#ifndef TARN_SRC_HOSTING_NODEIMPL_H_
#define TARN_SRC_HOSTING_NODEIMPL_H_

#include <atomic>
#include <map>
#include <memory>
#include <mutex>
#include <vector>

#include "Nimbo/Binary.h"
#include "Nimbo/CallbackNode.h"
#include "Nimbo/Channel.h"
#include "Nimbo/Node.h"
#include "Tarn/Node.h"
#include "Tarn/Parameters.h"
#include "protocol/CommandCallKey.h"
#include "protocol/ResponseHandler.h"

namespace Tarn {

class Channel;
class CommandsImpl;
class PoolImpl;
class TypesImpl;
template <typename Base>
class NodeAdapter;
using KernelNodeAdapter = NodeAdapter<Nimbo::Node>;
using KernelCallbackNodeAdapter = NodeAdapter<Nimbo::CallbackNode>;

class NodeImpl {
public:
    NodeImpl(PoolImpl& pool, Node& node);
    ~NodeImpl();
    NodeImpl(const NodeImpl&) = delete;
    NodeImpl& operator=(const NodeImpl&) = delete;

    // The kernel node to use: the Nimbo::Node one when set, else the callback node; or null.
    Nimbo::Node* GetKernelNode() const;
    const ZelUnicodeString& GetKernelName() const;

    CommandsImpl& GetCommands() const { return commands_; }
    PoolImpl& GetPool() const { return pool_; }
    Node& GetPublicNode() const { return node_; }
    const TypesImpl& GetTypesImpl() const;

    // --- Incoming messages (on the kernel's delivery thread) ------------------------------------
    long OnIncoming(const Nimbo::Binary& message, Nimbo::Channel& channel);

    // --- Pending requests and subscriptions ----------------------------------------------------
    // Registers the handler of a request's guid unless one is there already.
    void AddPending(const ZelUnicodeString& guid, std::shared_ptr<const ResponseHandler> handler);
    // Registers the handler of an event name unless one is there already.
    void AddSubscription(const ZelUnicodeString& name,
                         std::shared_ptr<const ResponseHandler> handler);
    std::size_t PendingCount() const;

    std::atomic<KernelNodeAdapter*> kernelNode{nullptr};
    std::atomic<KernelCallbackNodeAdapter*> callbackNode{nullptr};
    std::atomic<void*> userData{nullptr};

private:
    long HandleRequest(const Parameters& message, Nimbo::Channel& channel, bool& noPhase);
    // Deletes the instance of `key`, forgets it and answers the revoke on `channel`.
    long Delete(const CommandCallKey& key, Channel& channel);
    long HandleDisconnect(Nimbo::Channel& channel);
    long ReceiveAnswer(const Parameters& message);
    long ReceiveEmission(const ZelUnicodeString& name, const Parameters& message);
    void Log(const ZelUnicodeString& text, long code) const;
    void RemoveLiveCall(const CommandCallKey& key);

    CommandsImpl& commands_;
    PoolImpl& pool_;
    Node& node_;

    mutable std::mutex lock_;
    // "protocol" = 1 and the "command", "version" and "guid" of the latest request.
    Parameters replyHeader_;
    std::map<ZelUnicodeString, std::shared_ptr<const ResponseHandler>> pending_;
    std::map<ZelUnicodeString, std::shared_ptr<const ResponseHandler>> subscriptions_;
    std::map<Nimbo::ChannelId, std::vector<CommandCallKey>> liveCalls_;
};

// Library access to a Node's implementation.
class NodeInternal {
public:
    static NodeImpl& Impl(const Node& node) { return *node.impl_; }
    static Node* New(PoolImpl& pool) { return new Node(pool); }
    static void Delete(Node* node) { delete node; }
};

}  // namespace Tarn

#endif  // TARN_SRC_HOSTING_NODEIMPL_H_
