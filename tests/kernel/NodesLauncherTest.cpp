// The launcher: waiting for server nodes, and stopping everything it owns.
#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <string>

#include "KernelTestNodes.h"

namespace KernelTest {
namespace {

using Nimbo::NodeId;

TEST(NodesLauncherTest, WaitAllReturnsOnceEveryNodeStoppedWhileCallbackNodesKeepRunning) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    RecordingNode* first = LaunchNew(launcher, "server");
    RecordingNode* second = LaunchNew(launcher, "server");
    auto* callback = LaunchNew<RecordingCallbackNode>(launcher, "callback");
    auto waited = std::async(std::launch::async, [&] { return launcher.WaitAll(); });
    first->Stop();
    EXPECT_EQ(waited.wait_for(std::chrono::milliseconds(50)), std::future_status::timeout);
    second->Stop();
    ASSERT_EQ(waited.wait_for(kTimeout), std::future_status::ready);
    EXPECT_EQ(waited.get(), S_OK);
    EXPECT_EQ(callback->SendBinaryAndWait(IdOf(*callback), Bytes("still here")), S_OK);
    EXPECT_EQ(callback->Texts(), Strings{"still here"});
    EXPECT_FALSE(launcher.Launch(*first));  // a stopped node never runs again
}

TEST(NodesLauncherTest, DestroyingTheLauncherBreaksTwoNodesWaitingOnEachOther) {
    Nimbo::Context context;
    std::atomic<long> got[2] = {{1}, {1}};
    NodeId ids[2];
    RecordingNode* nodes[2];
    {
        Nimbo::NodesLauncher launcher(context);
        // Each asks the other and waits; each question queues behind the other's waiting
        // delivery, so neither ever answers.
        for (int n = 0; n < 2; ++n) {
            nodes[n] =
                LaunchNew(launcher, "node", [&, n](const std::string& text, Nimbo::Channel&) {
                    if (text == "start")
                        got[n] = nodes[n]->SendBinaryAndWait(ids[1 - n], Bytes("ask"));
                    return 0L;
                });
            ids[n] = IdOf(*nodes[n]);
        }
        for (int n = 0; n < 2; ++n) ASSERT_EQ(nodes[n]->SendBinary(ids[n], Bytes("start")), S_OK);
        ASSERT_TRUE(nodes[0]->WaitForCount(1));
        ASSERT_TRUE(nodes[1]->WaitForCount(1));
    }
    // Halting one fails the question queued to it; the released asker may still answer the
    // other before being halted in turn.
    EXPECT_TRUE(got[0] == E_FAIL || got[1] == E_FAIL) << got[0] << " " << got[1];
    for (const auto& result : got) EXPECT_TRUE(result == E_FAIL || result == S_OK) << result;
}

}  // namespace
}  // namespace KernelTest
