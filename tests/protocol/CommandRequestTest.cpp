// What client request handles put on the wire, how the serving node ends their calls, and the
// guids they carry.
#include "protocol/ProtocolTesting.h"

namespace Tarn::Testing {
namespace {

// Four calls of "stream" version 3 from `client` to `to`: a whole iterative call, one ended by a
// second Begin, one abandoned by dropping its last handle, and a dropped CommandRequest.
class CommandRequestTest : public ProtocolTest {
protected:
    void Drive(Node& client, const Tarn::NodeId& to) {
        auto iterative = [&] {
            return client.CreateIterativeRequest(to, "stream", 3, Node::Callback(nullptr));
        };
        {
            IterativeRequest request = iterative();
            EXPECT_EQ(request.Begin(Numbered(1)), S_OK);
            EXPECT_EQ(request.Send(Numbered(2)), S_OK);
            EXPECT_EQ(request.Send(Bag()), S_OK);
            EXPECT_EQ(request.End(Numbered(4)), S_OK);
            EXPECT_EQ(request.Send(Bag()), E_FAIL);  // ended: nothing more is sent
        }
        {
            IterativeRequest request = iterative();
            EXPECT_EQ(request.Begin(Numbered(1)), S_OK);
            EXPECT_EQ(request.Begin(Numbered(2)), E_FAIL);  // ends the call, without these
            EXPECT_EQ(request.Send(Bag()), E_FAIL);
        }
        {
            IterativeRequest request = iterative();
            EXPECT_EQ(request.Begin(Numbered(1)), S_OK);
            { IterativeRequest copy(request); }  // dropping a copy abandons nothing
            EXPECT_EQ(request.Send(Numbered(2)), S_OK);
        }
        CommandRequest request{Response()};
        ASSERT_EQ(client.CreateCommandRequest(to, "stream", 3, request), S_OK);
        EXPECT_EQ(request.Send(Numbered(1)), S_OK);
        EXPECT_EQ(request.Send(Bag()), S_OK);
    }
};

// The phases of a request message: initial and the "n" of its bag ("b1"), or initial, '#' and
// the marker of a phase without parameters ("e#2").
std::string Phases(const Parameters& message) {
    std::string phases;
    for (const char* phase : {"beginParameters", "sendParameters", "endParameters"}) {
        Parameters bag(message);
        unsigned char marker = 0;
        if (message.ReadParameters(phase, "Parameters", bag) >= 0) {
            phases += phase[0] + std::to_string(IntOf(bag, "n"));
        } else if (message.ReadUint8(phase, marker) >= 0) {
            phases += phase[0] + ("#" + std::to_string(marker));
        }
    }
    return phases;
}

TEST_F(CommandRequestTest, EachPhaseTravelsAloneAndADroppedHandleAbandonsItsCall) {
    RawNode* observer = NewRaw("observer");
    Node* client = NewClient();
    Tarn::NodeId to;
    ASSERT_EQ(client->Select("observer", to), S_OK);
    std::srand(5);  // making requests leaves the application's random sequence alone
    const int random = std::rand();
    std::srand(5);
    Drive(*client, to);
    EXPECT_EQ(std::rand(), random);
    ASSERT_TRUE(observer->received.WaitForCount(12));
    ASSERT_TRUE(Idle());

    // Each message: the ordinal of its guid among those seen, then its phases.
    std::map<std::string, std::size_t> guids;
    Strings messages;
    for (const Nimbo::Binary& bytes : observer->received.All()) {
        Parameters m = Decode(bytes);
        EXPECT_EQ(StringOf(m, "command") + " " + std::to_string(IntOf(m, "version")) + " " +
                      KindOf(m, "protocol"),
                  "stream 3 uint8");
        const std::size_t guid = guids.emplace(StringOf(m, "guid"), guids.size()).first->second;
        messages.push_back(std::to_string(guid) + Phases(m));
    }
    EXPECT_EQ(messages, (Strings{"0b1", "0s2", "0s#1", "0e4", "1b1", "1e#1", "2b1", "2s2", "2e#2",
                                 "3s1", "3s#1", "3e#2"}));
}

TEST_F(CommandRequestTest, ServerEndsOrAbandonsEachCallAndDisconnectsLiveOnes) {
    ScriptedCommand* stream = Serve("stream", 3);
    NewServer();
    Node* client = NewClient();
    Tarn::NodeId to;
    ASSERT_EQ(client->Select("server", to), S_OK);
    Drive(*client, to);
    IterativeRequest live =
        client->CreateIterativeRequest(to, "stream", 3, Node::Callback(nullptr));
    EXPECT_EQ(live.Begin(Bag()), S_OK);
    ASSERT_TRUE(Idle());
    EXPECT_EQ(Pending(*client), 1u);  // the ended calls were revoked
    client->Stop();                   // its selections are disconnected
    ASSERT_TRUE(Idle());

    EXPECT_EQ(stream->Operations(),
              "create begin(...) command(...) command end(...) destroy "
              "create begin(...) end destroy "
              "create begin(...) command(...) destroy "  // abandoned: no end
              "create command(...) command destroy "     // abandoned too
              "create begin disconnect destroy");
}

TEST(CommandGuidTest, DistinctThirtyEightCharacterTexts) {
    const std::regex format("\\{[0-9a-f]{8}-[0-9a-f]{4}-[0-9a-f]{4}-[0-9a-f]{4}-[0-9a-f]{12}\\}");
    std::set<std::string> seen;
    for (int i = 0; i < 1000; ++i) {
        const std::string guid = Protocol::MakeGuid().str();
        ASSERT_TRUE(std::regex_match(guid, format)) << guid;
        seen.insert(guid);
    }
    EXPECT_EQ(seen.size(), 1000u);
}

}  // namespace
}  // namespace Tarn::Testing
