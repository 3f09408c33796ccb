// How a serving node runs the calls that reach it: instances, phases, revokes, disconnect notices,
// unknown and throwing commands, and the check against in-process default parameters.
#include <stdexcept>

#include "Tarn/Request.h"
#include "hosting/NodeImpl.h"
#include "protocol/ProtocolTesting.h"

namespace Tarn {
namespace Testing {
namespace {

using DispatchTest = ProtocolTest;

TEST_F(DispatchTest, OneMessageCarryingAllThreePhases) {
    ScriptedCommand* echo = Serve("echo");
    echo->onCommand = [](Parameters& p, Channel& channel) { return channel.Answer(p); };
    NewServer();
    Node* client = NewClient();
    Answers answers;
    Request request = client->CreateRequest(Target(*client), "echo", 1, answers.Handler());
    ASSERT_EQ(NodeInternal::Impl(*client).PendingCount(), 1u);

    Parameters sent = Bag();
    sent.WriteInt32("n", 42);
    EXPECT_EQ(request.Send(Bag(), sent, Bag()), S_OK);
    ASSERT_TRUE(Idle());

    const std::string guid = echo->CreatedGuid(0);
    EXPECT_EQ(monitor.Lines(),
              (std::vector<MonitorLine>{Created("echo", guid), Called("echo", "OnBegin", guid),
                                        Called("echo", "OnCommand", guid),
                                        Called("echo", "OnEnd", guid), Deleted("echo", guid)}));
    EXPECT_EQ(echo->Operations(),
              (std::vector<std::string>{"create", "begin", "command", "end", "destroy"}));
    EXPECT_TRUE(echo->calls.All()[1].parameters->IsEmpty());
    EXPECT_TRUE(echo->calls.All()[3].parameters->IsEmpty());
    ASSERT_EQ(answers.Count(), 1u);
    EXPECT_EQ(IntOf(*answers.At(0), "n"), 42);
    // The revoke came back after the answer and removed the pending request.
    EXPECT_EQ(NodeInternal::Impl(*client).PendingCount(), 0u);
    EXPECT_TRUE(errors.Errors().empty());
}

TEST_F(DispatchTest, SameGuidFromTwoChannelsMakesTwoInstances) {
    ScriptedCommand* shared = Serve("shared");
    NewServer();
    RawNode* first = NewRaw("first");
    RawNode* second = NewRaw("second");
    const Nimbo::NodeId server = first->Find("server");

    first->Send(server, RequestMessage("shared", 1, "{same}", "beginParameters"));
    ASSERT_TRUE(shared->calls.WaitForCount(2));
    second->Send(server, RequestMessage("shared", 1, "{same}", "beginParameters"));
    ASSERT_TRUE(shared->calls.WaitForCount(4));
    first->Send(server, RequestMessage("shared", 1, "{same}", "endParameters"));
    second->Send(server, RequestMessage("shared", 1, "{same}", "endParameters"));
    ASSERT_TRUE(Idle());

    EXPECT_EQ(shared->Operations(), (std::vector<std::string>{"create", "begin", "create", "begin",
                                                              "end", "destroy", "end", "destroy"}));
    EXPECT_NE(shared->calls.All()[0].guid, shared->calls.All()[2].guid);  // two channels
    EXPECT_EQ(monitor.Count("created with guid <{same}>"), 2u);
    EXPECT_EQ(monitor.Count("deleted, guid <{same}>"), 2u);
    for (RawNode* raw : {first, second}) {
        ASSERT_EQ(raw->received.All().size(), 1u);
        Parameters revoke = Decode(raw->received.All()[0]);
        EXPECT_EQ(KindOf(revoke, "revoke"), "int8");
        EXPECT_EQ(StringOf(revoke, "guid"), "{same}");
    }
}

TEST_F(DispatchTest, EndOnlyMessageAfterAnotherCommandRevokesWithThePreviousIdentity) {
    Serve("alpha", 1);
    Serve("beta", 2);
    NewServer();
    RawNode* raw = NewRaw("raw");
    const Nimbo::NodeId server = raw->Find("server");

    raw->Send(server, RequestMessage("alpha", 1, "{a}", "beginParameters"));
    raw->Send(server, RequestMessage("beta", 2, "{b}", "endParameters"));
    ASSERT_TRUE(Idle());

    EXPECT_EQ(monitor.Lines(),
              (std::vector<MonitorLine>{Created("alpha", "{a}"), Called("alpha", "OnBegin", "{a}"),
                                        Created("beta", "{b}"), Called("beta", "OnEnd", "{b}"),
                                        Deleted("beta", "{b}")}));
    ASSERT_EQ(raw->received.All().size(), 1u);
    Parameters revoke = Decode(raw->received.All()[0]);
    EXPECT_EQ(StringOf(revoke, "command"), "alpha");
    EXPECT_EQ(IntOf(revoke, "version"), 1);
    EXPECT_EQ(StringOf(revoke, "guid"), "{b}");
    signed char revoked = 0;
    EXPECT_EQ(revoke.ReadInt8("revoke", revoked), S_OK);
    EXPECT_EQ(revoked, 1);
}

TEST_F(DispatchTest, DisconnectNoticeWithThreeLiveInstancesInCreationOrder) {
    Serve("live");
    NewServer();
    RawNode* raw = NewRaw("raw");
    const Nimbo::NodeId server = raw->Find("server");
    // Created out of guid order, so that the order kept is the creation order.
    for (const char* guid : {"{c}", "{a}", "{b}"}) {
        raw->Send(server, RequestMessage("live", 1, guid, "beginParameters"));
    }
    raw->Send(server, DisconnectNotice());
    ASSERT_TRUE(Idle());

    std::vector<MonitorLine> expected;
    for (const char* guid : {"{c}", "{a}", "{b}"}) {
        expected.push_back(Created("live", guid));
        expected.push_back(Called("live", "OnBegin", guid));
    }
    for (const char* guid : {"{c}", "{a}", "{b}"}) {
        expected.push_back(Called("live", "OnDisconnect", guid));
    }
    EXPECT_EQ(monitor.Lines(), expected);
    EXPECT_TRUE(raw->received.All().empty());  // no revoke
}

TEST_F(DispatchTest, UnknownCommandIsPublishedAndStillRevoked) {
    NewServer();
    Node* client = NewClient();
    Answers answers;
    Request request = client->CreateRequest(Target(*client), "nothing", 1, answers.Handler());
    EXPECT_EQ(request.Send(Bag(), Bag(), Bag()), S_OK);
    ASSERT_TRUE(Idle());

    EXPECT_EQ(errors.Errors(),
              (std::vector<PublishedError>{{"Unknow Command nothing", "TarnCommandBinder"}}));
    EXPECT_TRUE(monitor.Lines().empty());
    EXPECT_EQ(NodeInternal::Impl(*client).PendingCount(), 0u);
    EXPECT_EQ(answers.Count(), 0u);
}

TEST_F(DispatchTest, ThrowingCommandIsReportedAndTheNodeKeepsServing) {
    ScriptedCommand* fragile = Serve("fragile");
    fragile->onBegin = [](Parameters& p, Channel& channel) -> long {
        if (p.HasOwnTarnProperty("explode")) throw std::runtime_error("boom");
        Parameters answer(p);
        answer.WriteString("state", "fine");
        return channel.Answer(answer);
    };
    NewServer();
    Node* client = NewClient();
    const Nimbo::NodeId target = Target(*client);
    Answers answers;

    Parameters explode = Bag();
    explode.WriteBool("explode", true);
    client->CreateRequest(target, "fragile", 1, answers.Handler()).Send(explode, Bag(), Bag());
    ASSERT_TRUE(Idle());
    const std::string guid = fragile->CreatedGuid(0);
    EXPECT_EQ(errors.Messages(), (std::vector<std::string>{"<fragile>::OnBegin() threw an "
                                                           "exception, guid <" +
                                                           guid + ">: boom"}));
    EXPECT_EQ(monitor.Lines(),
              (std::vector<MonitorLine>{
                  Created("fragile", guid), Called("fragile", "OnBegin", guid, E_FAIL),
                  Called("fragile", "OnCommand", guid), Called("fragile", "OnEnd", guid),
                  Deleted("fragile", guid)}));

    client->CreateRequest(target, "fragile", 1, answers.Handler()).Send(Bag(), Bag(), Bag());
    ASSERT_TRUE(answers.WaitForCount(1));
    EXPECT_EQ(StringOf(*answers.At(0), "state"), "fine");
    ASSERT_TRUE(Idle());
    EXPECT_EQ(NodeInternal::Impl(*client).PendingCount(), 0u);
}

// --- In-process default parameters -------------------------------------------------------------

class DefaultParametersTest : public ProtocolTest {
protected:
    // "count" (int32 3) and "label" (string "none") for the begin phase.
    ScriptedCommand* ServeWithDefaults() {
        ScriptedCommand* scaled = Serve("scale");
        scaled->beginDefaults = new Parameters(Bag());
        scaled->beginDefaults->WriteInt32("count", 3);
        scaled->beginDefaults->WriteString("label", "none");
        NewServer();
        return scaled;
    }
};

TEST_F(DefaultParametersTest, CompatibleParametersAreReadThroughTheDefaults) {
    ScriptedCommand* scaled = ServeWithDefaults();
    int count = 0;
    std::string label;
    scaled->onBegin = [&](Parameters& p, Channel&) {
        count = IntOf(p, "count");
        label = StringOf(p, "label");
        return S_OK;
    };
    Node* client = NewClient();
    Parameters begin = Bag();
    begin.WriteInt32("count", 7);
    client->CreateRequest(Target(*client), "scale", 1, Node::Callback(nullptr))
        .Send(begin, Bag(), Bag());
    ASSERT_TRUE(Idle());

    EXPECT_EQ(count, 7);
    EXPECT_EQ(label, "none");
    EXPECT_EQ(scaled->Operations(),
              (std::vector<std::string>{"create", "begin", "command", "end", "destroy"}));
    EXPECT_TRUE(errors.Errors().empty());
}

TEST_F(DefaultParametersTest, IncompatibleParametersEndTheCallWithOneReport) {
    ScriptedCommand* scaled = ServeWithDefaults();
    Node* client = NewClient();
    Parameters begin = Bag();
    begin.WriteString("count", "seven");
    begin.WriteBool("extra", true);
    client->CreateRequest(Target(*client), "scale", 1, Node::Callback(nullptr))
        .Send(begin, Bag(), Bag());
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
    // The callback and the later phases are skipped; the call is deleted and revoked.
    const std::string guid = scaled->CreatedGuid(0);
    EXPECT_EQ(monitor.Lines(),
              (std::vector<MonitorLine>{Created("scale", guid), Deleted("scale", guid)}));
    EXPECT_EQ(scaled->Operations(), (std::vector<std::string>{"create", "destroy"}));
    EXPECT_EQ(NodeInternal::Impl(*client).PendingCount(), 0u);
}

}  // namespace
}  // namespace Testing
}  // namespace Tarn
