// Channels: answering the sender, and what a ChannelId identifies.
#include <gtest/gtest.h>

#include <set>
#include <string>
#include <vector>

#include "KernelTestNodes.h"

namespace KernelTest {
namespace {

using Nimbo::Channel;
using Nimbo::ChannelId;
using Nimbo::NodeId;

class ChannelTest : public ::testing::Test {
protected:
    Nimbo::Context context_;
    Nimbo::NodesLauncher launcher_{context_};
};

TEST_F(ChannelTest, AnAnswerOnTheChannelReachesTheSenderWithAChannelBack) {
    auto* server = new RecordingNode("server");
    server->React([](const std::string& text, Channel& channel) {
        if (text == "thanks") return 0L;
        return channel.AnswerBinary(Bytes("pong:" + text));
    });
    auto* client = new RecordingNode("client");
    client->React([](const std::string& text, Channel& channel) {
        // Answering the answer goes back to the server.
        return text == "pong:ping" ? channel.AnswerBinary(Bytes("thanks")) : 0L;
    });
    ASSERT_TRUE(launcher_.Launch(*server));
    ASSERT_TRUE(launcher_.Launch(*client));

    ASSERT_EQ(client->SendBinary(IdOf(*server), Bytes("ping")), S_OK);
    ASSERT_TRUE(context_.WaitUntilIdle(kTimeout));
    EXPECT_EQ(client->Texts(), std::vector<std::string>{"pong:ping"});
    EXPECT_EQ(server->Texts(), (std::vector<std::string>{"ping", "thanks"}));
    // The server sees the client's channel for both; the answer came on the other direction.
    const auto toServer = server->Deliveries();
    const auto toClient = client->Deliveries();
    EXPECT_EQ(toServer[0].channel, toServer[1].channel);
    EXPECT_NE(toClient[0].channel, toServer[0].channel);
}

TEST_F(ChannelTest, OneSenderAlwaysReachesATargetOnTheSameChannelIdTwoSendersOnTwo) {
    RecordingNode* target = LaunchNew(launcher_, "target");
    RecordingNode* first = LaunchNew(launcher_, "first");
    RecordingNode* second = LaunchNew(launcher_, "second");
    const NodeId to = IdOf(*target);
    ASSERT_EQ(target->Subscribe(IdOf(*first), "news"), S_OK);

    // Every way a node can reach another: send, wait, emit.
    ASSERT_EQ(first->SendBinary(to, Bytes("a")), S_OK);
    ASSERT_EQ(first->SendBinaryAndWait(to, Bytes("b")), S_OK);
    ASSERT_EQ(first->EmitBinary("news", Bytes("c")), S_OK);
    ASSERT_EQ(second->SendBinary(to, Bytes("d")), S_OK);
    ASSERT_EQ(second->SendBinary(to, Bytes("e")), S_OK);
    ASSERT_TRUE(target->WaitForCount(5));

    std::set<ChannelId> fromFirst;
    std::set<ChannelId> fromSecond;
    for (const Delivery& delivery : target->Deliveries()) {
        (delivery.text < "d" ? fromFirst : fromSecond).insert(delivery.channel);
    }
    ASSERT_EQ(fromFirst.size(), 1u);
    ASSERT_EQ(fromSecond.size(), 1u);
    const ChannelId a = *fromFirst.begin();
    const ChannelId b = *fromSecond.begin();
    EXPECT_NE(a, b);
    EXPECT_NE(a, ChannelId());
    // A strict order: exactly one of the two is less.
    EXPECT_NE(a < b, b < a);
    EXPECT_FALSE(a < a);
}

TEST_F(ChannelTest, ChannelsCompareByTheirIdsAndCopiesStillAnswer) {
    std::vector<Channel> kept;
    std::mutex keptMutex;
    auto* server = new RecordingNode("server");
    server->React([&](const std::string&, Channel& channel) {
        std::lock_guard<std::mutex> hold(keptMutex);
        kept.push_back(channel);
        return 0L;
    });
    ASSERT_TRUE(launcher_.Launch(*server));
    RecordingNode* client = LaunchNew(launcher_, "client");
    RecordingNode* other = LaunchNew(launcher_, "other");
    ASSERT_EQ(client->SendBinary(IdOf(*server), Bytes("1")), S_OK);
    ASSERT_EQ(client->SendBinary(IdOf(*server), Bytes("2")), S_OK);
    ASSERT_EQ(other->SendBinary(IdOf(*server), Bytes("3")), S_OK);
    ASSERT_TRUE(context_.WaitUntilIdle(kTimeout));

    std::lock_guard<std::mutex> hold(keptMutex);
    ASSERT_EQ(kept.size(), 3u);
    EXPECT_EQ(kept[0], kept[1]);
    EXPECT_NE(kept[0], kept[2]);
    EXPECT_NE(kept[0] < kept[2], kept[2] < kept[0]);
    Channel assigned;
    assigned = kept[2];
    EXPECT_EQ(assigned.GetId(), kept[2].GetId());
    // Answered from the test's thread, long after the delivery returned.
    EXPECT_EQ(assigned.AnswerBinary(Bytes("late answer")), S_OK);
    ASSERT_TRUE(other->WaitForCount(1));
    EXPECT_EQ(other->Texts(), std::vector<std::string>{"late answer"});
}

TEST_F(ChannelTest, AnsweringFailsOnceEitherEndStoppedOrOnADefaultChannel) {
    std::vector<Channel> kept;
    std::mutex keptMutex;
    auto* server = new RecordingNode("server");
    server->React([&](const std::string&, Channel& channel) {
        std::lock_guard<std::mutex> hold(keptMutex);
        kept.push_back(channel);
        return 0L;
    });
    ASSERT_TRUE(launcher_.Launch(*server));
    RecordingNode* client = LaunchNew(launcher_, "client");
    RecordingNode* other = LaunchNew(launcher_, "other");
    ASSERT_EQ(client->SendBinaryAndWait(IdOf(*server), Bytes("1")), S_OK);
    ASSERT_EQ(other->SendBinaryAndWait(IdOf(*server), Bytes("2")), S_OK);

    std::lock_guard<std::mutex> hold(keptMutex);
    client->Stop();
    EXPECT_LT(kept[0].AnswerBinary(Bytes("to a stopped sender")), 0);
    EXPECT_EQ(kept[1].AnswerBinary(Bytes("still fine")), S_OK);
    server->Stop();
    EXPECT_LT(kept[1].AnswerBinary(Bytes("from a stopped server")), 0);
    EXPECT_LT(Channel().AnswerBinary(Bytes("nowhere")), 0);
    EXPECT_EQ(Channel().GetId(), ChannelId());
}

}  // namespace
}  // namespace KernelTest
