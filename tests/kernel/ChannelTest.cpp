// Channels: answering the sender, what a ChannelId identifies, and disconnect notices, which
// arrive on the channel of their node's requests.
#include <gtest/gtest.h>

#include <set>
#include <string>

#include "KernelTestNodes.h"

namespace KernelTest {
namespace {

using Nimbo::Channel;
using Nimbo::ChannelId;
using Nimbo::NodeId;

TEST(ChannelTest, AnAnswerOnTheChannelReachesTheSenderWithAChannelBack) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    RecordingNode* server = LaunchNew(launcher, "server", [](const std::string& text, Channel& c) {
        return text == "thanks" ? 0L : c.AnswerBinary(Bytes("pong:" + text));
    });
    RecordingNode* client = LaunchNew(launcher, "client", [](const std::string&, Channel& c) {
        return c.AnswerBinary(Bytes("thanks"));
    });
    ASSERT_EQ(client->SendBinary(IdOf(*server), Bytes("ping")), S_OK);
    ASSERT_TRUE(context.WaitUntilIdle(kTimeout));
    EXPECT_EQ(client->Texts(), Strings{"pong:ping"});
    EXPECT_EQ(server->Texts(), (Strings{"ping", "thanks"}));
    EXPECT_EQ(server->Deliveries()[0].channel, server->Deliveries()[1].channel);
    EXPECT_NE(client->Deliveries()[0].channel, server->Deliveries()[0].channel);
}

TEST(ChannelTest, OneSenderAlwaysReachesATargetOnOneChannelIdTwoSendersOnTwo) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    RecordingNode* target = LaunchNew(launcher, "target");
    RecordingNode* first = LaunchNew(launcher, "first");
    RecordingNode* second = LaunchNew(launcher, "second");
    const NodeId to = IdOf(*target);
    ASSERT_EQ(target->Subscribe(IdOf(*first), "news"), S_OK);
    // Every way one node reaches another.
    ASSERT_EQ(first->SendBinary(to, Bytes("a")), S_OK);
    ASSERT_EQ(first->SendBinaryAndWait(to, Bytes("b")), S_OK);
    ASSERT_EQ(first->EmitBinary("news", Bytes("c")), S_OK);
    ASSERT_EQ(second->SendBinary(to, Bytes("d")), S_OK);
    ASSERT_TRUE(target->WaitForCount(4));
    std::set<ChannelId> fromFirst, fromSecond;
    for (const Delivery& delivery : target->Deliveries()) {
        (delivery.text < "d" ? fromFirst : fromSecond).insert(delivery.channel);
    }
    ASSERT_EQ(fromFirst.size(), 1u);
    ASSERT_EQ(fromSecond.size(), 1u);
    const ChannelId a = *fromFirst.begin(), b = *fromSecond.begin();
    EXPECT_NE(a, b);
    EXPECT_NE(a < b, b < a);
}

TEST(ChannelTest, ArmedNoticeArrivesWhenItsNodeStopsOnTheChannelOfItsRequests) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    RecordingNode* server = LaunchNew(launcher, "server");
    RecordingNode* client = LaunchNew(launcher, "client");
    ASSERT_EQ(client->SendBinaryOnDisconnection(IdOf(*server), Bytes("bye")), S_OK);
    ASSERT_EQ(client->SendBinary(IdOf(*server), Bytes("request")), S_OK);
    ASSERT_TRUE(context.WaitUntilIdle(kTimeout));
    EXPECT_EQ(server->Texts(), Strings{"request"});
    client->Stop();
    client->Stop();  // sends nothing more
    ASSERT_TRUE(context.WaitUntilIdle(kTimeout));
    EXPECT_EQ(server->Texts(), (Strings{"request", "bye"}));
    EXPECT_EQ(server->Deliveries()[1].channel, server->Deliveries()[0].channel);
}

TEST(ChannelTest, ArmedNoticeArrivesWhenTheLauncherOfItsNodeIsDestroyed) {
    Nimbo::Context context;
    Nimbo::NodesLauncher serverLauncher(context);
    RecordingNode* server = LaunchNew(serverLauncher, "server");
    {
        Nimbo::NodesLauncher clientLauncher(context);
        RecordingNode* client = LaunchNew(clientLauncher, "client");
        ASSERT_EQ(client->SendBinary(IdOf(*server), Bytes("request")), S_OK);
        ASSERT_EQ(client->SendBinaryOnDisconnection(IdOf(*server), Bytes("bye")), S_OK);
    }
    ASSERT_TRUE(server->WaitForCount(2));
    EXPECT_EQ(server->Texts(), (Strings{"request", "bye"}));
    EXPECT_EQ(server->Deliveries()[1].channel, server->Deliveries()[0].channel);
}

}  // namespace
}  // namespace KernelTest
