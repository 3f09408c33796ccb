// What the protocol scenarios include and share: a scripted in-process command recording the calls
// it serves, a raw kernel node sending hand-made messages, and a fixture holding one kernel
// context, its Commands and the captures of monitor lines and published errors.
#ifndef TARN_TESTS_PROTOCOL_PROTOCOLTESTING_H_
#define TARN_TESTS_PROTOCOL_PROTOCOLTESTING_H_

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdlib>
#include <functional>
#include <future>
#include <map>
#include <memory>
#include <mutex>
#include <regex>
#include <set>
#include <stdexcept>
#include <string>
#include <thread>
#include <tuple>
#include <vector>

#include "Nimbo/Nimbo.h"
#include "Tarn/Channel.h"
#include "Tarn/CommandInterface.h"
#include "Tarn/CommandRequest.h"
#include "Tarn/Commands.h"
#include "Tarn/InProcessCommand.h"
#include "Tarn/IterativeRequest.h"
#include "Tarn/Message.h"
#include "Tarn/Node.h"
#include "Tarn/NodeId.h"
#include "Tarn/Parameters.h"
#include "Tarn/Pool.h"
#include "Tarn/Request.h"
#include "Tarn/Response.h"
#include "hosting/NodeImpl.h"
#include "parameters/ErrorCapture.h"
#include "protocol/ProtocolMessage.h"

namespace Tarn::Testing {

// Only bounds how long a broken protocol takes to fail.
constexpr std::chrono::seconds kTimeout{20};
using Strings = std::vector<std::string>;
using MonitorLine = std::tuple<std::string, std::string, long>;  // node, text, code

// The lines of one story, then those of another.
inline std::vector<MonitorLine> operator+(std::vector<MonitorLine> a,
                                          const std::vector<MonitorLine>& b) {
    a.insert(a.end(), b.begin(), b.end());
    return a;
}

// Things that arrive on other threads, in arrival order.
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
    T At(std::size_t i) const { return All().at(i); }
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

// The kernel's monitor lines while it lives (it owns the process-wide listener).
struct MonitorCapture : Inbox<MonitorLine> {
    MonitorCapture() {
        Nimbo::PrivateServices::SetMonitorListener(
            [this](const ZelUnicodeString& node, const ZelUnicodeString& text, long code) {
                Push(MonitorLine{node.str(), text.str(), code});
            });
    }
    ~MonitorCapture() { Nimbo::PrivateServices::SetMonitorListener(nullptr); }
};

// The kind of an own property ("int32", "Parameters"...) or "", a string, an int32 (else -1).
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

// Serves every call by recording it, then running the hook of its phase (set before the first
// request). Create answers 1 for a guid it holds already, destroy E_FAIL for one it does not.
class ScriptedCommand : public InProcessCommand {
public:
    using Guid = Details::CommandGuid;
    using Hook = std::function<long(Parameters&, Channel&)>;
    struct Call {
        std::string operation, guid;  // "begin(...)" for a phase given parameters
    };
    Hook onBegin, onCommand, onEnd;
    Inbox<Call> calls;

    long create(const Guid& guid, Node&) override {
        return Hold(guid, true) ? Run("create", guid) : 1;
    }
    long destroy(const Guid& guid) override {
        const bool held = Hold(guid, false);
        return Run("destroy", guid) == S_OK && held ? S_OK : E_FAIL;
    }
    long disconnect(const Guid& guid) override { return Run("disconnect", guid); }
    long begin(const Guid& guid, Parameters& p, Channel& channel) override {
        return Run("begin", guid, onBegin, &p, &channel);
    }
    long command(const Guid& guid, Commands&, Parameters& p, Channel& channel) override {
        return Run("command", guid, onCommand, &p, &channel);
    }
    long end(const Guid& guid, Parameters& p, Channel& channel) override {
        return Run("end", guid, onEnd, &p, &channel);
    }
    std::string Operations() const {  // separated by spaces
        std::string operations;
        for (const Call& call : calls.All())
            operations += (operations.empty() ? "" : " ") + call.operation;
        return operations;
    }

private:
    bool Hold(const Guid& guid, bool hold) {  // false if that changed nothing
        std::lock_guard<std::mutex> guard(lock_);
        return hold ? live_.insert(guid).second : live_.erase(guid) != 0;
    }
    long Run(const char* operation, const Guid& guid, const Hook& hook = nullptr,
             Parameters* p = nullptr, Channel* channel = nullptr) {
        calls.Push({operation + std::string(p != nullptr && !p->IsEmpty() ? "(...)" : ""),
                    guid.GetGuid().str()});
        return hook ? hook(*p, *channel) : S_OK;
    }
    std::mutex lock_;
    std::set<Guid> live_;
};

// A bare kernel node: sends what the test builds and keeps every message it receives.
struct RawNode : Nimbo::CallbackNode {
    explicit RawNode(const ZelUnicodeString& name) : Nimbo::CallbackNode(name) {}
    long OnBinary(const Nimbo::Binary& message, Nimbo::Channel&) override {
        received.Push(message);
        return S_OK;
    }
    Nimbo::NodeId Find(const ZelUnicodeString& poolName) {  // a live node of the pool
        Nimbo::NodePool pool;
        Nimbo::NodeId id;
        EXPECT_EQ(Connect(poolName, pool), S_OK);
        EXPECT_EQ(pool.Select(id), S_OK);
        return id;
    }
    Inbox<Nimbo::Binary> received;
};

// The "n" of each answer a client's handler received (-1 if absent).
struct Answers : Inbox<int> {
    Node::Callable Handler() {
        return [this](const Parameters& p) {
            Push(IntOf(p, "n"));
            return 0L;
        };
    }
};

class ProtocolTest : public ::testing::Test {
protected:
    // The lines a node of pool "server" logs for calls of `command`: for each guid, each step
    // ("created", "deleted" or the callback called).
    static std::vector<MonitorLine> Story(const std::string& command, const Strings& guids,
                                          const Strings& steps) {
        std::vector<MonitorLine> lines;
        for (const std::string& guid : guids) {
            for (const std::string& step : steps) {
                const std::string text =
                    step == "created"   ? "Command <" + command + "> created with guid <"
                    : step == "deleted" ? "Command <" + command + "> deleted, guid <"
                                        : "<" + command + ">::" + step + "() called, guid <";
                lines.emplace_back("server", text + guid + ">", 0);
            }
        }
        return lines;
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
    // A request as a client writes it, with `phase` present without parameters.
    Parameters RequestMessage(const char* command, const char* guid, const char* phase,
                              int version = 1) {
        Parameters m = Bag();
        m.WriteString("command", command);
        m.WriteInt32("version", version);
        m.WriteString("guid", guid);
        m.WriteUint8("protocol", 1);
        m.WriteUint8(phase, 1);
        return m;
    }
    Parameters Bag() const { return commands.CreateParameters(); }
    Parameters Numbered(int n) const {  // a bag holding "n"
        Parameters p = Bag();
        p.WriteInt32("n", n);
        return p;
    }
    Parameters Decode(const Nimbo::Binary& bytes) const { return Parameters(commands, bytes); }
    bool Idle() const { return context.WaitUntilIdle(kTimeout); }
    static std::size_t Pending(Node& node) { return NodeInternal::Impl(node).PendingCount(); }

    // Declared first: destroyed after every node has stopped.
    MonitorCapture monitor;
    ErrorCapture errors;
    Nimbo::Context context;
    Commands commands{context};
    Nimbo::NodesLauncher rawLauncher{context};
};

}  // namespace Tarn::Testing

#endif  // TARN_TESTS_PROTOCOL_PROTOCOLTESTING_H_
