// Delivery and sending: order, one message at a time, waiting sends, stopping.
#include <gtest/gtest.h>

#include <future>
#include <stdexcept>
#include <string>

#include "KernelTestNodes.h"

namespace KernelTest {
namespace {

using Nimbo::Channel;
using Nimbo::NodeId;

class NodeTest : public ::testing::Test {
protected:
    Nimbo::Context context_;
    Nimbo::NodesLauncher launcher_{context_};
};

TEST_F(NodeTest, MessagesArriveInOrderOneAtATime) {
    RecordingNode* sender = LaunchNew(launcher_, "sender");
    // A slow reaction gives later messages every chance to overtake or overlap.
    RecordingNode* receiver = LaunchNew(launcher_, "receiver", [](const std::string&, Channel&) {
        std::this_thread::yield();
        return 0L;
    });
    Strings sent;
    for (int i = 0; i < 500; ++i) {
        sent.push_back(std::to_string(i));
        ASSERT_EQ(sender->SendBinary(IdOf(*receiver), Bytes(sent.back())), S_OK);
    }
    ASSERT_TRUE(receiver->WaitForCount(sent.size()));
    EXPECT_EQ(receiver->Texts(), sent);
    EXPECT_FALSE(receiver->overlapped);
}

TEST_F(NodeTest, SendAndWaitToItselfFromItsOwnDeliveryIsInlineAndPassesResultsBack) {
    NodeId self;
    RecordingNode* node = nullptr;
    node = LaunchNew(launcher_, "loop", [&](const std::string& text, Channel&) -> long {
        if (text == "inner") return 7;
        // Queueing this would wait for our own thread forever.
        return node->SendBinaryAndWait(self, Bytes("inner")) + 1;
    });
    self = IdOf(*node);
    RecordingNode* driver = LaunchNew(launcher_, "driver");
    auto outer = std::async(std::launch::async,
                            [&] { return driver->SendBinaryAndWait(self, Bytes("outer")); });
    ASSERT_EQ(outer.wait_for(kTimeout), std::future_status::ready);
    EXPECT_EQ(outer.get(), 8);
    EXPECT_EQ(node->Texts(), (Strings{"outer", "inner"}));
}

TEST_F(NodeTest, SendingFailsToStoppedUnknownOrForeignTargetsAndFromStoppedSenders) {
    Nimbo::Context elsewhere;
    Nimbo::NodesLauncher foreignLauncher(elsewhere);
    const NodeId foreign = IdOf(*LaunchNew(foreignLauncher, "foreign"));
    RecordingNode* sender = LaunchNew(launcher_, "sender");
    RecordingNode* receiver = LaunchNew(launcher_, "receiver");
    const NodeId target = IdOf(*receiver);
    EXPECT_NE(target.GetStatus(), 0);
    receiver->Stop();
    EXPECT_EQ(target.GetStatus(), 0);

    for (const NodeId& to : {target, NodeId(), foreign}) {
        EXPECT_LT(sender->SendBinary(to, Bytes("x")), 0);
        EXPECT_LT(sender->SendBinaryAndWait(to, Bytes("x")), 0);
        EXPECT_LT(sender->SendBinaryOnDisconnection(to, Bytes("x")), 0);
        EXPECT_LT(sender->Subscribe(to, "x"), 0);
    }
    const NodeId senderId = IdOf(*sender);
    sender->Stop();
    EXPECT_LT(sender->SendBinary(senderId, Bytes("x")), 0);
    EXPECT_TRUE(context_.WaitUntilIdle(kTimeout));
    EXPECT_TRUE(receiver->Texts().empty());
}

TEST_F(NodeTest, StopDropsQueuedMessagesAndReleasesTheirWaitingSenders) {
    std::promise<void> gate;
    RecordingNode* receiver = LaunchNew(launcher_, "receiver", Blocked(gate.get_future().share()));
    RecordingNode* sender = LaunchNew(launcher_, "sender");
    const NodeId target = IdOf(*receiver);
    ASSERT_EQ(sender->SendBinary(target, Bytes("first")), S_OK);
    ASSERT_TRUE(receiver->WaitForCount(1));  // blocked in its delivery
    ASSERT_EQ(sender->SendBinary(target, Bytes("queued")), S_OK);
    auto waiting = std::async(std::launch::async,
                              [&] { return sender->SendBinaryAndWait(target, Bytes("waited")); });
    // Stop waits for the delivery in progress, so it must run elsewhere while the gate is shut.
    auto stopped = std::async(std::launch::async, [&] { return receiver->Stop(); });
    ASSERT_EQ(waiting.wait_for(kTimeout), std::future_status::ready);
    EXPECT_EQ(waiting.get(), E_FAIL);
    gate.set_value();
    ASSERT_EQ(stopped.wait_for(kTimeout), std::future_status::ready);
    EXPECT_EQ(receiver->Texts(), Strings{"first"});
    EXPECT_TRUE(context_.WaitUntilIdle(kTimeout));
}

TEST_F(NodeTest, StopFromItsOwnDeliveryEndsDeliveryWhenTheMessageReturns) {
    RecordingNode* node = nullptr;
    node = LaunchNew(launcher_, "quitter", [&](const std::string& text, Channel&) {
        return text == "quit" ? node->Stop() : 0L;
    });
    RecordingNode* sender = LaunchNew(launcher_, "sender");
    ASSERT_EQ(sender->SendBinary(IdOf(*node), Bytes("quit")), S_OK);
    sender->SendBinary(IdOf(*node), Bytes("after"));  // queued behind "quit", or refused
    ASSERT_TRUE(context_.WaitUntilIdle(kTimeout));
    EXPECT_EQ(node->Texts(), Strings{"quit"});
}

TEST_F(NodeTest, AThrowingOnBinaryIsReportedAndFailsTheWaitingSender) {
    Strings errors;
    Nimbo::PrivateServices::SetErrorListener(
        [&](const ZelUnicodeString& message, const ZelUnicodeString& source) {
            errors.push_back(source.str() + ": " + message.str());
        });
    RecordingNode* thrower =
        LaunchNew(launcher_, "thrower",
                  [](const std::string&, Channel&) -> long { throw std::runtime_error("boom"); });
    RecordingNode* sender = LaunchNew(launcher_, "sender");
    EXPECT_EQ(sender->SendBinaryAndWait(IdOf(*thrower), Bytes("x")), E_FAIL);
    EXPECT_EQ(sender->SendBinaryAndWait(IdOf(*thrower), Bytes("y")), E_FAIL);  // still serving
    Nimbo::PrivateServices::SetErrorListener(nullptr);
    EXPECT_EQ(errors, Strings(2, "Nimbo: Nimbo::Node::OnBinary() of node <thrower> threw <boom>"));
}

TEST_F(NodeTest, EmissionReachesSubscribersOfThatEmitterAndNameOnly) {
    RecordingNode* emitter = LaunchNew(launcher_, "emitter");
    RecordingNode* otherEmitter = LaunchNew(launcher_, "emitter");
    RecordingNode* twice = LaunchNew(launcher_, "twice");
    RecordingNode* otherSource = LaunchNew(launcher_, "otherSource");
    RecordingNode* otherName = LaunchNew(launcher_, "otherName");
    RecordingNode* stopped = LaunchNew(launcher_, "stopped");
    ASSERT_EQ(twice->Subscribe(IdOf(*emitter), "tick"), S_OK);
    ASSERT_EQ(twice->Subscribe(IdOf(*emitter), "tick"), S_OK);  // still one subscription
    ASSERT_EQ(otherSource->Subscribe(IdOf(*otherEmitter), "tick"), S_OK);
    ASSERT_EQ(otherName->Subscribe(IdOf(*emitter), "tock"), S_OK);
    ASSERT_EQ(stopped->Subscribe(IdOf(*emitter), "tick"), S_OK);
    stopped->Stop();
    ASSERT_EQ(emitter->EmitBinary("tick", Bytes("t1")), S_OK);
    ASSERT_EQ(emitter->EmitBinary("tick", Bytes("t2")), S_OK);
    ASSERT_TRUE(context_.WaitUntilIdle(kTimeout));
    EXPECT_EQ(twice->Texts(), (Strings{"t1", "t2"}));
    EXPECT_TRUE(otherSource->Texts().empty());
    EXPECT_TRUE(otherName->Texts().empty());
    EXPECT_TRUE(stopped->Texts().empty());
}

}  // namespace
}  // namespace KernelTest
