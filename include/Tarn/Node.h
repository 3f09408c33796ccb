// Tarn::Node: the library's handle on one launched kernel node.
//
// A node calls commands on other nodes (CreateRequest and friends), serves the commands of its
// pool to others, answers, emits events and subscribes to them, and selects other nodes by pool
// name. Nodes are created by a Pool and owned by the Commands; they live until it is destroyed.
//
// Every operation may be called from any thread while the kernel delivers the node's messages on
// its own thread: the node guards its pending requests, subscriptions and live calls, and calls
// user code (callbacks, commands) without holding a lock.
#ifndef TARN_NODE_H_
#define TARN_NODE_H_

#include "Nimbo/FunctionArgs1.h"
#include "Tarn/Export.h"
#include "ZelUnicodeString.h"

namespace Nimbo {
class CallbackNode;
class Criterion;
class NodeId;
}  // namespace Nimbo

namespace Tarn {

class IterativeRequest;
class CommandRequest;
class Message;
class NodeId;
class NodeImpl;
class Parameters;
class PoolImpl;
class Request;
class Response;
class Types;

class TARN_EXPORT Node {
public:
    using Callback = long (*)(Node&, const Parameters&);
    using Callable = Nimbo::FunctionArgs1<long, const Parameters&>;

    // Stops the kernel node(s); always 0.
    long Stop();
    long Execute(const ZelUnicodeString& name, int policy);
    Nimbo::CallbackNode* GetCallbackNode() const;

    // A pointer the application keeps with the node; the node never uses it.
    void SetData(void* data);
    void GetData(void*& data);

    Response& GetDefaultResponse();
    Parameters CreateParameters();
    Message CreateMessage();

    // Requests (answers and revokes come back to the handler given here).
    long CreateCommandRequest(const NodeId& target, const ZelUnicodeString& command, int version,
                              CommandRequest& request);
    Request CreateRequest(const Nimbo::NodeId& target, const ZelUnicodeString& command,
                          int version, Callback callback);
    Request CreateRequest(const Nimbo::NodeId& target, const ZelUnicodeString& command,
                          int version, const Callable& callback);
    IterativeRequest CreateIterativeRequest(const Nimbo::NodeId& target,
                                            const ZelUnicodeString& command, int version,
                                            Callback callback);
    IterativeRequest CreateIterativeRequest(const Nimbo::NodeId& target,
                                            const ZelUnicodeString& command, int version,
                                            const Callable& callback);

    // Events.
    long Emit(const ZelUnicodeString& name, const Message& message) const;
    long Emit(const ZelUnicodeString& name, const Parameters& parameters) const;
    long Subscribe(const NodeId& source, const ZelUnicodeString& name, const Response& response);
    long Subscribe(const Nimbo::NodeId& source, const ZelUnicodeString& name,
                   const Response& response);
    long Subscribe(const Nimbo::NodeId& source, const ZelUnicodeString& name, Callback callback);
    long Subscribe(const Nimbo::NodeId& source, const ZelUnicodeString& name,
                   const Callable& callback);

    // Selection: a live node of the named pool; each success arms a disconnect notice to it.
    long Select(const ZelUnicodeString& poolName, NodeId& id);
    long Select(const ZelUnicodeString& poolName, Nimbo::NodeId& id);
    long Select(const ZelUnicodeString& poolName, Nimbo::NodeId& id,
                const Nimbo::Criterion& criterion);
    long SelectMyself(Nimbo::NodeId& id);
    long Connect(const ZelUnicodeString& poolName, NodeId& id);

private:
    friend class CommandsImpl;
    friend class NodeInternal;
    friend class PoolImpl;
    explicit Node(PoolImpl& pool);
    ~Node();
    Node(const Node&) = delete;
    Node& operator=(const Node&) = delete;
    Types& GetTypes() const;

    NodeImpl* impl_;
};

}  // namespace Tarn

#endif  // TARN_NODE_H_
