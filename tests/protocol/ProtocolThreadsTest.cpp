// Many clients calling at once: each client thread drives its own client node through complete
// round trips against two server nodes of one pool.
#include "protocol/ProtocolTesting.h"

namespace Tarn::Testing {
namespace {

constexpr int kClients = 8;
constexpr int kCallsPerClient = 1000;  // about 4 s under ThreadSanitizer

std::atomic<int> liveEchoes{0};

// Made by the pool's factory for each call.
class Echo : public CommandInterface {
public:
    Echo() { ++liveEchoes; }
    ~Echo() override { --liveEchoes; }
    long OnBegin(Parameters&, Channel&) override { return S_OK; }
    long OnCommand(Parameters& p, Channel& channel) override { return channel.Answer(p); }
    long OnEnd(Parameters&, Channel&) override { return S_OK; }
    long OnDisconnect() override { return S_OK; }
};

using ProtocolThreadsTest = ProtocolTest;

TEST_F(ProtocolThreadsTest, EightClientsRoundTripAgainstTwoServersOfOnePool) {
    ASSERT_EQ(commands.GetPool("server").RegisterCommand(
                  "echo", 1, [](Node&) -> CommandInterface* { return new Echo; }),
              S_OK);
    NewServer();
    NewServer();
    std::vector<Node*> clients;
    std::vector<std::array<Nimbo::NodeId, 2>> targets;
    for (int k = 0; k < kClients; ++k) {
        clients.push_back(NewClient());
        // Round robin: two selections in a row give both servers.
        targets.push_back({Target(*clients.back()), Target(*clients.back())});
        ASSERT_NE(targets.back()[0], targets.back()[1]);
    }

    std::atomic<int> failures{0};
    auto play = [&](int k) {
        Node& client = *clients[k];
        for (int i = 0; i < kCallsPerClient; ++i) {
            // Shared with the handler, so that a stray late answer never finds it gone.
            auto answer = std::make_shared<std::promise<int>>();
            std::future<int> answered = answer->get_future();
            Request request = client.CreateRequest(targets[k][i % 2], "echo", 1,
                                                   Node::Callable([answer](const Parameters& p) {
                                                       answer->set_value(IntOf(p, "n"));
                                                       return 0L;
                                                   }));
            if (request.Send(Bag(), Numbered(k * 100000 + i), Bag()) != S_OK ||
                answered.wait_for(kTimeout) != std::future_status::ready ||
                answered.get() != k * 100000 + i) {
                ++failures;
                return;
            }
        }
    };
    std::vector<std::thread> threads;
    for (int k = 0; k < kClients; ++k) threads.emplace_back(play, k);
    for (std::thread& thread : threads) thread.join();

    EXPECT_EQ(failures.load(), 0);
    // Every revoke arrived: no request is left pending, every instance was deleted.
    ASSERT_TRUE(Idle());
    for (Node* client : clients) EXPECT_EQ(Pending(*client), 0u);
    EXPECT_EQ(liveEchoes.load(), 0);
    EXPECT_TRUE(errors.Errors().empty());
}

}  // namespace
}  // namespace Tarn::Testing
