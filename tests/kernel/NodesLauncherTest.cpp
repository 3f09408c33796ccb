// The launcher: launching, waiting for the server nodes, and stopping everything it owns.
#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <memory>
#include <string>

#include "KernelTestNodes.h"

namespace KernelTest {
namespace {

using Nimbo::NodeId;

// Counts the destruction of its instances, to see the launcher release them.
class CountedNode : public RecordingNode {
public:
    CountedNode(const char* name, std::shared_ptr<int> destroyed)
        : RecordingNode(name), destroyed_(std::move(destroyed)) {}
    ~CountedNode() override { ++*destroyed_; }

private:
    std::shared_ptr<int> destroyed_;
};

TEST(NodesLauncherTest, WaitAllReturnsOnceEveryNodeStoppedWhileCallbackNodesKeepRunning) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    RecordingNode* first = LaunchNew(launcher, "server");
    RecordingNode* second = LaunchNew(launcher, "server");
    RecordingCallbackNode* callback = LaunchNew<RecordingCallbackNode>(launcher, "callback");

    auto waited = std::async(std::launch::async, [&] { return launcher.WaitAll(); });
    first->Stop();
    EXPECT_EQ(waited.wait_for(std::chrono::milliseconds(100)), std::future_status::timeout);
    second->Stop();
    ASSERT_EQ(waited.wait_for(kTimeout), std::future_status::ready);
    EXPECT_EQ(waited.get(), S_OK);

    // The callback node was not waited for and still delivers.
    const NodeId callbackId = IdOf(*callback);
    EXPECT_NE(callbackId.GetStatus(), 0);
    EXPECT_EQ(callback->SendBinaryAndWait(callbackId, Bytes("still here")), S_OK);
    EXPECT_EQ(callback->Texts(), std::vector<std::string>{"still here"});
}

TEST(NodesLauncherTest, WaitAllWithOnlyCallbackNodesReturnsAtOnce) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    EXPECT_EQ(launcher.WaitAll(), S_OK);
    LaunchNew<RecordingCallbackNode>(launcher, "callback");
    EXPECT_EQ(launcher.WaitAll(), S_OK);
}

TEST(NodesLauncherTest, DestroyingTheLauncherStopsAndDeletesItsNodes) {
    Nimbo::Context context;
    auto destroyed = std::make_shared<int>(0);
    NodeId node;
    NodeId callback;
    {
        Nimbo::NodesLauncher launcher(context);
        node = IdOf(*LaunchNew<CountedNode>(launcher, "node", destroyed));
        callback = IdOf(*LaunchNew<RecordingCallbackNode>(launcher, "callback"));
        EXPECT_NE(node.GetStatus(), 0);
        EXPECT_NE(callback.GetStatus(), 0);
    }
    EXPECT_EQ(*destroyed, 1);
    // Ids outlive their nodes and report them gone.
    EXPECT_EQ(node.GetStatus(), 0);
    EXPECT_EQ(callback.GetStatus(), 0);
}

TEST(NodesLauncherTest, DestroyingTheLauncherBreaksTwoNodesWaitingOnEachOther) {
    Nimbo::Context context;
    std::atomic<long> firstGot{1};
    std::atomic<long> secondGot{1};
    NodeId firstId;
    NodeId secondId;
    {
        Nimbo::NodesLauncher launcher(context);
        auto* first = new RecordingNode("first");
        auto* second = new RecordingNode("second");
        // Each asks the other and waits; each question queues behind the other's waiting
        // delivery, so neither ever answers.
        first->React([first, &secondId, &firstGot](const std::string& text, Nimbo::Channel&) {
            if (text == "start") firstGot = first->SendBinaryAndWait(secondId, Bytes("ask"));
            return 0L;
        });
        second->React([second, &firstId, &secondGot](const std::string& text, Nimbo::Channel&) {
            if (text == "start") secondGot = second->SendBinaryAndWait(firstId, Bytes("ask"));
            return 0L;
        });
        ASSERT_TRUE(launcher.Launch(*first));
        ASSERT_TRUE(launcher.Launch(*second));
        firstId = IdOf(*first);
        secondId = IdOf(*second);
        ASSERT_EQ(first->SendBinary(secondId, Bytes("start")), S_OK);
        ASSERT_EQ(second->SendBinary(firstId, Bytes("start")), S_OK);
        ASSERT_TRUE(first->WaitForCount(1));
        ASSERT_TRUE(second->WaitForCount(1));
        EXPECT_FALSE(context.WaitUntilIdle(std::chrono::milliseconds(50)));
    }
    // Halting one node fails the question queued to it; its asker, released, may still answer
    // the other's question before being halted in turn. Neither is left waiting.
    const long first = firstGot.load();
    const long second = secondGot.load();
    EXPECT_TRUE(first == E_FAIL || second == E_FAIL) << first << " " << second;
    EXPECT_TRUE(first == E_FAIL || first == S_OK) << first;
    EXPECT_TRUE(second == E_FAIL || second == S_OK) << second;
    EXPECT_TRUE(context.WaitUntilIdle(kTimeout));
}

TEST(NodesLauncherTest, ANodeLaunchesOnlyOnce) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    Nimbo::NodesLauncher other(context);
    RecordingNode* node = LaunchNew(launcher, "node");
    EXPECT_FALSE(launcher.Launch(*node));
    EXPECT_FALSE(other.Launch(*node));
    node->Stop();
    EXPECT_FALSE(launcher.Launch(*node));
}

}  // namespace
}  // namespace KernelTest
