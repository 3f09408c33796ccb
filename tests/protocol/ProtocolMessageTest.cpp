// Messages as a receiving node tells them apart: the protocol version check, the order of the
// classification, and the request guids.
#include <cstdlib>
#include <regex>
#include <set>

#include "Tarn/Request.h"
#include "protocol/ProtocolMessage.h"
#include "protocol/ProtocolTesting.h"

namespace Tarn {
namespace Testing {
namespace {

struct ForeignVersion {
    const char* what;
    std::function<void(Parameters&)> writeProtocol;
    const char* senderVersion;
};

class VersionCheckTest : public ProtocolTest,
                         public ::testing::WithParamInterface<ForeignVersion> {};

TEST_P(VersionCheckTest, ForeignProtocolIsRefusedWithItsText) {
    ScriptedCommand* echo = Serve("echo");
    NewServer();
    RawNode* raw = NewRaw("raw");
    Parameters request = RequestMessage("echo", 1, "{v}", "beginParameters");
    request.RemoveProperty("protocol");
    GetParam().writeProtocol(request);
    raw->Send(raw->Find("server"), request);
    ASSERT_TRUE(Idle());

    EXPECT_EQ(errors.Messages(),
              (std::vector<std::string>{std::string("Tarn : Invalid communication Protocol.\n"
                                                    "Receiver version = 1\nSender version = ") +
                                        GetParam().senderVersion}));
    EXPECT_TRUE(monitor.Lines().empty());
    EXPECT_TRUE(echo->calls.All().empty());
    EXPECT_TRUE(raw->received.All().empty());  // no answer, no revoke
}

INSTANTIATE_TEST_SUITE_P(
    Versions, VersionCheckTest,
    ::testing::Values(
        ForeignVersion{"Two", [](Parameters& m) { m.WriteUint8("protocol", 2); }, "2"},
        ForeignVersion{"Missing", [](Parameters&) {}, "0"},
        ForeignVersion{"AnotherKind", [](Parameters& m) { m.WriteInt32("protocol", 1); }, "0"}),
    [](const ::testing::TestParamInfo<ForeignVersion>& info) { return info.param.what; });

using ClassificationTest = ProtocolTest;

TEST_F(ClassificationTest, EmitOfAnotherKindLeavesARequest) {
    ScriptedCommand* echo = Serve("echo");
    NewServer();
    RawNode* raw = NewRaw("raw");
    Parameters request = RequestMessage("echo", 1, "{e}", "beginParameters");
    request.WriteInt32("emit", 5);
    raw->Send(raw->Find("server"), request);
    ASSERT_TRUE(Idle());
    EXPECT_EQ(echo->Operations(), (std::vector<std::string>{"create", "begin"}));
}

TEST_F(ClassificationTest, DisconnectWinsOverEmit) {
    Serve("echo");
    NewServer();
    RawNode* raw = NewRaw("raw");
    const Nimbo::NodeId server = raw->Find("server");
    raw->Send(server, RequestMessage("echo", 1, "{d}", "beginParameters"));
    Parameters both = DisconnectNotice();
    both.WriteString("emit", "tick");
    raw->Send(server, both);
    ASSERT_TRUE(Idle());
    EXPECT_EQ(monitor.Lines(),
              (std::vector<MonitorLine>{Created("echo", "{d}"), Called("echo", "OnBegin", "{d}"),
                                        Called("echo", "OnDisconnect", "{d}")}));
}

using GuidTest = ProtocolTest;

TEST_F(GuidTest, ThirtyEightCharactersOfLowercaseHexAndAllDistinct) {
    const std::regex format("\\{[0-9a-f]{8}-[0-9a-f]{4}-[0-9a-f]{4}-[0-9a-f]{4}-[0-9a-f]{12}\\}");
    std::set<std::string> seen;
    for (int i = 0; i < 1000; ++i) {
        const std::string guid = Protocol::MakeGuid().str();
        ASSERT_EQ(guid.size(), 38u) << guid;
        ASSERT_TRUE(std::regex_match(guid, format)) << guid;
        seen.insert(guid);
    }
    EXPECT_EQ(seen.size(), 1000u);
}

TEST_F(GuidTest, RequestsLeaveTheApplicationsRandomSequenceAlone) {
    Serve("echo");
    NewServer();
    Node* client = NewClient();
    const Nimbo::NodeId target = Target(*client);
    std::srand(5);
    const int expected = std::rand();
    std::srand(5);
    for (int i = 0; i < 3; ++i) client->CreateRequest(target, "echo", 1, Node::Callback(nullptr));
    EXPECT_EQ(std::rand(), expected);
}

}  // namespace
}  // namespace Testing
}  // namespace Tarn
