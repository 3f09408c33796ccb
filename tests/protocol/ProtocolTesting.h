// Scaffolding for the protocol scenarios: a scripted in-process command that records every call
// it serves, a raw kernel node that sends hand-made messages and keeps what comes back, a recorder
// of the answers a client receives, and a fixture holding one kernel context, the Commands on it
// and the captures of monitor lines and published errors.
#ifndef TARN_TESTS_PROTOCOL_PROTOCOLTESTING_H_
#define TARN_TESTS_PROTOCOL_PROTOCOLTESTING_H_

#include <gtest/gtest.h>

#include <chrono>
#include <condition_variable>
#include <functional>
#include <initializer_list>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "Nimbo/CallbackNode.h"
#include "Nimbo/Channel.h"
#include "Nimbo/Context.h"
#include "Nimbo/NodeId.h"
#include "Nimbo/NodePool.h"
#include "Nimbo/NodesLauncher.h"
#include "Nimbo/ResultCodes.h"
#include "Tarn/Channel.h"
#include "Tarn/Commands.h"
#include "Tarn/InProcessCommand.h"
#include "Tarn/Message.h"
#include "Tarn/Node.h"
#include "Tarn/Parameters.h"
#include "Tarn/Pool.h"
#include "parameters/ErrorCapture.h"
#include "protocol/MonitorCapture.h"

namespace Tarn {
namespace Testing {

// Generous: it only bounds how long a broken protocol takes to fail a test.
constexpr std::chrono::seconds kTimeout{20};

// Things that arrive on other threads, kept in arrival order.
template <typename T>
class Inbox {
public:
    void Push(T item) {
        std::lock_guard<std::mutex> hold(lock_);
        items_.push_back(std::move(item));
        arrived_.notify_all();
    }
    std::vector<T> All() const {
        std::lock_guard<std::mutex> hold(lock_);
        return items_;
    }
    std::size_t Count() const { return All().size(); }
    bool WaitForCount(std::size_t count) {
        std::unique_lock<std::mutex> hold(lock_);
        return arrived_.wait_for(hold, kTimeout, [&] { return items_.size() >= count; });
    }

private:
    mutable std::mutex lock_;
    std::condition_variable arrived_;
    std::vector<T> items_;
};

// The kind of an own property ("int32", "uint8", "Parameters" for a nested bag...), "" if absent.
inline std::string KindOf(const Parameters& p, const char* name) {
    ZelUnicodeString type;
    return p.HasOwnTarnProperty(name, type) ? type.str() : std::string();
}
inline std::string StringOf(const Parameters& p, const char* name) {
    ZelUnicodeString value;
    return p.ReadString(name, value) >= 0 ? value.str() : "<absent " + std::string(name) + ">";
}
inline int IntOf(const Parameters& p, const char* name) {
    int value = -1;
    p.ReadInt32(name, value);
    return value;
}
// The kinds of the three phase properties of a request, "" for each one absent.
inline std::vector<std::string> PhaseKinds(const Parameters& message) {
    return {KindOf(message, "beginParameters"), KindOf(message, "sendParameters"),
            KindOf(message, "endParameters")};
}

// A Message whose domains each hold "n", written in the order given.
inline Message DomainsMessage(Node& node, std::initializer_list<std::pair<const char*, int>> ns) {
    Message message = node.CreateMessage();
    for (const auto& domain : ns) {
        Parameters p = node.CreateParameters();
        p.WriteInt32("n", domain.second);
        message.AnswerDomain(domain.first, p);
    }
    return message;
}

// An in-process command that serves every call by recording it, then running the hook of that
// phase (if any). It answers create with 1 for a call it holds already, destroy with E_FAIL for
// one it does not hold.
class ScriptedCommand : public InProcessCommand {
public:
    using Hook = std::function<long(Parameters&, Channel&)>;
    struct Call {
        std::string operation;
        Details::CommandGuid guid;
        std::shared_ptr<Parameters> parameters;  // a copy; null for create, destroy, disconnect
    };

    // Set before the first request arrives.
    Hook onBegin, onCommand, onEnd;

    long create(const Details::CommandGuid& guid, Node&) override {
        {
            std::lock_guard<std::mutex> hold(lock_);
            if (!live_.insert(guid).second) return 1;
        }
        calls.Push({"create", guid, nullptr});
        return S_OK;
    }
    long destroy(const Details::CommandGuid& guid) override {
        bool held;
        {
            std::lock_guard<std::mutex> hold(lock_);
            held = live_.erase(guid) != 0;
        }
        calls.Push({"destroy", guid, nullptr});
        return held ? S_OK : E_FAIL;
    }
    long begin(const Details::CommandGuid& guid, Parameters& p, Channel& channel) override {
        return Serve("begin", onBegin, guid, p, channel);
    }
    long command(const Details::CommandGuid& guid, Commands&, Parameters& p,
                 Channel& channel) override {
        return Serve("command", onCommand, guid, p, channel);
    }
    long end(const Details::CommandGuid& guid, Parameters& p, Channel& channel) override {
        return Serve("end", onEnd, guid, p, channel);
    }
    long disconnect(const Details::CommandGuid& guid) override {
        calls.Push({"disconnect", guid, nullptr});
        return S_OK;
    }

    std::vector<std::string> Operations() const {
        std::vector<std::string> operations;
        for (const Call& call : calls.All()) operations.push_back(call.operation);
        return operations;
    }
    // The guid text of the n-th call created.
    std::string CreatedGuid(std::size_t n) const {
        for (const Call& call : calls.All()) {
            if (call.operation == "create" && n-- == 0) return call.guid.GetGuid().str();
        }
        return "<no call created>";
    }

    Inbox<Call> calls;

private:
    long Serve(const char* operation, const Hook& hook, const Details::CommandGuid& guid,
               Parameters& p, Channel& channel) {
        calls.Push({operation, guid, std::make_shared<Parameters>(p)});
        return hook ? hook(p, channel) : S_OK;
    }

    std::mutex lock_;
    std::set<Details::CommandGuid> live_;
};

// A bare kernel node: sends what the test builds and keeps every message it receives.
class RawNode : public Nimbo::CallbackNode {
public:
    explicit RawNode(const ZelUnicodeString& name) : Nimbo::CallbackNode(name) {}

    long OnBinary(const Nimbo::Binary& message, Nimbo::Channel&) override {
        received.Push(message);
        return S_OK;
    }
    long Send(const Nimbo::NodeId& target, const Parameters& message) {
        return SendBinary(target, message.ToBinary());
    }
    // A live node named `poolName`.
    Nimbo::NodeId Find(const ZelUnicodeString& poolName) {
        Nimbo::NodePool pool;
        Nimbo::NodeId id;
        EXPECT_EQ(Connect(poolName, pool), S_OK);
        EXPECT_EQ(pool.Select(id), S_OK);
        return id;
    }

    Inbox<Nimbo::Binary> received;
};

// What a client's handler received, in order (each a copy).
class Answers : public Inbox<std::shared_ptr<Parameters>> {
public:
    Node::Callable Handler() {
        return [this](const Parameters& p) {
            Push(std::make_shared<Parameters>(p));
            return 0L;
        };
    }
    std::shared_ptr<Parameters> At(std::size_t i) const { return All().at(i); }
};

class ProtocolTest : public ::testing::Test {
protected:
    ProtocolTest() { errors.Clear(); }

    // The lines a node of pool "server" logs.
    static MonitorLine Created(const std::string& command, const std::string& guid) {
        return {"server", "Command <" + command + "> created with guid <" + guid + ">", 0};
    }
    static MonitorLine Called(const std::string& command, const std::string& callback,
                              const std::string& guid, long code = 0) {
        return {"server", "<" + command + ">::" + callback + "() called, guid <" + guid + ">",
                code};
    }
    static MonitorLine Deleted(const std::string& command, const std::string& guid) {
        return {"server", "Command <" + command + "> deleted, guid <" + guid + ">", 0};
    }

    ScriptedCommand* Serve(const char* command, int version = 1) {
        auto* scripted = new ScriptedCommand;
        EXPECT_EQ(commands.GetPool("server").RegisterCommand(command, version, scripted), S_OK);
        return scripted;
    }
    Node* NewServer() { return commands.GetPool("server").CreateNode(); }
    Node* NewClient() { return commands.GetPool("client").CreateCallbackNode(); }
    RawNode* NewRaw(const char* name) {
        auto* raw = new RawNode(name);
        EXPECT_TRUE(rawLauncher.Launch(*raw));
        return raw;
    }
    Nimbo::NodeId Target(Node& from, const char* pool = "server") {
        Nimbo::NodeId id;
        EXPECT_EQ(from.Select(pool, id), S_OK);
        return id;
    }
    // A request as a client writes it, with `phase` (if any) present without parameters.
    Parameters RequestMessage(const char* command, int version, const char* guid,
                              const char* phase = nullptr) {
        Parameters m = Bag();
        m.WriteString("command", command);
        m.WriteInt32("version", version);
        m.WriteString("guid", guid);
        m.WriteUint8("protocol", 1);
        if (phase != nullptr) m.WriteUint8(phase, 1);
        return m;
    }
    Parameters DisconnectNotice() {
        Parameters m = Bag();
        m.WriteInt8("disconnect", 0);
        m.WriteUint8("protocol", 1);
        return m;
    }
    Parameters Bag() const { return commands.CreateParameters(); }
    Parameters Decode(const Nimbo::Binary& bytes) const { return Parameters(commands, bytes); }
    bool Idle() const { return context.WaitUntilIdle(kTimeout); }

    // Declared first: destroyed after every node has stopped.
    MonitorCapture monitor;
    ErrorCapture errors;
    Nimbo::Context context;
    Commands commands{context};
    Nimbo::NodesLauncher rawLauncher{context};
};

}  // namespace Testing
}  // namespace Tarn

#endif  // TARN_TESTS_PROTOCOL_PROTOCOLTESTING_H_
