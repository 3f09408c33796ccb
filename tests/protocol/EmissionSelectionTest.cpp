// Events between nodes and the selection of a serving node.
#include <memory>

#include "Tarn/IterativeRequest.h"
#include "Tarn/Message.h"
#include "Tarn/Response.h"
#include "protocol/ProtocolTesting.h"

namespace Tarn {
namespace Testing {
namespace {

Inbox<int>* ticks = nullptr;
long RecordTick(Node&, const Parameters& p) {
    ticks->Push(IntOf(p, "n"));
    return 0;
}

using EmissionTest = ProtocolTest;

TEST_F(EmissionTest, EmissionReachesFunctionAndResponseSubscribers) {
    Inbox<int> tickNumbers;
    ticks = &tickNumbers;
    Inbox<std::string> domainCalls;
    Response response;
    for (const char* domain : {"a", "b"}) {
        response.AddCallback(domain, [&, domain](const Parameters& p) {
            domainCalls.Push(std::string(domain) + "=" + std::to_string(IntOf(p, "n")));
            return 0L;
        });
    }
    Node* emitter = commands.GetPool("emitter").CreateCallbackNode();
    Node* byFunction = NewClient();
    Node* byResponse = NewClient();
    ASSERT_EQ(byFunction->Subscribe(Target(*byFunction, "emitter"), "tick", &RecordTick), S_OK);
    ASSERT_EQ(byResponse->Subscribe(Target(*byResponse, "emitter"), "tick", response), S_OK);

    Parameters plain = Bag();
    plain.WriteInt32("n", 5);
    EXPECT_EQ(emitter->Emit("tick", plain), S_OK);
    ASSERT_TRUE(Idle());
    // A Response takes domains only: a plain event calls none of its callbacks.
    EXPECT_EQ(tickNumbers.All(), (std::vector<int>{5}));
    EXPECT_TRUE(domainCalls.All().empty());

    EXPECT_EQ(emitter->Emit("tick", DomainsMessage(*emitter, {{"b", 2}, {"a", 1}})), S_OK);
    EXPECT_EQ(emitter->Emit("tick", emitter->CreateMessage()), E_FAIL);  // no domain
    ASSERT_TRUE(Idle());
    // A plain function takes "Params" only: an emitted Message does not reach it.
    EXPECT_EQ(tickNumbers.All(), (std::vector<int>{5}));
    EXPECT_EQ(domainCalls.All(), (std::vector<std::string>{"a=1", "b=2"}));
    EXPECT_TRUE(errors.Errors().empty());
}

using SelectionTest = ProtocolTest;

TEST_F(SelectionTest, EmptyOrUnservedPoolNameIsRefused) {
    NewServer();
    Node* client = NewClient();
    Nimbo::NodeId id;
    EXPECT_EQ(client->Select("", id), E_FAIL);
    EXPECT_EQ(client->Select("", id, Nimbo::Criterion::LeastLoaded()), E_FAIL);
    EXPECT_EQ(client->Select("nobody", id), E_FAIL);
    EXPECT_EQ(id.GetStatus(), 0);
    EXPECT_EQ(client->Select("server", id), S_OK);
    EXPECT_NE(id.GetStatus(), 0);
}

TEST_F(SelectionTest, StoppingTheSelectingNodeDisconnectsItsLiveCalls) {
    ScriptedCommand* stream = Serve("stream");
    NewServer();
    Node* client = NewClient();
    IterativeRequest request =
        client->CreateIterativeRequest(Target(*client), "stream", 1, Node::Callback(nullptr));
    ASSERT_EQ(request.Begin(Bag()), S_OK);
    ASSERT_TRUE(Idle());
    client->Stop();
    ASSERT_TRUE(Idle());

    const std::string guid = stream->CreatedGuid(0);
    EXPECT_EQ(monitor.Lines(),
              (std::vector<MonitorLine>{Created("stream", guid), Called("stream", "OnBegin", guid),
                                        Called("stream", "OnDisconnect", guid)}));
    EXPECT_EQ(stream->Operations(),
              (std::vector<std::string>{"create", "begin", "disconnect", "destroy"}));
}

}  // namespace
}  // namespace Testing
}  // namespace Tarn
