// How a serving node runs the calls that reach it: instances, phases, revokes, disconnect notices,
// unknown and throwing commands, in-process default parameters and the protocol version check.
#include "protocol/ProtocolTesting.h"

namespace Tarn::Testing {
namespace {

using DispatchTest = ProtocolTest;

TEST_F(DispatchTest, SameGuidFromTwoChannelsThenAnEndOnlyMessageAfterAnotherCommand) {
    ScriptedCommand* shared = Serve("shared");
    ScriptedCommand* alpha = Serve("alpha", 1);
    ScriptedCommand* beta = Serve("beta", 2);
    NewServer();
    RawNode* first = NewRaw("first");
    RawNode* second = NewRaw("second");
    const Nimbo::NodeId server = first->Find("server");
    auto send = [&](RawNode* raw, const char* command, const char* guid, const char* phase) {
        raw->SendBinary(server,
                        RequestMessage(command, guid, phase, *command == 'b' ? 2 : 1).ToBinary());
    };
    send(first, "shared", "{same}", "beginParameters");
    ASSERT_TRUE(shared->calls.WaitForCount(2));
    send(second, "shared", "{same}", "beginParameters");
    ASSERT_TRUE(shared->calls.WaitForCount(4));
    send(first, "shared", "{same}", "endParameters");
    send(second, "shared", "{same}", "endParameters");
    ASSERT_TRUE(Idle());
    // The reply header keeps the last command of a begin or send phase; an end-only call sets
    // only its guid.
    send(first, "alpha", "{a}", "beginParameters");
    send(first, "beta", "{b}", "endParameters");
    ASSERT_TRUE(Idle());

    EXPECT_EQ(shared->Operations(), "create begin create begin end destroy end destroy");
    EXPECT_EQ(alpha->Operations(), "create begin");
    EXPECT_EQ(beta->Operations(), "create end destroy");
    auto revokes = [this](RawNode* raw) {  // "<command> <version> <guid> <revoke>" of each
        Strings all;
        for (const Nimbo::Binary& bytes : raw->received.All()) {
            const Parameters m = Decode(bytes);
            signed char revoke = -1;
            m.ReadInt8("revoke", revoke);
            all.push_back(StringOf(m, "command") + " " + std::to_string(IntOf(m, "version")) + " " +
                          StringOf(m, "guid") + " " + std::to_string(revoke));
        }
        return all;
    };
    EXPECT_EQ(revokes(first), (Strings{"shared 1 {same} 1", "alpha 1 {b} 1"}));
    EXPECT_EQ(revokes(second), (Strings{"shared 1 {same} 1"}));
}

// A foreign protocol is refused with its text, and makes no call; a disconnect notice ends the
// live calls of its channel in creation order.
TEST_F(DispatchTest, ForeignProtocolAndDisconnectNoticeWithThreeLiveInstancesInCreationOrder) {
    Serve("live");
    NewServer();
    RawNode* raw = NewRaw("raw");
    const Nimbo::NodeId server = raw->Find("server");
    for (int kind = 0; kind < 3; ++kind) {  // "protocol" 2, absent, or of another kind
        Parameters request = RequestMessage("live", "{v}", "beginParameters");
        request.RemoveProperty("protocol");
        if (kind == 0) request.WriteUint8("protocol", 2);
        if (kind == 2) request.WriteInt32("protocol", 1);
        raw->SendBinary(server, request.ToBinary());
    }
    const Strings guids = {"{c}", "{a}", "{b}"};  // out of guid order
    for (const std::string& guid : guids) {
        Parameters request = RequestMessage("live", guid.c_str(), "beginParameters");
        request.WriteInt32("emit", 5);  // an "emit" of another kind leaves a request
        raw->SendBinary(server, request.ToBinary());
    }
    Parameters notice = Bag();
    notice.WriteInt8("disconnect", 0);
    notice.WriteUint8("protocol", 1);
    notice.WriteString("emit", "tick");  // a disconnect notice wins over an emission
    raw->SendBinary(server, notice.ToBinary());
    ASSERT_TRUE(Idle());

    const std::string refused =
        "Tarn : Invalid communication Protocol.\nReceiver version = 1\nSender version = ";
    EXPECT_EQ(errors.Messages(), (Strings{refused + "2", refused + "0", refused + "0"}));
    EXPECT_EQ(monitor.All(), Story("live", guids, {"created", "OnBegin"}) +
                                 Story("live", guids, {"OnDisconnect"}));
    EXPECT_EQ(raw->received.Count(), 0u);  // no answer, no revoke
}

// Requests each sent as one message carrying all three phases: an unknown command, a call whose
// OnBegin throws, and a call served whole. Each is revoked; the node keeps serving.
TEST_F(DispatchTest, OneMessageCarryingAllThreePhases) {
    ScriptedCommand* echo = Serve("echo");
    echo->onBegin = [](Parameters& p, Channel&) -> long {
        if (p.HasOwnTarnProperty("n")) throw std::runtime_error("boom");
        return S_OK;
    };
    echo->onCommand = [](Parameters& p, Channel& channel) {
        return p.IsEmpty() ? S_OK : channel.Answer(p);
    };
    NewServer();
    Node* client = NewClient();
    Answers answers;
    auto call = [&](const char* command, const Parameters& begin, const Parameters& send) {
        EXPECT_EQ(client->CreateRequest(Target(*client), command, 1, answers.Handler())
                      .Send(begin, send, Bag()),
                  S_OK);
    };
    call("nothing", Bag(), Bag());
    call("echo", Numbered(1), Bag());  // throws
    call("echo", Bag(), Numbered(42));
    ASSERT_TRUE(Idle());

    const std::string thrown = echo->calls.At(0).guid, served = echo->calls.At(5).guid;
    EXPECT_EQ(errors.Errors(),
              (std::vector<PublishedError>{
                  {"Unknow Command nothing", "TarnCommandBinder"},
                  {"<echo>::OnBegin() threw an exception, guid <" + thrown + ">: boom",
                   "TarnCommandBinder"}}));
    std::vector<MonitorLine> expected =
        Story("echo", {thrown, served}, {"created", "OnBegin", "OnCommand", "OnEnd", "deleted"});
    std::get<2>(expected[1]) = E_FAIL;  // and no line for the unknown command
    EXPECT_EQ(monitor.All(), expected);
    EXPECT_EQ(echo->Operations(),
              "create begin(...) command end destroy create begin command(...) end destroy");
    EXPECT_EQ(answers.All(), std::vector<int>{42});
    EXPECT_EQ(Pending(*client), 0u);  // all three revoked, the last after its answer
}

TEST_F(DispatchTest, DefaultParametersFillInOrEndAnIncompatibleCallWithOneReport) {
    ScriptedCommand* scale = Serve("scale");
    scale->beginDefaults = new Parameters(Bag());
    scale->beginDefaults->WriteInt32("count", 3);
    scale->beginDefaults->WriteString("label", "none");
    Inbox<std::string> seen;
    scale->onBegin = [&seen](Parameters& p, Channel&) {
        seen.Push(std::to_string(IntOf(p, "count")) + " " + StringOf(p, "label"));
        return S_OK;
    };
    NewServer();
    Node* client = NewClient();
    Parameters incompatible = Bag();
    incompatible.WriteString("count", "seven");
    incompatible.WriteBool("extra", true);
    Parameters compatible = Bag();
    compatible.WriteInt32("count", 7);
    for (const Parameters& begin : {incompatible, compatible}) {
        client->CreateRequest(Target(*client), "scale", 1, Node::Callback(nullptr))
            .Send(begin, Bag(), Bag());
    }
    ASSERT_TRUE(Idle());

    const std::string report =
        "\n--------------------Tarn Parameters ERROR--------------------\n"
        "Command \"scale\" called with parameters incompatible with command's default "
        "parameters\n"
        "Command's callback will not be called\n"
        "Expected Properties =\n"
        "  Expected Property = < label (string) >\n"
        "  Expected Property = < count (int32) >\n"
        "Received Properties =\n"
        "  Received Property < count (string) > \n"
        "  Received Property < extra (bool) > Unknown Property\n"
        "\n"
        "Incorrect typed Properties =\n"
        "  Received Property < count (string) > Expected Type (int32) \n";
    EXPECT_EQ(errors.Errors(), (std::vector<PublishedError>{{report, "TarnCommandBinder"}}));
    // The incompatible call skips its callbacks and later phases; it is deleted and revoked.
    EXPECT_EQ(scale->Operations(), "create destroy create begin(...) command end destroy");
    EXPECT_EQ(seen.All(), (Strings{"7 none"}));
    EXPECT_EQ(Pending(*client), 0u);
}

}  // namespace
}  // namespace Tarn::Testing
