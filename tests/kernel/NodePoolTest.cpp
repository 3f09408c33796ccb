// Node pools: selecting a live node by name, round robin or least loaded.
#include <gtest/gtest.h>

#include <future>
#include <map>
#include <vector>

#include "KernelTestNodes.h"

namespace KernelTest {
namespace {

using Nimbo::Criterion;
using Nimbo::NodeId;

// One selection through a fresh pool, as a client does before each request; a failure gives the
// default id.
NodeId Select(Nimbo::Node& client, const Criterion& criterion = Criterion()) {
    Nimbo::NodePool pool;
    EXPECT_EQ(client.Connect("pool", pool), S_OK);
    NodeId id;
    pool.Select(id, criterion);
    return id;
}

TEST(NodePoolTest, RoundRobinVisitsLiveNodesInTurnSkipsStoppedOnesAndFailsWhenNoneIsLeft) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    RecordingNode* client = LaunchNew(launcher, "client");
    std::vector<RecordingNode*> servers;
    for (int i = 0; i < 3; ++i) servers.push_back(LaunchNew(launcher, "pool"));
    std::vector<NodeId> picked;
    for (int i = 0; i < 6; ++i) picked.push_back(Select(*client));
    std::map<NodeId, int> times;
    for (const NodeId& id : picked) ++times[id];
    for (RecordingNode* server : servers) EXPECT_EQ(times[IdOf(*server)], 2);
    for (int i = 0; i < 3; ++i) EXPECT_EQ(picked[i], picked[i + 3]);

    servers[1]->Stop();
    for (int i = 0; i < 4; ++i) {
        const NodeId id = Select(*client);
        EXPECT_TRUE(id == IdOf(*servers[0]) || id == IdOf(*servers[2]));
    }
    servers[0]->Stop();
    servers[2]->Stop();
    EXPECT_EQ(Select(*client), NodeId());
    EXPECT_EQ(Select(*client, Criterion::LeastLoaded()), NodeId());
}

TEST(NodePoolTest, LeastLoadedPicksTheNodeWithTheFewestQueuedMessages) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    std::promise<void> gate;
    std::shared_future<void> opened = gate.get_future().share();
    std::vector<RecordingNode*> servers;
    for (int i = 0; i < 3; ++i) servers.push_back(LaunchNew(launcher, "pool", Blocked(opened)));
    RecordingNode* client = LaunchNew(launcher, "client");
    // Each blocks on its first message; servers[0] then has 3 queued, servers[2] 1, servers[1] 0.
    for (int n : {0, 0, 0, 0, 2, 2})
        ASSERT_EQ(client->SendBinary(IdOf(*servers[n]), Bytes("")), S_OK);
    ASSERT_TRUE(servers[0]->WaitForCount(1));
    ASSERT_TRUE(servers[2]->WaitForCount(1));
    EXPECT_EQ(Select(*client, Criterion::LeastLoaded()), IdOf(*servers[1]));
    gate.set_value();
    ASSERT_TRUE(context.WaitUntilIdle(kTimeout));
}

TEST(NodePoolTest, TwoContextsNeverSeeEachOthersNodes) {
    Nimbo::Context one, two;
    Nimbo::NodesLauncher launchOne(one), launchTwo(two);
    RecordingNode* inOne = LaunchNew(launchOne, "pool");
    std::promise<void> gate;
    RecordingNode* inTwo = LaunchNew(launchTwo, "pool", Blocked(gate.get_future().share()));
    for (int i = 0; i < 3; ++i) EXPECT_EQ(Select(*inOne), IdOf(*inOne));
    // A message held in one context leaves the other idle.
    ASSERT_EQ(inTwo->SendBinary(IdOf(*inTwo), Bytes("held")), S_OK);
    EXPECT_TRUE(one.WaitUntilIdle(kTimeout));
    EXPECT_FALSE(two.WaitUntilIdle(std::chrono::milliseconds(20)));
    gate.set_value();
    EXPECT_TRUE(two.WaitUntilIdle(kTimeout));
}

}  // namespace
}  // namespace KernelTest
