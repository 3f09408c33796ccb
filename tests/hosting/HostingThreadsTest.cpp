// Hosting under several threads: teardown while messages keep arriving, and pools and nodes made,
// stopped and waited for from several threads at once.
#include <gtest/gtest.h>

#include <atomic>
#include <condition_variable>
#include <functional>
#include <future>
#include <initializer_list>
#include <memory>
#include <set>
#include <thread>

#include "HostingTestSupport.h"
#include "Tarn/InProcessCommand.h"

namespace {

using HostingTest::kTimeout;
using HostingTest::Outsider;

// What a ProbeCommand saw, kept after the pool destroyed the command.
struct CallRecord {
    std::atomic<int> begun{0};
    std::atomic<int> running{0};
    std::atomic<bool> destroyed{false};
    std::atomic<int> lateCalls{0};  // begun after, or still running at, the command's destruction
    std::mutex lock;
    std::condition_variable changed;

    bool WaitForBegun(int count) {
        std::unique_lock<std::mutex> hold(lock);
        return changed.wait_for(hold, kTimeout, [&] { return begun.load() >= count; });
    }
};

// Counts the calls it begins; runs `onCommand` in the send phase.
class ProbeCommand : public Tarn::InProcessCommand {
public:
    using Guid = Tarn::Details::CommandGuid;
    explicit ProbeCommand(std::shared_ptr<CallRecord> record) : record_(std::move(record)) {}
    ~ProbeCommand() override {
        if (record_->running.load() != 0) record_->lateCalls.fetch_add(1);
        record_->destroyed.store(true);
    }
    long begin(const Guid&, Tarn::Parameters&, Tarn::Channel&) override {
        record_->running.fetch_add(1);
        if (record_->destroyed.load()) record_->lateCalls.fetch_add(1);
        {
            std::lock_guard<std::mutex> hold(record_->lock);
            record_->begun.fetch_add(1);
        }
        record_->changed.notify_all();
        record_->running.fetch_sub(1);
        return 0;
    }
    long create(const Guid&, Tarn::Node&) override { return 0; }
    long destroy(const Guid&) override { return 0; }
    long command(const Guid&, Tarn::Commands& commands, Tarn::Parameters&,
                 Tarn::Channel&) override {
        if (onCommand) onCommand(commands);
        return 0;
    }
    long end(const Guid&, Tarn::Parameters&, Tarn::Channel&) override { return 0; }
    long disconnect(const Guid&) override { return 0; }

    std::function<void(Tarn::Commands&)> onCommand;

private:
    std::shared_ptr<CallRecord> record_;
};

// A call of `command` version 1 with the given phases (without parameters), as a client sends it.
Nimbo::Binary Call(const Tarn::Commands& commands, const char* command,
                   std::initializer_list<const char*> phases) {
    Tarn::Parameters request = commands.CreateParameters();
    request.WriteString("command", command);
    request.WriteInt32("version", 1);
    request.WriteString("guid", "{00000001-0002-0003-0405-060708090a0b}");
    request.WriteUint8("protocol", 1);
    for (const char* phase : phases) request.WriteUint8(phase, 1);
    return request.ToBinary();
}

TEST(HostingThreadsTest, TeardownWhileAnOutsiderFloodsTheServers) {
    Nimbo::Context context;
    Outsider outsider(context);
    auto record = std::make_shared<CallRecord>();
    auto commands = std::make_unique<Tarn::Commands>(context);
    Tarn::Pool& pool = commands->GetPool("servers");
    ASSERT_EQ(S_OK, pool.RegisterCommand("count", 1, new ProbeCommand(record)));
    ASSERT_NE(nullptr, pool.CreateNode());
    ASSERT_NE(nullptr, pool.CreateCallbackNode());
    const Nimbo::Binary call = Call(*commands, "count", {"beginParameters", "endParameters"});
    const std::vector<Nimbo::NodeId> servers = outsider.Select("servers", 2);
    ASSERT_EQ(2u, servers.size());

    std::atomic<bool> tornDown{false};
    int acceptedAfterTeardown = 0;
    std::thread flood([&] {
        long long accepted = 0;
        for (unsigned i = 0, late = 0; late < 2000; ++i) {
            const bool afterTeardown = tornDown.load();
            // Keeps the servers' queues short while they run.
            if (!afterTeardown && accepted - record->begun.load() > 1000) {
                std::this_thread::yield();
                continue;
            }
            const bool sent = outsider.Kernel().SendBinary(servers[i % 2], call) >= 0;
            accepted += sent;
            late += afterTeardown;
            acceptedAfterTeardown += afterTeardown && sent;
        }
    });

    const bool flowing = record->WaitForBegun(200);
    commands.reset();
    const int begunAtReturn = record->begun.load();
    tornDown.store(true);
    flood.join();
    EXPECT_TRUE(context.WaitUntilIdle(kTimeout));

    EXPECT_TRUE(flowing);
    EXPECT_TRUE(record->destroyed.load());  // with its pool
    EXPECT_EQ(0, record->lateCalls.load());
    EXPECT_EQ(begunAtReturn, record->begun.load());
    EXPECT_EQ(0, acceptedAfterTeardown);
}

TEST(HostingThreadsTest, PoolMadeByACommandStillRunningAtTeardownIsDestroyed) {
    Nimbo::Context context;
    Outsider outsider(context);
    auto late = std::make_shared<CallRecord>();
    auto commands = std::make_unique<Tarn::Commands>(context);
    Tarn::Pool& pool = commands->GetPool("servers");
    auto* probe = new ProbeCommand(std::make_shared<CallRecord>());
    ASSERT_EQ(S_OK, pool.RegisterCommand("probe", 1, probe));
    ASSERT_NE(nullptr, pool.CreateNode());
    const Nimbo::NodeId server = outsider.Select("servers", 1).at(0);
    std::promise<void> entered;
    probe->onCommand = [&](Tarn::Commands& serving) {
        entered.set_value();
        // Once the teardown has stopped this node, use the Commands as any command may.
        const auto deadline = std::chrono::steady_clock::now() + kTimeout;
        while (server.GetStatus() != 0 && std::chrono::steady_clock::now() < deadline) {
            std::this_thread::yield();
        }
        serving.GetPool("late").RegisterCommand("late", 1, new ProbeCommand(late));
    };
    ASSERT_EQ(S_OK,
              outsider.Kernel().SendBinary(server, Call(*commands, "probe", {"sendParameters"})));
    ASSERT_EQ(std::future_status::ready, entered.get_future().wait_for(kTimeout));
    commands.reset();
    EXPECT_TRUE(late->destroyed.load());  // the pool went with the others, not leaked
}

TEST(HostingThreadsTest, NodesMadeStoppedAndWaitedForFromSeveralThreads) {
    constexpr int kThreads = 4, kEach = 5;
    Tarn::Commands commands;
    std::vector<Tarn::Pool*> pools(kThreads);
    std::vector<Tarn::Node*> servers(kThreads * kEach), callbacks(kThreads * kEach);
    std::promise<void> go;
    std::shared_future<void> start = go.get_future().share();
    std::vector<std::thread> workers;
    for (int t = 0; t < kThreads; ++t) {
        workers.emplace_back([&, t] {
            start.wait();
            Tarn::Parameters event = commands.CreateParameters();
            for (int i = t * kEach; i < (t + 1) * kEach; ++i) {
                pools[t] = &commands.GetPool("shared");
                servers[i] = pools[t]->CreateNode();
                callbacks[i] = pools[t]->CreateCallbackNode();
                if (servers[i] == nullptr || callbacks[i] == nullptr) continue;
                callbacks[i]->Emit("tick", event);
                servers[i]->Emit("tick", event);
            }
        });
    }
    go.set_value();
    // A WaitAll waits meanwhile; it returns once the servers stop, below.
    auto waited = std::async(std::launch::async, [&] { return commands.WaitAll(); });
    for (std::thread& worker : workers) worker.join();
    EXPECT_EQ(1u, std::set<Tarn::Pool*>(pools.begin(), pools.end()).size());
    Outsider outsider(HostingTest::ContextOf(commands));
    std::vector<Nimbo::NodeId> ids = outsider.Select("shared", 2 * kThreads * kEach);
    EXPECT_EQ(2u * kThreads * kEach, std::set<Nimbo::NodeId>(ids.begin(), ids.end()).size());

    std::vector<std::thread> stoppers;
    for (int t = 0; t < kThreads; ++t) {
        stoppers.emplace_back([&, t] {
            for (int i = t; i < kThreads * kEach; i += kThreads) {
                if (servers[i] != nullptr) servers[i]->Stop();
            }
        });
    }
    for (std::thread& stopper : stoppers) stopper.join();
    ASSERT_EQ(std::future_status::ready, waited.wait_for(kTimeout));
    EXPECT_EQ(S_OK, waited.get());
    EXPECT_EQ(S_OK, commands.WaitAll());  // every server node now stopped: all are unbound
    Tarn::Parameters event = commands.CreateParameters();
    for (int i = 0; i < kThreads * kEach; ++i) {
        ASSERT_TRUE(servers[i] != nullptr && callbacks[i] != nullptr);
        EXPECT_EQ(E_FAIL, servers[i]->Execute("task", Nimbo::kExecuteDefault));
        EXPECT_EQ(S_OK, callbacks[i]->Emit("tick", event));
    }
}

}  // namespace
