// Nimbo::Node: a named node of the kernel, subclassed by applications.
//
// A node does nothing until a NodesLauncher launches it; the launcher then owns it (it must have
// been made with new) and deletes it when the launcher is destroyed. From launch on, the node has a
// NodeId, is found by its name through node pools, and gets every message sent to it in OnBinary,
// on a thread of its own, one message at a time, in the order they arrived, each with the Channel
// of its sender. Stop ends that: no message is delivered after Stop returns, and the disconnect
// notices the node armed go to their targets.
//
// Every operation is safe from any thread, including the node's own delivery thread. The kernel
// holds no lock while it calls OnBinary, so OnBinary may send, answer, wait, select or stop.
// A CallbackNode (CallbackNode.h) is a Node that NodesLauncher::WaitAll does not wait for.
#ifndef NIMBO_NODE_H_
#define NIMBO_NODE_H_

#include <memory>

#include "Nimbo/NodeSettings.h"
#include "ZelUnicodeString.h"

namespace Nimbo {

class Binary;
class Channel;
class NodeCore;
class NodeId;
class NodePool;
enum ExecutePolicy : int;

class Node {
public:
    explicit Node(const ZelUnicodeString& name);
    Node(const ZelUnicodeString& name, const NodeSettings& settings);
    // Stops the node when it still runs; subclasses that are launched are destroyed by their
    // launcher, after it stopped them.
    virtual ~Node();
    Node(const Node&) = delete;
    Node& operator=(const Node&) = delete;

    // A message for this node; its result goes back to a SendBinaryAndWait caller. The default
    // drops the message and returns 0. An exception thrown here is caught, published as an error,
    // and turns into E_FAIL.
    virtual long OnBinary(const Binary& message, Channel& channel);
    // A text message. The in-process kernel carries binaries only; the default returns 0.
    virtual long OnText(const ZelUnicodeString& text, Channel& channel);
    // A hypervisor connected to or disconnected from this node's process. The in-process kernel
    // has no outside hypervisor to connect; the defaults do nothing.
    virtual void OnHypervisorConnect();
    virtual void OnHypervisorDisconnect();

    // Lets a web transport reach this node once one is available; S_OK.
    long AllowWebAccess();
    // No message is delivered after Stop returns. Called from another thread, it waits for the
    // message being delivered, if any. Queued messages are dropped (their SendBinaryAndWait callers
    // get E_FAIL), then the armed disconnect notices are sent. S_OK, also when already stopped.
    // Waiting for the delivery in progress means that stopping a node from the delivery of another
    // node that it is waiting on (SendBinaryAndWait) never returns; destroying the launcher, which
    // halts all its nodes before waiting for any, releases such waits instead.
    long Stop();
    // Running named tasks is not available in-process: E_NOTIMPL.
    long Execute(const ZelUnicodeString& name, ExecutePolicy policy);

    // Queues `message` for `target` and returns. Fails (E_FAIL) when this node is not running,
    // or the target is unknown to this node's context or not running.
    long SendBinary(const NodeId& target, const Binary& message);
    // Sends and waits until the target's OnBinary returned for this message, then returns its
    // result. Called on the target's own delivery thread, the message is delivered inline, at once,
    // so a node may send to itself. Fails (E_FAIL) as SendBinary does, and when the target stops
    // before delivering the message. Two nodes that wait on each other from their deliveries wait
    // forever, as with any cycle of synchronous calls.
    long SendBinaryAndWait(const NodeId& target, const Binary& message);
    // Keeps `message` and sends it to `target` when this node stops or is destroyed. Each call arms
    // one more notice. Fails when this node is not running or the target is unknown.
    long SendBinaryOnDisconnection(const NodeId& target, const Binary& message);
    // Sends `message` to every node subscribed to `name` on this node; S_OK also when none is.
    long EmitBinary(const ZelUnicodeString& name, const Binary& message);
    // Subscribes this node to what `emitter` emits under `name`. Subscribing twice changes
    // nothing. Fails when either node is not running or they belong to different contexts.
    long Subscribe(const NodeId& emitter, const ZelUnicodeString& name);
    // Binds `pool` to the nodes named `poolName` in this node's context (see NodePool).
    long Connect(const ZelUnicodeString& poolName, NodePool& pool);
    // This node's own id; fails when it is not running.
    long SelectMyself(NodeId& id);

    const ZelUnicodeString& GetName() const;

private:
    friend class CallbackNode;
    friend class NodeInternal;
    struct CallbackKind {};
    Node(const ZelUnicodeString& name, CallbackKind);

    std::shared_ptr<NodeCore> core_;
};

}  // namespace Nimbo

#endif  // NIMBO_NODE_H_
