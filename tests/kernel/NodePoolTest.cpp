// Node pools: selecting a live node by name, round robin or least loaded.
#include <gtest/gtest.h>

#include <future>
#include <map>
#include <string>
#include <vector>

#include "KernelTestNodes.h"
#include "Nimbo/NodePool.h"

namespace KernelTest {
namespace {

using Nimbo::Criterion;
using Nimbo::NodeId;
using Nimbo::NodePool;

class NodePoolTest : public ::testing::Test {
protected:
    // One selection through a fresh pool, as a client does before each request.
    NodeId SelectFresh(Nimbo::Node& client, const ZelUnicodeString& name,
                       const Criterion& criterion = Criterion()) {
        NodePool pool;
        EXPECT_EQ(client.Connect(name, pool), S_OK);
        EXPECT_EQ(pool.GetName(), name);
        NodeId id;
        EXPECT_EQ(pool.Select(id, criterion), S_OK);
        return id;
    }

    Nimbo::Context context_;
    Nimbo::NodesLauncher launcher_{context_};
};

TEST_F(NodePoolTest, RoundRobinVisitsEveryLiveNodeInTurnAndSkipsStoppedOnes) {
    RecordingNode* client = LaunchNew(launcher_, "client");
    std::vector<RecordingNode*> servers;
    for (int i = 0; i < 3; ++i) servers.push_back(LaunchNew(launcher_, "pool"));
    LaunchNew(launcher_, "another pool");

    std::vector<NodeId> picked;
    for (int i = 0; i < 6; ++i) picked.push_back(SelectFresh(*client, "pool"));
    std::map<NodeId, int> times;
    for (const NodeId& id : picked) ++times[id];
    ASSERT_EQ(times.size(), 3u);
    for (RecordingNode* server : servers) EXPECT_EQ(times[IdOf(*server)], 2);
    for (int i = 0; i < 3; ++i) EXPECT_EQ(picked[i], picked[i + 3]);

    const NodeId stopped = IdOf(*servers[1]);
    servers[1]->Stop();
    for (int i = 0; i < 4; ++i) {
        const NodeId id = SelectFresh(*client, "pool");
        EXPECT_NE(id, stopped);
        EXPECT_NE(id.GetStatus(), 0);
    }
}

TEST_F(NodePoolTest, SelectFailsWhenNoNodeOfTheNameRuns) {
    RecordingNode* client = LaunchNew(launcher_, "client");
    RecordingNode* only = LaunchNew(launcher_, "pool");
    NodePool pool;
    ASSERT_EQ(client->Connect("pool", pool), S_OK);
    NodeId id;
    ASSERT_EQ(pool.Select(id), S_OK);
    EXPECT_EQ(id, IdOf(*only));

    only->Stop();
    NodeId untouched;
    EXPECT_LT(pool.Select(untouched), 0);
    EXPECT_LT(pool.Select(untouched, Criterion::LeastLoaded()), 0);
    EXPECT_EQ(untouched, NodeId());

    NodePool empty;
    ASSERT_EQ(client->Connect("nobody", empty), S_OK);
    EXPECT_LT(empty.Select(untouched), 0);
    NodePool unbound;
    EXPECT_LT(unbound.Select(untouched), 0);
}

TEST_F(NodePoolTest, LeastLoadedPicksTheNodeWithTheFewestQueuedMessages) {
    std::promise<void> gate;
    std::shared_future<void> opened = gate.get_future().share();
    auto blocked = [opened](const std::string&, Nimbo::Channel&) {
        opened.wait();
        return 0L;
    };
    std::vector<RecordingNode*> servers;
    for (int i = 0; i < 3; ++i) {
        servers.push_back(new RecordingNode("pool"));
        servers.back()->React(blocked);
        ASSERT_TRUE(launcher_.Launch(*servers.back()));
    }
    RecordingNode* client = LaunchNew(launcher_, "client");

    // servers[0] gets 1 in delivery + 3 queued, servers[2] 1 + 1, servers[1] nothing.
    for (int n : {0, 0, 0, 0, 2, 2}) {
        ASSERT_EQ(client->SendBinary(IdOf(*servers[n]), Bytes("work")), S_OK);
    }
    ASSERT_TRUE(servers[0]->WaitForCount(1));
    ASSERT_TRUE(servers[2]->WaitForCount(1));

    for (int i = 0; i < 3; ++i) {
        EXPECT_EQ(SelectFresh(*client, "pool", Criterion::LeastLoaded()), IdOf(*servers[1]));
    }
    ASSERT_EQ(client->SendBinary(IdOf(*servers[1]), Bytes("work")), S_OK);
    ASSERT_TRUE(servers[1]->WaitForCount(1));
    ASSERT_EQ(client->SendBinary(IdOf(*servers[1]), Bytes("work")), S_OK);
    ASSERT_EQ(client->SendBinary(IdOf(*servers[1]), Bytes("work")), S_OK);
    // Now servers[2] has 1 queued, servers[1] 2 and servers[0] 3.
    EXPECT_EQ(SelectFresh(*client, "pool", Criterion::LeastLoaded()), IdOf(*servers[2]));
    gate.set_value();
    ASSERT_TRUE(context_.WaitUntilIdle(kTimeout));
}

TEST_F(NodePoolTest, SelectMyselfGivesTheNodesOwnId) {
    RecordingNode* node = LaunchNew(launcher_, "me");
    NodeId mine;
    ASSERT_EQ(node->SelectMyself(mine), S_OK);
    EXPECT_EQ(mine, SelectFresh(*node, "me"));
    EXPECT_NE(mine.GetStatus(), 0);
    EXPECT_EQ(NodeId().GetStatus(), 0);
    NodeId copy(mine);
    NodeId assigned;
    assigned = copy;
    EXPECT_EQ(assigned, mine);
    EXPECT_TRUE(NodeId() < mine);
}

}  // namespace
}  // namespace KernelTest
