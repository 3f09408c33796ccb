// What client request handles put on the wire, and how the server ends their calls: phases one
// per message, abandon by dropping the last handle, a second Begin, send-only requests.
#include <optional>

#include "Tarn/CommandRequest.h"
#include "Tarn/IterativeRequest.h"
#include "Tarn/NodeId.h"
#include "Tarn/Request.h"
#include "Tarn/Response.h"
#include "hosting/NodeImpl.h"
#include "protocol/ProtocolTesting.h"

namespace Tarn {
namespace Testing {
namespace {

using CommandRequestTest = ProtocolTest;

Parameters Numbered(const Parameters& bag, int n) {
    Parameters p(bag);
    p.WriteInt32("n", n);
    return p;
}

// The "n" of the nested bag of phase `phase`, or -1.
int NumberIn(const Parameters& message, const char* phase) {
    Parameters nested(message);
    return message.ReadParameters(phase, "Parameters", nested) >= 0 ? IntOf(nested, "n") : -1;
}

TEST_F(CommandRequestTest, IterativeBeginSendSendEndTravelsAsFourMessages) {
    RawNode* observer = NewRaw("observer");
    Node* client = NewClient();
    Answers answers;
    IterativeRequest request =
        client->CreateIterativeRequest(Target(*client, "observer"), "stream", 3, answers.Handler());
    EXPECT_EQ(request.Begin(Numbered(Bag(), 1)), S_OK);
    EXPECT_EQ(request.Send(Numbered(Bag(), 2)), S_OK);
    EXPECT_EQ(request.Send(Bag()), S_OK);
    EXPECT_EQ(request.End(Numbered(Bag(), 4)), S_OK);
    EXPECT_EQ(request.Send(Bag()), E_FAIL);  // ended: nothing more is sent
    ASSERT_TRUE(observer->received.WaitForCount(4));
    ASSERT_TRUE(Idle());
    ASSERT_EQ(observer->received.All().size(), 4u);

    std::vector<std::vector<std::string>> phases;
    std::string guid;
    for (const Nimbo::Binary& bytes : observer->received.All()) {
        Parameters m = Decode(bytes);
        EXPECT_EQ(StringOf(m, "command"), "stream");
        EXPECT_EQ(IntOf(m, "version"), 3);
        EXPECT_EQ(KindOf(m, "protocol"), "uint8");
        if (guid.empty()) guid = StringOf(m, "guid");
        EXPECT_EQ(StringOf(m, "guid"), guid);
        phases.push_back(PhaseKinds(m));
    }
    EXPECT_EQ(phases, (std::vector<std::vector<std::string>>{{"Parameters", "", ""},
                                                             {"", "Parameters", ""},
                                                             {"", "uint8", ""},
                                                             {"", "", "Parameters"}}));
    EXPECT_EQ(NumberIn(Decode(observer->received.All()[0]), "beginParameters"), 1);
    EXPECT_EQ(NumberIn(Decode(observer->received.All()[1]), "sendParameters"), 2);
    EXPECT_EQ(NumberIn(Decode(observer->received.All()[3]), "endParameters"), 4);
}

TEST_F(CommandRequestTest, DroppingTheLastIterativeCopyAbandonsTheCall) {
    ScriptedCommand* stream = Serve("stream");
    NewServer();
    Node* client = NewClient();
    std::optional<IterativeRequest> request;
    request.emplace(
        client->CreateIterativeRequest(Target(*client), "stream", 1, Node::Callback(nullptr)));
    EXPECT_EQ(request->Begin(Bag()), S_OK);
    {
        IterativeRequest copy(*request);  // dropping a copy abandons nothing
    }
    ASSERT_TRUE(Idle());
    const std::string guid = stream->CreatedGuid(0);
    EXPECT_EQ(monitor.Lines(), (std::vector<MonitorLine>{Created("stream", guid),
                                                         Called("stream", "OnBegin", guid)}));

    request.reset();
    ASSERT_TRUE(Idle());
    EXPECT_EQ(monitor.Lines(),
              (std::vector<MonitorLine>{Created("stream", guid), Called("stream", "OnBegin", guid),
                                        Deleted("stream", guid)}));
    EXPECT_EQ(stream->Operations(), (std::vector<std::string>{"create", "begin", "destroy"}));
    EXPECT_EQ(NodeInternal::Impl(*client).PendingCount(), 0u);
}

TEST_F(CommandRequestTest, SecondBeginEndsTheCall) {
    ScriptedCommand* stream = Serve("stream");
    NewServer();
    Node* client = NewClient();
    {
        IterativeRequest request =
            client->CreateIterativeRequest(Target(*client), "stream", 1, Node::Callback(nullptr));
        EXPECT_EQ(request.Begin(Bag()), S_OK);
        EXPECT_EQ(request.Begin(Numbered(Bag(), 2)), E_FAIL);
        EXPECT_EQ(request.Send(Bag()), E_FAIL);
    }  // dropping the ended request sends nothing more
    ASSERT_TRUE(Idle());

    const std::string guid = stream->CreatedGuid(0);
    EXPECT_EQ(monitor.Lines(),
              (std::vector<MonitorLine>{Created("stream", guid), Called("stream", "OnBegin", guid),
                                        Called("stream", "OnEnd", guid), Deleted("stream", guid)}));
    EXPECT_EQ(stream->Operations(),
              (std::vector<std::string>{"create", "begin", "end", "destroy"}));
    EXPECT_TRUE(stream->calls.All()[2].parameters->IsEmpty());
    EXPECT_EQ(NodeInternal::Impl(*client).PendingCount(), 0u);
}

TEST_F(CommandRequestTest, DroppingACommandRequestAfterSendsAbandonsIt) {
    RawNode* observer = NewRaw("observer");
    Node* client = NewClient();
    Tarn::NodeId target;
    ASSERT_EQ(client->Select("observer", target), S_OK);
    {
        CommandRequest request{Response()};
        ASSERT_EQ(client->CreateCommandRequest(target, "feed", 1, request), S_OK);
        EXPECT_EQ(request.Send(Numbered(Bag(), 1)), S_OK);
        EXPECT_EQ(request.Send(Bag()), S_OK);
    }
    ASSERT_TRUE(observer->received.WaitForCount(3));
    ASSERT_TRUE(Idle());

    std::vector<std::vector<std::string>> phases;
    for (const Nimbo::Binary& bytes : observer->received.All())
        phases.push_back(PhaseKinds(Decode(bytes)));
    EXPECT_EQ(phases, (std::vector<std::vector<std::string>>{
                          {"", "Parameters", ""}, {"", "uint8", ""}, {"", "", "uint8"}}));
    unsigned char marker = 0;
    EXPECT_EQ(Decode(observer->received.All()[2]).ReadUint8("endParameters", marker), S_OK);
    EXPECT_EQ(marker, 2);
}

}  // namespace
}  // namespace Testing
}  // namespace Tarn
