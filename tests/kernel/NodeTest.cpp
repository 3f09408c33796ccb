// Delivery and sending between nodes: order, one message at a time, waiting sends, stopping.
#include <gtest/gtest.h>

#include <future>
#include <stdexcept>
#include <string>
#include <vector>

#include "KernelTestNodes.h"
#include "Nimbo/Hypervisor.h"
#include "Nimbo/NodePool.h"
#include "Nimbo/NodeSettings.h"
#include "Nimbo/PrivateServices.h"

namespace KernelTest {
namespace {

using Nimbo::Channel;
using Nimbo::NodeId;

class NodeDeliveryTest : public ::testing::Test {
protected:
    Nimbo::Context context_;
    Nimbo::NodesLauncher launcher_{context_};
};

TEST_F(NodeDeliveryTest, MessagesArriveInOrderOneAtATimeOnTheNodesOwnThread) {
    RecordingNode* sender = LaunchNew(launcher_, "sender");
    auto* receiver = new RecordingNode("receiver");
    // A slow reaction gives later messages every chance to overtake or overlap.
    receiver->React([](const std::string&, Channel&) {
        std::this_thread::yield();
        return 0L;
    });
    ASSERT_TRUE(launcher_.Launch(*receiver));
    const NodeId target = IdOf(*receiver);

    std::vector<std::string> sent;
    for (int i = 0; i < 500; ++i) {
        sent.push_back("m" + std::to_string(i));
        ASSERT_EQ(sender->SendBinary(target, Bytes(sent.back())), S_OK);
    }
    ASSERT_TRUE(receiver->WaitForCount(sent.size()));
    EXPECT_EQ(receiver->Texts(), sent);
    EXPECT_FALSE(receiver->Overlapped());
    const std::vector<Delivery> deliveries = receiver->Deliveries();
    for (const Delivery& delivery : deliveries) {
        EXPECT_EQ(delivery.thread, deliveries.front().thread);
        EXPECT_NE(delivery.thread, std::this_thread::get_id());
    }
}

TEST_F(NodeDeliveryTest, SendAndWaitReturnsTheTargetsResultAfterDelivery) {
    RecordingNode* sender = LaunchNew(launcher_, "sender");
    auto* receiver = new RecordingNode("receiver");
    receiver->React(
        [](const std::string& text, Channel&) { return static_cast<long>(text.size()); });
    ASSERT_TRUE(launcher_.Launch(*receiver));

    EXPECT_EQ(sender->SendBinaryAndWait(IdOf(*receiver), Bytes("seven..")), 7);
    // Delivered before the call returned, not merely queued.
    EXPECT_EQ(receiver->Count(), 1u);
}

TEST_F(NodeDeliveryTest, SendAndWaitToItselfFromItsOwnDeliveryIsInline) {
    auto* node = new RecordingNode("loop");
    NodeId self;
    node->React([&](const std::string& text, Channel&) -> long {
        if (text == "inner") return 7;
        // On its own delivery thread: queueing this would wait for ourselves forever.
        return node->SendBinaryAndWait(self, Bytes("inner")) + 1;
    });
    ASSERT_TRUE(launcher_.Launch(*node));
    self = IdOf(*node);
    RecordingNode* driver = LaunchNew(launcher_, "driver");

    auto outer = std::async(std::launch::async,
                            [&] { return driver->SendBinaryAndWait(self, Bytes("outer")); });
    ASSERT_EQ(outer.wait_for(kTimeout), std::future_status::ready);
    EXPECT_EQ(outer.get(), 8);
    EXPECT_EQ(node->Texts(), (std::vector<std::string>{"outer", "inner"}));
}

TEST_F(NodeDeliveryTest, SendingFailsForUnknownStoppedOrForeignTargetsAndFromIdleSenders) {
    RecordingNode* sender = LaunchNew(launcher_, "sender");
    RecordingNode* receiver = LaunchNew(launcher_, "receiver");
    const NodeId target = IdOf(*receiver);
    RecordingNode idle("idle");  // never launched

    EXPECT_LT(sender->SendBinary(NodeId(), Bytes("x")), 0);
    EXPECT_LT(sender->SendBinaryAndWait(NodeId(), Bytes("x")), 0);
    EXPECT_LT(idle.SendBinary(target, Bytes("x")), 0);
    EXPECT_LT(idle.SendBinaryAndWait(target, Bytes("x")), 0);

    EXPECT_NE(target.GetStatus(), 0);
    EXPECT_EQ(receiver->Stop(), S_OK);
    EXPECT_EQ(target.GetStatus(), 0);
    EXPECT_LT(sender->SendBinary(target, Bytes("late")), 0);
    EXPECT_LT(sender->SendBinaryAndWait(target, Bytes("late")), 0);
    EXPECT_EQ(receiver->Count(), 0u);

    // A stopped sender cannot send either, not even to itself.
    const NodeId senderId = IdOf(*sender);
    EXPECT_EQ(sender->Stop(), S_OK);
    EXPECT_LT(sender->SendBinary(senderId, Bytes("x")), 0);
    NodeId unchanged;
    EXPECT_LT(sender->SelectMyself(unchanged), 0);
    EXPECT_EQ(unchanged, NodeId());
}

TEST_F(NodeDeliveryTest, StopDropsQueuedMessagesAndReleasesTheirWaitingSenders) {
    std::promise<void> gate;
    std::shared_future<void> opened = gate.get_future().share();
    auto* receiver = new RecordingNode("receiver");
    receiver->React([opened](const std::string&, Channel&) {
        opened.wait();
        return 0L;
    });
    ASSERT_TRUE(launcher_.Launch(*receiver));
    const NodeId target = IdOf(*receiver);
    RecordingNode* sender = LaunchNew(launcher_, "sender");

    ASSERT_EQ(sender->SendBinary(target, Bytes("first")), S_OK);
    ASSERT_TRUE(receiver->WaitForCount(1));  // now blocked in its delivery
    ASSERT_EQ(sender->SendBinary(target, Bytes("queued")), S_OK);
    auto waiting = std::async(std::launch::async,
                              [&] { return sender->SendBinaryAndWait(target, Bytes("waited")); });

    // Stop waits for the delivery in progress, so open the gate from elsewhere once it stops.
    auto stopped = std::async(std::launch::async, [&] { return receiver->Stop(); });
    ASSERT_EQ(waiting.wait_for(kTimeout), std::future_status::ready);
    EXPECT_EQ(waiting.get(), E_FAIL);
    gate.set_value();
    ASSERT_EQ(stopped.wait_for(kTimeout), std::future_status::ready);
    EXPECT_EQ(stopped.get(), S_OK);
    EXPECT_EQ(receiver->Texts(), std::vector<std::string>{"first"});
    EXPECT_TRUE(context_.WaitUntilIdle(kTimeout));
}

TEST_F(NodeDeliveryTest, StopFromItsOwnDeliveryEndsDeliveryWhenTheMessageReturns) {
    auto* node = new RecordingNode("quitter");
    node->React([&](const std::string& text, Channel&) -> long {
        if (text == "quit") return node->Stop();
        return 0;
    });
    ASSERT_TRUE(launcher_.Launch(*node));
    const NodeId target = IdOf(*node);
    RecordingNode* sender = LaunchNew(launcher_, "sender");

    ASSERT_EQ(sender->SendBinary(target, Bytes("quit")), S_OK);
    // Queued behind "quit" or refused: either way never delivered.
    sender->SendBinary(target, Bytes("after"));
    ASSERT_TRUE(context_.WaitUntilIdle(kTimeout));
    EXPECT_EQ(node->Texts(), std::vector<std::string>{"quit"});
    EXPECT_EQ(target.GetStatus(), 0);
}

TEST_F(NodeDeliveryTest, AFullQueueRefusesMoreMessages) {
    std::promise<void> gate;
    std::shared_future<void> opened = gate.get_future().share();
    auto* receiver = new RecordingNode("bounded", Nimbo::NodeSettings().SetQueueLimit(2));
    receiver->React([opened](const std::string&, Channel&) {
        opened.wait();
        return 0L;
    });
    ASSERT_TRUE(launcher_.Launch(*receiver));
    const NodeId target = IdOf(*receiver);
    RecordingNode* sender = LaunchNew(launcher_, "sender");

    ASSERT_EQ(sender->SendBinary(target, Bytes("busy")), S_OK);
    ASSERT_TRUE(receiver->WaitForCount(1));
    EXPECT_EQ(sender->SendBinary(target, Bytes("q1")), S_OK);
    EXPECT_EQ(sender->SendBinary(target, Bytes("q2")), S_OK);
    EXPECT_LT(sender->SendBinary(target, Bytes("q3")), 0);
    gate.set_value();
    ASSERT_TRUE(context_.WaitUntilIdle(kTimeout));
    EXPECT_EQ(receiver->Texts(), (std::vector<std::string>{"busy", "q1", "q2"}));
}

TEST_F(NodeDeliveryTest, AThrowingOnBinaryIsReportedAndFailsTheWaitingSender) {
    std::vector<std::string> errors;
    std::mutex errorsMutex;
    Nimbo::PrivateServices::SetErrorListener(
        [&](const ZelUnicodeString& message, const ZelUnicodeString& source) {
            std::lock_guard<std::mutex> hold(errorsMutex);
            errors.push_back(source.str() + ": " + message.str());
        });
    auto* thrower = new RecordingNode("thrower");
    thrower->React([](const std::string&, Channel&) -> long { throw std::runtime_error("boom"); });
    ASSERT_TRUE(launcher_.Launch(*thrower));
    RecordingNode* sender = LaunchNew(launcher_, "sender");

    EXPECT_EQ(sender->SendBinaryAndWait(IdOf(*thrower), Bytes("x")), E_FAIL);
    // The node survives and keeps delivering.
    EXPECT_EQ(sender->SendBinaryAndWait(IdOf(*thrower), Bytes("y")), E_FAIL);
    Nimbo::PrivateServices::SetErrorListener(nullptr);
    std::lock_guard<std::mutex> hold(errorsMutex);
    ASSERT_EQ(errors.size(), 2u);
    EXPECT_EQ(errors[0], "Nimbo: Nimbo::Node::OnBinary() of node <thrower> threw <boom>");
}

TEST(NodeTest, UnlaunchedNodesHaveNoIdAndRefuseEveryOperation) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    RecordingNode* live = LaunchNew(launcher, "live");
    RecordingNode idle("idle");
    NodeId id;
    Nimbo::NodePool pool;

    EXPECT_EQ(idle.GetName(), "idle");
    EXPECT_LT(idle.SelectMyself(id), 0);
    EXPECT_LT(idle.Connect("live", pool), 0);
    EXPECT_LT(idle.Subscribe(IdOf(*live), "event"), 0);
    EXPECT_LT(idle.EmitBinary("event", Bytes("x")), 0);
    EXPECT_LT(idle.SendBinaryOnDisconnection(IdOf(*live), Bytes("x")), 0);
    EXPECT_EQ(idle.Stop(), S_OK);
    // Stopped before launch: it never runs.
    EXPECT_FALSE(launcher.Launch(idle));
}

TEST(NodeTest, NotImplementedOperationsSaySo) {
    RecordingNode node("n");
    EXPECT_EQ(node.AllowWebAccess(), S_OK);
    EXPECT_EQ(node.Execute("task", static_cast<Nimbo::ExecutePolicy>(0)), E_NOTIMPL);
}

}  // namespace
}  // namespace KernelTest
