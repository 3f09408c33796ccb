// Hosting under several threads: teardown while messages keep arriving, a command making a pool
// during teardown, and nodes made, stopped and waited for from several threads at once.
#include "HostingTestSupport.h"

namespace {

using HostingTest::kTimeout;

// What a ProbeCommand saw, kept after its pool destroyed it.
struct CallRecord {
    std::atomic<int> begun{0}, running{0};
    std::atomic<int> lateCalls{0};  // begun after, or still running at, the command's destruction
    std::atomic<bool> destroyed{false};
};

// Counts the calls it begins; runs `onCommand` in the send phase.
class ProbeCommand : public Tarn::InProcessCommand {
public:
    using Guid = Tarn::Details::CommandGuid;
    explicit ProbeCommand(std::shared_ptr<CallRecord> record) : record_(std::move(record)) {}
    ~ProbeCommand() override {
        if (record_->running != 0) ++record_->lateCalls;
        record_->destroyed = true;
    }
    long begin(const Guid&, Tarn::Parameters&, Tarn::Channel&) override {
        ++record_->running;
        if (record_->destroyed) ++record_->lateCalls;
        ++record_->begun;
        --record_->running;
        return 0;
    }
    long command(const Guid&, Tarn::Commands& commands, Tarn::Parameters&,
                 Tarn::Channel&) override {
        if (onCommand) onCommand(commands);
        return 0;
    }
    long create(const Guid&, Tarn::Node&) override { return 0; }
    long destroy(const Guid&) override { return 0; }
    long end(const Guid&, Tarn::Parameters&, Tarn::Channel&) override { return 0; }
    long disconnect(const Guid&) override { return 0; }

    std::function<void(Tarn::Commands&)> onCommand;

private:
    std::shared_ptr<CallRecord> record_;
};

// Whether `condition` holds within kTimeout.
bool Eventually(const std::function<bool()>& condition) {
    const auto deadline = std::chrono::steady_clock::now() + kTimeout;
    while (!condition() && std::chrono::steady_clock::now() < deadline) std::this_thread::yield();
    return condition();
}

// A Commands on `context` whose pool "servers" serves "probe", seen by an outsider.
class HostingThreadsTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_EQ(S_OK, commands->GetPool("servers").RegisterCommand("probe", 1, probe));
    }
    // A call of "probe" version 1 with the given phases (without parameters).
    Nimbo::Binary Call(std::initializer_list<const char*> phases) const {
        Tarn::Parameters request = commands->CreateParameters();
        request.WriteString("command", "probe");
        request.WriteInt32("version", 1);
        request.WriteString("guid", "{00000001-0002-0003-0405-060708090a0b}");
        request.WriteUint8("protocol", 1);
        for (const char* phase : phases) request.WriteUint8(phase, 1);
        return request.ToBinary();
    }

    Nimbo::Context context;
    HostingTest::Outsider outsider{context};
    std::shared_ptr<CallRecord> record = std::make_shared<CallRecord>();
    ProbeCommand* probe = new ProbeCommand(record);  // the pool's
    std::unique_ptr<Tarn::Commands> commands = std::make_unique<Tarn::Commands>(context);
};

TEST_F(HostingThreadsTest, TeardownWhileAnOutsiderFloodsTheServers) {
    ASSERT_NE(nullptr, commands->GetPool("servers").CreateNode());
    ASSERT_NE(nullptr, commands->GetPool("servers").CreateCallbackNode());
    const Nimbo::Binary call = Call({"beginParameters", "endParameters"});
    const std::vector<Nimbo::NodeId> servers = outsider.Select("servers", 2);
    ASSERT_EQ(2u, servers.size());

    std::atomic<bool> tornDown{false};
    int acceptedAfterTeardown = 0;
    std::thread flood([&] {
        long long accepted = 0;
        for (unsigned i = 0, late = 0; late < 2000; ++i) {
            const bool afterTeardown = tornDown;
            // Keeps the servers' queues short while they run.
            if (!afterTeardown && accepted - record->begun > 1000) {
                std::this_thread::yield();
                continue;
            }
            const bool sent = outsider.Kernel().SendBinary(servers[i % 2], call) >= 0;
            accepted += sent;
            late += afterTeardown;
            acceptedAfterTeardown += afterTeardown && sent;
        }
    });
    const bool flowing = Eventually([&] { return record->begun >= 200; });
    commands.reset();
    const int begunAtReturn = record->begun;
    tornDown = true;
    flood.join();
    EXPECT_TRUE(context.WaitUntilIdle(kTimeout));
    EXPECT_NE(nullptr, Tarn::Commands(context).GetPool("again").CreateNode());  // context lives on

    EXPECT_TRUE(flowing);
    EXPECT_TRUE(record->destroyed.load());  // with its pool
    EXPECT_EQ(0, record->lateCalls.load());
    EXPECT_EQ(begunAtReturn, record->begun.load());
    EXPECT_EQ(0, acceptedAfterTeardown);
}

TEST_F(HostingThreadsTest, PoolMadeByACommandStillRunningAtTeardownIsDestroyed) {
    ASSERT_NE(nullptr, commands->GetPool("servers").CreateNode());
    const Nimbo::NodeId server = outsider.Select("servers", 1).at(0);
    auto late = std::make_shared<CallRecord>();
    std::promise<void> entered;
    probe->onCommand = [&](Tarn::Commands& serving) {
        entered.set_value();
        // Once the teardown has stopped this node, use the Commands as any command may.
        Eventually([&] { return server.GetStatus() == 0; });
        serving.GetPool("late").RegisterCommand("late", 1, new ProbeCommand(late));
    };
    ASSERT_EQ(S_OK, outsider.Kernel().SendBinary(server, Call({"sendParameters"})));
    ASSERT_EQ(std::future_status::ready, entered.get_future().wait_for(kTimeout));
    commands.reset();
    EXPECT_TRUE(late->destroyed.load());  // the pool went with the others, not leaked
}

// Pools asked for and nodes made from several threads; then, while a WaitAll waits, the server
// nodes stopped from several threads.
TEST_F(HostingThreadsTest, NodesMadeStoppedAndWaitedForFromSeveralThreads) {
    constexpr int kThreads = 4, kNodes = 20;
    std::vector<Tarn::Pool*> pools(kNodes);
    std::vector<Tarn::Node*> servers(kNodes), callbacks(kNodes);
    auto onThreads = [](const std::function<void(int)>& each) {  // each node, kThreads at once
        std::vector<std::thread> threads;
        for (int t = 0; t < kThreads; ++t) {
            threads.emplace_back([&, t] {
                for (int i = t; i < kNodes; i += kThreads) each(i);
            });
        }
        for (std::thread& thread : threads) thread.join();
    };
    onThreads([&](int i) {
        pools[i] = &commands->GetPool("shared");
        servers[i] = pools[i]->CreateNode();
        callbacks[i] = pools[i]->CreateCallbackNode();
        ASSERT_TRUE(servers[i] != nullptr && callbacks[i] != nullptr);
        EXPECT_EQ(S_OK, servers[i]->Emit("tick", commands->CreateParameters()));
    });
    EXPECT_EQ(1u, std::set<Tarn::Pool*>(pools.begin(), pools.end()).size());
    auto waited = std::async(std::launch::async, [&] { return commands->WaitAll(); });
    onThreads([&](int i) { EXPECT_EQ(S_OK, servers[i]->Stop()); });
    ASSERT_EQ(std::future_status::ready, waited.wait_for(kTimeout));
    EXPECT_EQ(S_OK, waited.get());
    for (int i = 0; i < kNodes; ++i) {  // every server node unbound, every callback node bound
        EXPECT_EQ(E_FAIL, servers[i]->Execute("task", Nimbo::kExecuteDefault));
        EXPECT_EQ(S_OK, callbacks[i]->Emit("tick", commands->CreateParameters()));
    }
}

}  // namespace
