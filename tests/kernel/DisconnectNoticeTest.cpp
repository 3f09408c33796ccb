// Disconnect notices: kept by the kernel, delivered when their node stops or goes away.
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "KernelTestNodes.h"

namespace KernelTest {
namespace {

using Nimbo::NodeId;

TEST(DisconnectNoticeTest, ArmedNoticeArrivesWhenItsNodeStopsOnTheChannelOfItsRequests) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    RecordingNode* server = LaunchNew(launcher, "server");
    RecordingNode* client = LaunchNew(launcher, "client");
    const NodeId to = IdOf(*server);

    ASSERT_EQ(client->SendBinaryOnDisconnection(to, Bytes("bye 1")), S_OK);
    ASSERT_EQ(client->SendBinaryOnDisconnection(to, Bytes("bye 2")), S_OK);
    ASSERT_EQ(client->SendBinary(to, Bytes("request")), S_OK);
    ASSERT_TRUE(context.WaitUntilIdle(kTimeout));
    EXPECT_EQ(server->Texts(), std::vector<std::string>{"request"});

    ASSERT_EQ(client->Stop(), S_OK);
    ASSERT_TRUE(server->WaitForCount(3));
    const std::vector<Delivery> got = server->Deliveries();
    EXPECT_EQ(server->Texts(), (std::vector<std::string>{"request", "bye 1", "bye 2"}));
    EXPECT_EQ(got[1].channel, got[0].channel);
    EXPECT_EQ(got[2].channel, got[0].channel);
    // Stopping again sends nothing more.
    ASSERT_EQ(client->Stop(), S_OK);
    ASSERT_TRUE(context.WaitUntilIdle(kTimeout));
    EXPECT_EQ(server->Count(), 3u);
}

TEST(DisconnectNoticeTest, ArmedNoticeArrivesWhenTheLauncherOfItsNodeIsDestroyed) {
    Nimbo::Context context;
    Nimbo::NodesLauncher serverLauncher(context);
    RecordingNode* server = LaunchNew(serverLauncher, "server");
    const NodeId to = IdOf(*server);
    {
        Nimbo::NodesLauncher clientLauncher(context);
        RecordingNode* client = LaunchNew(clientLauncher, "client");
        ASSERT_EQ(client->SendBinary(to, Bytes("request")), S_OK);
        ASSERT_EQ(client->SendBinaryOnDisconnection(to, Bytes("bye")), S_OK);
        ASSERT_TRUE(server->WaitForCount(1));
    }
    ASSERT_TRUE(server->WaitForCount(2));
    const std::vector<Delivery> got = server->Deliveries();
    EXPECT_EQ(got[1].text, "bye");
    EXPECT_EQ(got[1].channel, got[0].channel);
}

TEST(DisconnectNoticeTest, NoticeToItselfOrToAStoppedTargetGoesNowhere) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    RecordingNode* node = LaunchNew(launcher, "node");
    RecordingNode* gone = LaunchNew(launcher, "gone");
    const NodeId goneId = IdOf(*gone);
    ASSERT_EQ(node->SendBinaryOnDisconnection(IdOf(*node), Bytes("self")), S_OK);
    ASSERT_EQ(node->SendBinaryOnDisconnection(goneId, Bytes("late")), S_OK);
    gone->Stop();
    EXPECT_LT(node->SendBinaryOnDisconnection(goneId, Bytes("refused")), 0);
    EXPECT_LT(node->SendBinaryOnDisconnection(NodeId(), Bytes("nowhere")), 0);

    node->Stop();
    ASSERT_TRUE(context.WaitUntilIdle(kTimeout));
    EXPECT_EQ(node->Count(), 0u);
    EXPECT_EQ(gone->Count(), 0u);
}

}  // namespace
}  // namespace KernelTest
