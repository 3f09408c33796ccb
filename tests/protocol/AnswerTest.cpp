// How answers travel back: domains of a Message to per-domain callbacks, a Message to a plain
// function, a late answer given from another thread, and a callback that throws.
#include <gmock/gmock.h>

#include <memory>
#include <stdexcept>
#include <thread>

#include "Tarn/CommandInterface.h"
#include "Tarn/CommandRequest.h"
#include "Tarn/IterativeRequest.h"
#include "Tarn/Message.h"
#include "Tarn/NodeId.h"
#include "Tarn/Request.h"
#include "Tarn/Response.h"
#include "hosting/NodeImpl.h"
#include "protocol/ProtocolTesting.h"

namespace Tarn {
namespace Testing {
namespace {

// Answers every send phase with a Message whose domains "b", "a" and "c" each hold "n" (2, 1, 3),
// written out of order.
class DomainAnswerer : public CommandInterface {
public:
    explicit DomainAnswerer(Node& node) : node_(node) {}
    long OnBegin(Parameters&, Channel&) override { return S_OK; }
    long OnCommand(Parameters&, Channel& channel) override {
        return channel.Answer(DomainsMessage(node_, {{"b", 2}, {"a", 1}, {"c", 3}}));
    }
    long OnEnd(Parameters&, Channel&) override { return S_OK; }
    long OnDisconnect() override { return S_OK; }

private:
    Node& node_;
};

class AnswerTest : public ProtocolTest {
protected:
    void SetUp() override {
        ASSERT_EQ(commands.GetPool("server").RegisterCommand(
                      "domains", 1, [](Node& node) { return new DomainAnswerer(node); }),
                  S_OK);
        NewServer();
        client = NewClient();
        ASSERT_EQ(client->Select("server", target), S_OK);
    }

    // A callback that records "<domain>=<n>".
    Response::Callback Recording(const std::string& domain) {
        return [this, domain](const Parameters& p) {
            calls.Push(domain + "=" + std::to_string(IntOf(p, "n")));
            return 0L;
        };
    }

    Node* client = nullptr;
    Tarn::NodeId target;
    Inbox<std::string> calls;
};

TEST_F(AnswerTest, DomainsReachTheirCallbacksInAscendingOrder) {
    Response response;
    response.AddFallbackCallback("b", Recording("b"));
    response.AddCallback("a", Recording("a"));
    response.AddFallbackCallback("a", Recording("fallback a"));  // the first table wins
    {
        CommandRequest request(response);
        ASSERT_EQ(client->CreateCommandRequest(target, "domains", 1, request), S_OK);
        EXPECT_EQ(request.Send(Bag()), S_OK);
    }
    ASSERT_TRUE(Idle());
    // "c" has no callback and is skipped.
    EXPECT_EQ(calls.All(), (std::vector<std::string>{"a=1", "b=2"}));
    EXPECT_EQ(NodeInternal::Impl(*client).PendingCount(), 0u);
    EXPECT_TRUE(errors.Errors().empty());
}

Answers* plainAnswers = nullptr;
long RecordPlainAnswer(Node&, const Parameters& p) {
    plainAnswers->Push(std::make_shared<Parameters>(p));
    return 0;
}

TEST_F(AnswerTest, PlainFunctionReceivesAMessageAsOneCallHoldingItsDomains) {
    Answers answers;
    plainAnswers = &answers;
    client->CreateRequest(target, "domains", 1, &RecordPlainAnswer).Send(Bag(), Bag(), Bag());
    ASSERT_TRUE(Idle());

    ASSERT_EQ(answers.Count(), 1u);
    const Parameters& params = *answers.At(0);
    std::vector<ZelUnicodeString> names;
    EXPECT_EQ(params.ReadStringArray("domainNames", names), S_OK);
    EXPECT_EQ(names, (std::vector<ZelUnicodeString>{"a", "b", "c"}));
    Parameters domains(params);
    ASSERT_EQ(params.ReadParameters("domains", "Parameters", domains), S_OK);
    for (const char* name : {"a", "b", "c"}) {
        EXPECT_EQ(KindOf(domains, name), "Parameters") << name;
    }
}

TEST_F(AnswerTest, ThrowingCallbacksAreReportedAndTheClientKeepsWorking) {
    Response response;
    response.AddCallback("a", [](const Parameters&) -> long { throw std::runtime_error("oops"); });
    response.AddCallback("b", Recording("b"));
    {
        CommandRequest request(response);
        ASSERT_EQ(client->CreateCommandRequest(target, "domains", 1, request), S_OK);
        EXPECT_EQ(request.Send(Bag()), S_OK);
        ASSERT_TRUE(Idle());
    }
    EXPECT_EQ(
        errors.Messages(),
        (std::vector<std::string>{"Response callback of domain <a> threw an exception: oops"}));
    EXPECT_EQ(calls.All(), (std::vector<std::string>{"b=2"}));  // the other domain still called

    errors.Clear();
    client
        ->CreateRequest(target, "domains", 1, Node::Callable([](const Parameters&) -> long {
                            throw std::runtime_error("handler oops");
                        }))
        .Send(Bag(), Bag(), Bag());
    ASSERT_TRUE(Idle());
    ASSERT_EQ(errors.Messages().size(), 1u);
    EXPECT_THAT(errors.Messages()[0],
                ::testing::MatchesRegex("Answer handler of request <\\{.*\\}> threw an "
                                        "exception: handler oops"));

    // The client node survived both and is still answered.
    Answers answers;
    client->CreateRequest(target, "domains", 1, answers.Handler()).Send(Bag(), Bag(), Bag());
    ASSERT_TRUE(answers.WaitForCount(1));
    ASSERT_TRUE(Idle());
    EXPECT_EQ(NodeInternal::Impl(*client).PendingCount(), 0u);
}

// The mended fault: an answer given later, from another thread, after the serving node received
// another request, reaches the caller of the request the Channel was made for.
using ChannelTest = ProtocolTest;

TEST_F(ChannelTest, LateAnswerFromAnotherThreadReachesTheFirstCaller) {
    ScriptedCommand* slow = Serve("slow");
    Inbox<std::shared_ptr<Channel>> kept;
    slow->onBegin = [&kept](Parameters& p, Channel& channel) -> long {
        if (p.HasOwnTarnProperty("first")) {
            kept.Push(std::make_shared<Channel>(channel));
            return S_OK;
        }
        Parameters answer(p);
        answer.WriteString("who", "second");
        return channel.Answer(answer);
    };
    NewServer();
    Node* firstClient = NewClient();
    Node* secondClient = NewClient();
    Answers firstAnswers;
    Answers secondAnswers;

    IterativeRequest first = firstClient->CreateIterativeRequest(Target(*firstClient), "slow", 1,
                                                                 firstAnswers.Handler());
    Parameters marked = Bag();
    marked.WriteBool("first", true);
    ASSERT_EQ(first.Begin(marked), S_OK);
    ASSERT_TRUE(kept.WaitForCount(1));
    std::shared_ptr<Channel> firstChannel = kept.All()[0];

    secondClient->CreateRequest(Target(*secondClient), "slow", 1, secondAnswers.Handler())
        .Send(Bag(), Bag(), Bag());
    ASSERT_TRUE(secondAnswers.WaitForCount(1));
    ASSERT_TRUE(Idle());

    long answered = E_FAIL;
    std::thread late([&] {
        Parameters answer = Bag();
        answer.WriteString("who", "late");
        answered = firstChannel->Answer(answer);
    });
    late.join();
    EXPECT_EQ(answered, S_OK);
    ASSERT_TRUE(firstAnswers.WaitForCount(1));
    ASSERT_TRUE(Idle());
    EXPECT_EQ(StringOf(*firstAnswers.At(0), "who"), "late");
    EXPECT_EQ(secondAnswers.Count(), 1u);
    EXPECT_EQ(StringOf(*secondAnswers.At(0), "who"), "second");

    EXPECT_EQ(first.End(Bag()), S_OK);
    ASSERT_TRUE(Idle());
    EXPECT_EQ(NodeInternal::Impl(*firstClient).PendingCount(), 0u);
}

}  // namespace
}  // namespace Testing
}  // namespace Tarn
