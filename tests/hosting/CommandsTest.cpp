// The Commands object: its pools, its hypervisor, the context it owns, and the bags bound to its
// registry.
#include "HostingTestSupport.h"

namespace {

using HostingTest::Outsider;

// GetPool gives one pool per name. A Commands made without a context owns one of its own: its
// nodes are seen there and nowhere else. (Borrowed contexts: HostingThreadsTest.)
TEST(CommandsTest, PoolsByNameOnAContextOfItsOwn) {
    Tarn::Commands commands;
    Tarn::Pool& first = commands.GetPool("alpha");
    EXPECT_EQ(&first, &commands.GetPool("alpha"));
    EXPECT_NE(&first, &commands.GetPool("beta"));
    EXPECT_NE(&first, &commands.GetPool("Alpha"));  // names are case-sensitive
    EXPECT_EQ("alpha", first.GetName().str());
    ASSERT_NE(nullptr, first.CreateNode());
    EXPECT_EQ(1u, Outsider(HostingTest::ContextOf(commands)).Select("alpha", 1).size());
    Nimbo::Context elsewhere;
    EXPECT_TRUE(Outsider(elsewhere).Select("alpha", 1).empty());
}

// The plain start succeeds though the kernel cannot listen on a web socket yet; the start with
// settings returns what listening returned. A second start of either form fails.
TEST(CommandsTest, HypervisorStartsOnceAndExecutesThroughTheKernel) {
    for (bool plain : {true, false}) {
        {
            Tarn::Commands commands;
            EXPECT_FALSE(commands.HasHypervisor());
            EXPECT_EQ(E_FAIL, commands.Execute("task", Nimbo::kExecuteAsync));
            EXPECT_EQ(
                plain ? S_OK : E_NOTIMPL,
                plain ? commands.StartHypervisor()
                      : commands.StartHypervisor(Nimbo::HypervisorSettings().SetWebSocketPort(0)));
            EXPECT_TRUE(commands.HasHypervisor());
            EXPECT_EQ(E_FAIL, commands.StartHypervisor());
            EXPECT_EQ(E_FAIL, commands.StartHypervisor(Nimbo::HypervisorSettings()));
            // Our kernel runs no tasks: the call reaches the hypervisor, comes back unimplemented.
            EXPECT_EQ(E_NOTIMPL, commands.Execute("task", Nimbo::kExecuteWait));
            EXPECT_EQ(E_NOTIMPL, commands.HypervisorExecute("task"));
        }
        EXPECT_FALSE(Nimbo::Context::HasHypervisor());  // it went with its Commands
    }
}

struct Point {
    int x;
};
long DeclarePoint(const Tarn::Commands& commands) {
    return Tarn::CommandsInternal::GetTypes(commands).GetImpl().DeclareType(
        "Point",
        [](Tarn::Parameters& target, const void* object) {
            return target.WriteInt32("x", static_cast<const Point*>(object)->x);
        },
        [](const Tarn::Parameters& source) -> void* {
            auto* point = new Point{0};
            source.ReadInt32("x", point->x);
            return point;
        });
}

// Parameters(commands) and commands.CreateParameters() know the types of its registry only; the
// decoding constructors read either buffer through it.
TEST(CommandsTest, BagsKnowTheTypesOfTheirRegistry) {
    Tarn::Testing::ErrorCapture errors;
    Tarn::Commands commands, other;
    ASSERT_EQ(S_OK, DeclarePoint(commands));
    const Point point{42};
    Tarn::Parameters sent(commands);
    ASSERT_EQ(S_OK, sent.WriteObject("p", "Point", &point));
    EXPECT_EQ(S_OK, commands.CreateParameters().WriteObject("p", "Point", &point));
    EXPECT_TRUE(errors.Errors().empty());
    const Nimbo::Binary bytes = sent.ToBinary();
    for (const Tarn::Parameters& received :
         {Tarn::Parameters(commands, bytes), Tarn::Parameters(commands, Tarn::Binary(bytes))}) {
        void* object = nullptr;
        ASSERT_EQ(S_OK, received.ReadObject("p", "Point", object));
        EXPECT_EQ(42, std::unique_ptr<Point>(static_cast<Point*>(object))->x);
    }

    Tarn::Parameters foreign(other);
    EXPECT_EQ(E_FAIL, foreign.WriteObject("p", "Point", &point));
    EXPECT_EQ((std::vector<std::string>{
                  "Tarn::Type::Serialize(), Parameters Type <Point> not registered",
                  "Parameters::WriteObject() serialization fail, property <p> type <Point>"}),
              errors.Messages());
}

}  // namespace
