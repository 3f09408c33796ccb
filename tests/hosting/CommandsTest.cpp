// The Commands object: its pools, its hypervisor, the context it owns or borrows, and the bags
// bound to its registry.
#include <gtest/gtest.h>

#include <memory>

#include "HostingTestSupport.h"
#include "Tarn/Binary.h"
#include "Tarn/TypesImpl.h"

namespace {

using HostingTest::Outsider;

TEST(CommandsPoolsTest, SameNameGivesTheSamePoolAndOtherNamesOthers) {
    Tarn::Commands commands;
    Tarn::Pool& first = commands.GetPool("alpha");
    EXPECT_EQ(&first, &commands.GetPool("alpha"));
    EXPECT_NE(&first, &commands.GetPool("beta"));
    EXPECT_NE(&first, &commands.GetPool("Alpha"));  // names are case-sensitive
    EXPECT_EQ("alpha", first.GetName().str());
}

// --- Hypervisor ----------------------------------------------------------------------------------

TEST(CommandsHypervisorTest, PlainStartSucceedsThoughTheKernelCannotListen) {
    {
        Tarn::Commands commands;
        EXPECT_FALSE(commands.HasHypervisor());
        EXPECT_EQ(E_FAIL, commands.Execute("task", Nimbo::kExecuteAsync));
        EXPECT_EQ(S_OK, commands.StartHypervisor());
        EXPECT_TRUE(commands.HasHypervisor());
        // Our kernel runs no tasks: the call reaches the hypervisor and comes back unimplemented.
        EXPECT_EQ(E_NOTIMPL, commands.Execute("task", Nimbo::kExecuteWait));
        EXPECT_EQ(E_NOTIMPL, commands.HypervisorExecute("task"));
    }
    EXPECT_FALSE(Nimbo::Context::HasHypervisor());  // it went with its Commands
}

TEST(CommandsHypervisorTest, StartWithSettingsReturnsWhatListeningReturned) {
    Tarn::Commands commands;
    EXPECT_EQ(E_NOTIMPL, commands.HypervisorExecute("task"));
    // The kernel starts it, then cannot listen on a web socket yet.
    EXPECT_EQ(E_NOTIMPL, commands.StartHypervisor(Nimbo::HypervisorSettings().SetWebSocketPort(0)));
    EXPECT_TRUE(commands.HasHypervisor());
}

TEST(CommandsHypervisorTest, SecondStartOfEitherFormFailsAndKeepsTheFirst) {
    for (bool plainFirst : {true, false}) {
        Tarn::Commands commands;
        plainFirst ? commands.StartHypervisor()
                   : commands.StartHypervisor(Nimbo::HypervisorSettings());
        EXPECT_EQ(E_FAIL, commands.StartHypervisor());
        EXPECT_EQ(E_FAIL, commands.StartHypervisor(Nimbo::HypervisorSettings()));
        EXPECT_TRUE(commands.HasHypervisor());
        EXPECT_EQ(E_NOTIMPL, commands.Execute("task", Nimbo::kExecuteDefault));
    }
}

// --- Context -------------------------------------------------------------------------------------

TEST(CommandsContextTest, BorrowedContextSharesNodesAndOutlivesTheCommands) {
    Nimbo::Context context;
    Outsider outsider(context);
    {
        Tarn::Commands commands(context);
        EXPECT_EQ(&context, &HostingTest::ContextOf(commands));
        ASSERT_NE(nullptr, commands.GetPool("served").CreateNode());
        EXPECT_EQ(1u, outsider.Select("served", 1).size());
    }
    EXPECT_TRUE(outsider.Select("served", 1).empty());  // its nodes went with it, not the context
    Tarn::Commands again(context);
    ASSERT_NE(nullptr, again.GetPool("served").CreateCallbackNode());
    EXPECT_EQ(1u, outsider.Select("served", 1).size());
    EXPECT_TRUE(context.WaitUntilIdle(HostingTest::kTimeout));
}

TEST(CommandsContextTest, OwnedContextIsAContextOfItsOwn) {
    Nimbo::Context elsewhere;
    Outsider stranger(elsewhere);
    Tarn::Commands commands;
    ASSERT_NE(nullptr, commands.GetPool("private").CreateNode());
    EXPECT_TRUE(stranger.Select("private", 1).empty());
    Outsider insider(HostingTest::ContextOf(commands));
    EXPECT_EQ(1u, insider.Select("private", 1).size());
}

// --- Bags bound to the registry ------------------------------------------------------------------

struct Point {
    int x;
};
long SerializePoint(Tarn::Parameters& target, const void* object) {
    return target.WriteInt32("x", static_cast<const Point*>(object)->x);
}
void* UnserializePoint(const Tarn::Parameters& source) {
    auto* point = new Point{0};
    source.ReadInt32("x", point->x);
    return point;
}
long DeclarePoint(const Tarn::Commands& commands) {
    return Tarn::CommandsInternal::GetTypes(commands).GetImpl().DeclareType("Point", SerializePoint,
                                                                            UnserializePoint);
}

TEST(CommandsParametersTest, BagsOfACommandsKnowTheTypesDeclaredInItsRegistry) {
    HostingTest::PublishedErrors errors;
    Tarn::Commands declaring, other;
    ASSERT_EQ(S_OK, DeclarePoint(declaring));
    const Point point{7};
    Tarn::Parameters bound(declaring);
    EXPECT_EQ(S_OK, bound.WriteObject("p", "Point", &point));
    EXPECT_EQ(S_OK, declaring.CreateParameters().WriteObject("p", "Point", &point));
    EXPECT_TRUE(errors.Texts().empty());

    Tarn::Parameters foreign(other);
    EXPECT_EQ(E_FAIL, foreign.WriteObject("p", "Point", &point));
    EXPECT_EQ((std::vector<std::string>{
                  "Tarn::Type::Serialize(), Parameters Type <Point> not registered",
                  "Parameters::WriteObject() serialization fail, property <p> type <Point>"}),
              errors.Texts());
}

TEST(CommandsParametersTest, DecodingConstructorsReadEitherBufferThroughTheRegistry) {
    Tarn::Commands commands;
    ASSERT_EQ(S_OK, DeclarePoint(commands));
    Tarn::Parameters sent(commands);
    const Point point{42};
    sent.WriteString("name", "probe");
    ASSERT_EQ(S_OK, sent.WriteObject("p", "Point", &point));
    const Nimbo::Binary bytes = sent.ToBinary();

    for (const Tarn::Parameters& received :
         {Tarn::Parameters(commands, bytes), Tarn::Parameters(commands, Tarn::Binary(bytes))}) {
        ZelUnicodeString name;
        void* object = nullptr;
        EXPECT_EQ(S_OK, received.ReadString("name", name));
        EXPECT_EQ("probe", name.str());
        ASSERT_EQ(S_OK, received.ReadObject("p", "Point", object));
        EXPECT_EQ(42, std::unique_ptr<Point>(static_cast<Point*>(object))->x);
    }
}

}  // namespace
