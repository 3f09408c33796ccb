// NodeCore: the kernel's state of one node: its identity, its mailbox and delivery thread, the
// disconnect notices it armed and the nodes subscribed to what it emits.
//
// A NodeCore is shared between the Node that made it, its context's registry while it runs, and
// every NodeId and Channel that names it, so ids and channels stay safe after the node is gone; a
// stopped core only refuses. The user's Node is reached through a plain pointer, and only by the
// delivery thread (or an inline delivery on it), which has ended before the Node is destroyed.
//
// Life: idle (constructed) -> running (launched) -> stopped. Stopping is done in two halves so a
// launcher can first halt all its nodes, releasing any that wait on each other, and then finish
// them one by one.
//
// Locks: mailMutex_ guards the queue and every state change; linksMutex_ guards notices and
// subscribers; joinMutex_ serialises joining the thread. At most one of them is held at a time,
// the context's locks are taken only with none held, and none is held while user code runs.
#ifndef NIMBO_SRC_NODECORE_H_
#define NIMBO_SRC_NODECORE_H_

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <map>
#include <memory>
#include <mutex>
#include <thread>
#include <utility>
#include <vector>

#include "Nimbo/Binary.h"
#include "Nimbo/NodeSettings.h"
#include "ZelUnicodeString.h"

namespace Nimbo {

class ContextImpl;
class LauncherState;
class Node;

// One SendBinaryAndWait caller waiting for its message to be delivered. It lives on the caller's
// stack; the delivery thread completes it exactly once.
class Completion {
public:
    explicit Completion(std::chrono::microseconds spin) : spin_(spin) {}
    Completion(const Completion&) = delete;
    Completion& operator=(const Completion&) = delete;

    void Complete(long result);
    // Polls for spin_, then sleeps until completed; returns the result.
    long Wait();

private:
    const std::chrono::microseconds spin_;
    std::atomic<bool> done_{false};
    long result_ = 0;
    bool sleeping_ = false;
    // Complete() finishes under the lock and Wait() always takes it last, so the completing thread
    // never touches a Completion whose caller has moved on.
    std::mutex mutex_;
    std::condition_variable wake_;
};

class NodeCore : public std::enable_shared_from_this<NodeCore> {
public:
    NodeCore(Node& node, const ZelUnicodeString& name, const NodeSettings& settings, bool callback);
    ~NodeCore();
    NodeCore(const NodeCore&) = delete;
    NodeCore& operator=(const NodeCore&) = delete;

    std::uint64_t GetSerial() const { return serial_; }
    const ZelUnicodeString& GetName() const { return name_; }
    bool IsCallback() const { return callback_; }
    bool IsRunning() const { return state_.load(std::memory_order_acquire) == kRunning; }
    // True once the node stopped and its notices went out.
    bool IsFinished() const { return finished_.load(std::memory_order_acquire); }
    ContextImpl* GetContext() const { return context_.load(std::memory_order_acquire); }
    std::size_t QueuedCount() const { return queued_.load(std::memory_order_relaxed); }

    // idle -> running: registers the node and starts its delivery thread. False when the node was
    // not idle or the thread could not start (the node is then idle again).
    bool Launch(ContextImpl& context, std::shared_ptr<LauncherState> launcher);

    // Sending, on behalf of this node. Each fails with E_FAIL when this node is not running or
    // the target is null, of another context, or not running.
    long Send(const std::shared_ptr<NodeCore>& target, const Binary& message);
    long SendAndWait(const std::shared_ptr<NodeCore>& target, const Binary& message);
    long ArmNotice(const std::shared_ptr<NodeCore>& target, const Binary& message);
    long Emit(const ZelUnicodeString& name, const Binary& message);
    // Subscribes this node to `name` on `emitter`.
    long SubscribeTo(const std::shared_ptr<NodeCore>& emitter, const ZelUnicodeString& name);

    // Stopping, first half: from now on nothing is queued or taken from the queue; queued
    // messages are dropped and their waiting senders released. False when the node was already
    // stopped (or never launched).
    bool Halt();
    // Second half: waits for the delivery in progress (unless called on the delivery thread
    // itself), sends the armed disconnect notices and tells the launcher.
    void Finish();
    long Stop() {
        Halt();
        Finish();
        return 0;
    }

    // Queues a message from `sender`; `completion`, when given, is completed with OnBinary's
    // result or with E_FAIL when the message is dropped.
    long Enqueue(const Binary& message, std::shared_ptr<NodeCore> sender, Completion* completion);

private:
    enum State : int { kIdle, kRunning, kStopped };

    struct Envelope {
        Binary message;
        std::shared_ptr<NodeCore> sender;
        Completion* completion = nullptr;
    };

    bool CanSendTo(const std::shared_ptr<NodeCore>& target) const;
    long AddSubscriber(const ZelUnicodeString& name, const std::shared_ptr<NodeCore>& subscriber);
    void Run(std::shared_ptr<NodeCore> self);
    void SpinUntilMail() const;
    // Calls the user's OnBinary with a channel back to `sender`; catches what it throws.
    long Deliver(const std::shared_ptr<NodeCore>& self, const Binary& message,
                 std::shared_ptr<NodeCore> sender);

    const std::uint64_t serial_;
    const ZelUnicodeString name_;
    const bool callback_;
    const std::chrono::microseconds spin_;
    Node& node_;

    std::atomic<int> state_{kIdle};
    std::atomic<bool> finished_{false};
    std::atomic<ContextImpl*> context_{nullptr};
    std::shared_ptr<LauncherState> launcher_;  // set at launch, before the thread starts

    std::mutex mailMutex_;
    std::condition_variable mail_;
    std::deque<Envelope> queue_;
    bool sleeping_ = false;
    std::atomic<std::size_t> queued_{0};  // queue_.size(), readable without the lock

    std::mutex joinMutex_;
    std::thread thread_;

    std::mutex linksMutex_;
    std::vector<std::pair<std::weak_ptr<NodeCore>, Binary>> notices_;
    std::map<ZelUnicodeString, std::vector<std::weak_ptr<NodeCore>>> subscribers_;
};

}  // namespace Nimbo

#endif  // NIMBO_SRC_NODECORE_H_
