// How answers and events travel back: domains of a Message to per-domain callbacks or to a plain
// function, throwing callbacks, a late answer from another thread, emissions, and selection.
#include "protocol/ProtocolTesting.h"

namespace Tarn::Testing {
namespace {

// A Message whose domains each hold "n", written in the order given.
Message DomainsMessage(Node& node, std::initializer_list<std::pair<const char*, int>> ns) {
    Message message = node.CreateMessage();
    for (const auto& domain : ns) {
        Parameters p = node.CreateParameters();
        p.WriteInt32("n", domain.second);
        message.AnswerDomain(domain.first, p);
    }
    return message;
}

// A callback recording "<name>=<n>" into `calls`.
Response::Callback Recording(Inbox<std::string>& calls, const std::string& name) {
    return [&calls, name](const Parameters& p) {
        calls.Push(name + "=" + std::to_string(IntOf(p, "n")));
        return 0L;
    };
}

// Command "domains" answers its send phase with domains "c", "a", "d", "b" holding 3, 1, 4, 2.
class AnswerTest : public ProtocolTest {
protected:
    void SetUp() override {
        domains = Serve("domains");
        server = NewServer();
        domains->onCommand = [this](Parameters&, Channel& channel) {
            return channel.Answer(
                DomainsMessage(*server, {{"c", 3}, {"a", 1}, {"d", 4}, {"b", 2}}));
        };
        client = NewClient();
        ASSERT_EQ(client->Select("server", target), S_OK);
    }
    ScriptedCommand* domains = nullptr;
    Node* server = nullptr;
    Node* client = nullptr;
    Tarn::NodeId target;
};

Inbox<std::shared_ptr<Parameters>>* plain = nullptr;  // copies of what RecordPlain receives
long RecordPlain(Node&, const Parameters& p) {
    plain->Push(std::make_shared<Parameters>(p));
    return 0;
}

// Domains reach the callbacks of a Response in ascending order, past a throwing one; a plain
// function receives the Message as one call; a throwing handler is reported.
TEST_F(AnswerTest, DomainsReachResponseCallbacksInAscendingOrderOrAPlainFunctionAsOneCall) {
    Inbox<std::string> calls;
    Response response;
    response.AddCallback("a", Recording(calls, "a"));
    response.AddFallbackCallback("a", Recording(calls, "fallback a"));  // the first table wins
    response.AddCallback("b", [](const Parameters&) -> long { throw std::runtime_error("oops"); });
    response.AddFallbackCallback("c", Recording(calls, "c"));  // and "d" has no callback
    {
        CommandRequest request(response);
        ASSERT_EQ(client->CreateCommandRequest(target, "domains", 1, request), S_OK);
        EXPECT_EQ(request.Send(Bag()), S_OK);
    }
    client
        ->CreateRequest(target, "domains", 1, Node::Callable([](const Parameters&) -> long {
                            throw std::runtime_error("handler oops");
                        }))
        .Send(Bag(), Bag(), Bag());
    Inbox<std::shared_ptr<Parameters>> answers;
    plain = &answers;
    client->CreateRequest(target, "domains", 1, &RecordPlain).Send(Bag(), Bag(), Bag());
    ASSERT_TRUE(Idle());

    EXPECT_EQ(calls.All(), (Strings{"a=1", "c=3"}));
    EXPECT_THAT(errors.Messages(),
                ::testing::ElementsAre(
                    "Response callback of domain <b> threw an exception: oops",
                    ::testing::MatchesRegex(
                        "Answer handler of request <\\{.*\\}> threw an exception: handler oops")));
    ASSERT_EQ(answers.Count(), 1u);
    const Parameters& params = *answers.At(0);
    std::vector<ZelUnicodeString> names;
    EXPECT_EQ(params.ReadStringArray("domainNames", names), S_OK);
    EXPECT_EQ(names, (std::vector<ZelUnicodeString>{"a", "b", "c", "d"}));
    Parameters domains(params);
    ASSERT_EQ(params.ReadParameters("domains", "Parameters", domains), S_OK);
    for (const char* name : {"a", "b", "c", "d"}) EXPECT_EQ(KindOf(domains, name), "Parameters");
    EXPECT_EQ(Pending(*client), 0u);
}

TEST_F(AnswerTest, SelectedEmitterReachesFunctionAndResponseSubscribers) {
    Inbox<std::shared_ptr<Parameters>> byFunction;
    plain = &byFunction;
    Inbox<std::string> calls;
    Response response;
    for (const char* domain : {"a", "b"}) response.AddCallback(domain, Recording(calls, domain));
    Node* other = NewClient();
    ASSERT_EQ(other->Subscribe(Target(*other), "tick", &RecordPlain), S_OK);
    ASSERT_EQ(client->Subscribe(target, "tick", response), S_OK);
    Nimbo::NodeId none;  // selection refuses an empty or unserved pool name
    EXPECT_EQ(other->Select("", none), E_FAIL);
    EXPECT_EQ(other->Select("", none, Nimbo::Criterion::LeastLoaded()), E_FAIL);
    EXPECT_EQ(other->Select("nobody", none), E_FAIL);
    EXPECT_EQ(none.GetStatus(), 0);

    EXPECT_EQ(server->Emit("tick", Numbered(5)), S_OK);
    EXPECT_EQ(server->Emit("tick", DomainsMessage(*server, {{"b", 2}, {"a", 1}})), S_OK);
    EXPECT_EQ(server->Emit("tick", server->CreateMessage()), E_FAIL);  // no domain
    ASSERT_TRUE(Idle());
    // A plain function takes "Params" only, a Response domains only.
    ASSERT_EQ(byFunction.Count(), 1u);
    EXPECT_EQ(IntOf(*byFunction.At(0), "n"), 5);
    EXPECT_EQ(calls.All(), (Strings{"a=1", "b=2"}));
    EXPECT_TRUE(errors.Errors().empty());
}

// An answer given later, from another thread, after the serving node received another request,
// reaches the caller of the request the Channel was made for.
TEST_F(AnswerTest, LateAnswerFromAnotherThreadReachesTheFirstCaller) {
    Inbox<std::shared_ptr<Channel>> kept;
    domains->onBegin = [&](Parameters& p, Channel& channel) -> long {
        if (!p.HasOwnTarnProperty("n")) return channel.Answer(Numbered(2));
        kept.Push(std::make_shared<Channel>(channel));  // answered later
        return S_OK;
    };
    Node* secondClient = NewClient();
    Answers firstAnswers, secondAnswers;
    IterativeRequest first =
        client->CreateIterativeRequest(target, "domains", 1, firstAnswers.Handler());
    ASSERT_EQ(first.Begin(Numbered(1)), S_OK);
    ASSERT_TRUE(kept.WaitForCount(1));
    IterativeRequest second = secondClient->CreateIterativeRequest(Target(*secondClient), "domains",
                                                                   1, secondAnswers.Handler());
    ASSERT_EQ(second.Begin(Bag()), S_OK);
    ASSERT_TRUE(secondAnswers.WaitForCount(1));
    ASSERT_TRUE(Idle());

    std::thread([&] { EXPECT_EQ(kept.At(0)->Answer(Numbered(1)), S_OK); }).join();
    ASSERT_TRUE(firstAnswers.WaitForCount(1));
    EXPECT_EQ(firstAnswers.All(), std::vector<int>{1});
    EXPECT_EQ(secondAnswers.All(), std::vector<int>{2});
}

}  // namespace
}  // namespace Tarn::Testing
