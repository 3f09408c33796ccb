// Emission and subscription: an emission reaches the subscribers of its emitter and name only.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "KernelTestNodes.h"

namespace KernelTest {
namespace {

using Nimbo::NodeId;

class EmissionTest : public ::testing::Test {
protected:
    Nimbo::Context context_;
    Nimbo::NodesLauncher launcher_{context_};
};

TEST_F(EmissionTest, ReachesSubscribersOfThatEmitterAndNameOnly) {
    RecordingNode* emitter = LaunchNew(launcher_, "emitter");
    RecordingNode* otherEmitter = LaunchNew(launcher_, "emitter");
    RecordingNode* both = LaunchNew(launcher_, "both");
    RecordingNode* twice = LaunchNew(launcher_, "twice");
    RecordingNode* elsewhere = LaunchNew(launcher_, "elsewhere");
    RecordingNode* otherName = LaunchNew(launcher_, "otherName");
    RecordingNode* none = LaunchNew(launcher_, "none");
    const NodeId from = IdOf(*emitter);

    ASSERT_EQ(both->Subscribe(from, "tick"), S_OK);
    ASSERT_EQ(both->Subscribe(IdOf(*otherEmitter), "tick"), S_OK);
    ASSERT_EQ(twice->Subscribe(from, "tick"), S_OK);
    ASSERT_EQ(twice->Subscribe(from, "tick"), S_OK);  // still one subscription
    ASSERT_EQ(elsewhere->Subscribe(IdOf(*otherEmitter), "tick"), S_OK);
    ASSERT_EQ(otherName->Subscribe(from, "tock"), S_OK);

    ASSERT_EQ(emitter->EmitBinary("tick", Bytes("t1")), S_OK);
    ASSERT_EQ(emitter->EmitBinary("tick", Bytes("t2")), S_OK);
    ASSERT_EQ(emitter->EmitBinary("nobody", Bytes("n")), S_OK);
    ASSERT_TRUE(context_.WaitUntilIdle(kTimeout));

    const std::vector<std::string> ticks{"t1", "t2"};
    EXPECT_EQ(both->Texts(), ticks);
    EXPECT_EQ(twice->Texts(), ticks);
    EXPECT_EQ(elsewhere->Count(), 0u);
    EXPECT_EQ(otherName->Count(), 0u);
    EXPECT_EQ(none->Count(), 0u);
    EXPECT_EQ(emitter->Count(), 0u);
}

TEST_F(EmissionTest, StoppedSubscribersAreSkippedAndStoppedEmittersRefuse) {
    RecordingNode* emitter = LaunchNew(launcher_, "emitter");
    RecordingNode* stays = LaunchNew(launcher_, "stays");
    RecordingNode* leaves = LaunchNew(launcher_, "leaves");
    const NodeId from = IdOf(*emitter);
    ASSERT_EQ(stays->Subscribe(from, "tick"), S_OK);
    ASSERT_EQ(leaves->Subscribe(from, "tick"), S_OK);
    leaves->Stop();

    EXPECT_EQ(emitter->EmitBinary("tick", Bytes("t")), S_OK);
    ASSERT_TRUE(context_.WaitUntilIdle(kTimeout));
    EXPECT_EQ(stays->Texts(), std::vector<std::string>{"t"});
    EXPECT_EQ(leaves->Count(), 0u);

    emitter->Stop();
    EXPECT_LT(emitter->EmitBinary("tick", Bytes("t")), 0);
    EXPECT_LT(stays->Subscribe(from, "tick"), 0);
    EXPECT_LT(stays->Subscribe(Nimbo::NodeId(), "tick"), 0);
}

TEST_F(EmissionTest, SubscribersAnswerTheEmitterOnTheChannel) {
    RecordingNode* emitter = LaunchNew(launcher_, "emitter");
    auto* subscriber = new RecordingNode("subscriber");
    subscriber->React([](const std::string& text, Nimbo::Channel& channel) {
        return channel.AnswerBinary(Bytes("seen " + text));
    });
    ASSERT_TRUE(launcher_.Launch(*subscriber));
    ASSERT_EQ(subscriber->Subscribe(IdOf(*emitter), "tick"), S_OK);
    ASSERT_EQ(emitter->EmitBinary("tick", Bytes("t")), S_OK);
    ASSERT_TRUE(context_.WaitUntilIdle(kTimeout));
    EXPECT_EQ(emitter->Texts(), std::vector<std::string>{"seen t"});
}

}  // namespace
}  // namespace KernelTest
