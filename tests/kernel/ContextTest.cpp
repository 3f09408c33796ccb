// Contexts: isolation from one another, idleness, and the process's hypervisor.
#include <gtest/gtest.h>

#include <future>
#include <string>

#include "KernelTestNodes.h"
#include "Nimbo/Hypervisor.h"
#include "Nimbo/NodePool.h"

namespace KernelTest {
namespace {

using Nimbo::NodeId;

TEST(ContextTest, TwoContextsNeverSeeEachOthersNodes) {
    Nimbo::Context one;
    Nimbo::Context two;
    Nimbo::NodesLauncher launchOne(one);
    Nimbo::NodesLauncher launchTwo(two);
    RecordingNode* inOne = LaunchNew(launchOne, "pool");
    RecordingNode* inTwo = LaunchNew(launchTwo, "pool");
    const NodeId idOne = IdOf(*inOne);
    const NodeId idTwo = IdOf(*inTwo);

    for (int i = 0; i < 3; ++i) {
        Nimbo::NodePool pool;
        ASSERT_EQ(inOne->Connect("pool", pool), S_OK);
        NodeId picked;
        ASSERT_EQ(pool.Select(picked), S_OK);
        EXPECT_EQ(picked, idOne);
    }
    EXPECT_LT(inOne->SendBinary(idTwo, Bytes("x")), 0);
    EXPECT_LT(inOne->SendBinaryAndWait(idTwo, Bytes("x")), 0);
    EXPECT_LT(inOne->SendBinaryOnDisconnection(idTwo, Bytes("x")), 0);
    EXPECT_LT(inOne->Subscribe(idTwo, "tick"), 0);
    inOne->Stop();
    ASSERT_TRUE(two.WaitUntilIdle(kTimeout));
    EXPECT_EQ(inTwo->Count(), 0u);
}

TEST(ContextTest, WaitUntilIdleCountsOnlyItsOwnMessages) {
    Nimbo::Context busy;
    Nimbo::Context quiet;
    Nimbo::NodesLauncher launchBusy(busy);
    Nimbo::NodesLauncher launchQuiet(quiet);
    std::promise<void> gate;
    std::shared_future<void> opened = gate.get_future().share();
    auto* blocked = new RecordingNode("blocked");
    blocked->React([opened](const std::string&, Nimbo::Channel&) {
        opened.wait();
        return 0L;
    });
    ASSERT_TRUE(launchBusy.Launch(*blocked));
    LaunchNew(launchQuiet, "idle");

    ASSERT_EQ(blocked->SendBinary(IdOf(*blocked), Bytes("hold")), S_OK);
    ASSERT_TRUE(blocked->WaitForCount(1));
    EXPECT_FALSE(busy.WaitUntilIdle(std::chrono::milliseconds(20)));
    EXPECT_TRUE(quiet.WaitUntilIdle(kTimeout));
    gate.set_value();
    EXPECT_TRUE(busy.WaitUntilIdle(kTimeout));
}

TEST(ContextTest, AStartedHypervisorIsKnownUntilDestroyed) {
    Nimbo::Context context;
    ASSERT_FALSE(Nimbo::Context::HasHypervisor());
    {
        Nimbo::Hypervisor unstarted(context);
        EXPECT_FALSE(Nimbo::Context::HasHypervisor());
    }
    {
        Nimbo::Hypervisor hypervisor(context, Nimbo::HypervisorSettings().SetWebSocketPort(8080));
        EXPECT_EQ(hypervisor.Start(), S_OK);
        EXPECT_TRUE(Nimbo::Context::HasHypervisor());
        EXPECT_EQ(hypervisor.Start(), S_FALSE);
        EXPECT_EQ(hypervisor.GetSettings().GetWebSocketPort(), 8080);
        EXPECT_EQ(hypervisor.ListenOnWebSocket(), E_NOTIMPL);
        EXPECT_EQ(hypervisor.Execute("task", static_cast<Nimbo::ExecutePolicy>(1)), E_NOTIMPL);
    }
    EXPECT_FALSE(Nimbo::Context::HasHypervisor());
}

}  // namespace
}  // namespace KernelTest
