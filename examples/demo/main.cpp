// tarn_demo: a first look at Parameters, the typed property bag that commands exchange.
//
// It makes a kernel context and the type registry every bag is bound to, writes a few kinds of
// properties, reads them back, renders the bag as JSON, then reads a property that is not there:
// the read fails with a negative result, and the library publishes why through the kernel. The
// kernel's default error listener prints that text to stderr:
//
//   TarnCommandBinder: Parameters::ReadInt32() unknown property <missing>
//
// Then it serves a command: a server node of the pool "greeter" serves the in-process command
// "greet", version 1; a client node selects a node of that pool by name, subscribes to the
// server's "greeted" event and calls the command in three phases (begin, send, end). The server
// answers each phase and emits the event at the end; the client prints what arrives.
//
// Exit status 0 when every value came back as written, the missing read failed, and every answer
// and the event arrived.
#include <chrono>
#include <condition_variable>
#include <iostream>
#include <mutex>
#include <vector>

#include "TarnCommandBinder.h"

namespace {

int failures = 0;

void Check(bool ok, const char* what) {
    if (!ok) {
        std::cerr << "tarn_demo: " << what << " failed\n";
        ++failures;
    }
}

void ParametersTour() {
    Nimbo::Context context;
    Tarn::Types types(context);
    Tarn::Parameters parameters = types.CreateParameters();

    const std::vector<double> samples{1.5, 2.25, -3.0};
    Check(parameters.WriteString("name", "demo \xC3\xA9t\xC3\xA9") == S_OK, "WriteString");
    Check(parameters.WriteInt32("count", 42) == S_OK, "WriteInt32");
    Check(parameters.WriteDouble("ratio", 0.75) == S_OK, "WriteDouble");
    Check(parameters.WriteDoubleArray("samples", samples) == S_OK, "WriteDoubleArray");

    ZelUnicodeString name;
    int count = 0;
    double ratio = 0;
    std::vector<double> readSamples;
    Check(parameters.ReadString("name", name) == S_OK && name == "demo \xC3\xA9t\xC3\xA9",
          "ReadString");
    Check(parameters.ReadInt32("count", count) == S_OK && count == 42, "ReadInt32");
    Check(parameters.ReadDouble("ratio", ratio) == S_OK && ratio == 0.75, "ReadDouble");
    Check(parameters.ReadDoubleArray("samples", readSamples) == S_OK && readSamples == samples,
          "ReadDoubleArray");

    std::cout << "name    (string)   = " << name << "\n";
    std::cout << "count   (int32)    = " << count << "\n";
    std::cout << "ratio   (double)   = " << ratio << "\n";
    std::cout << "samples (double[]) = [";
    for (std::size_t i = 0; i < readSamples.size(); ++i) {
        std::cout << (i == 0 ? "" : ", ") << readSamples[i];
    }
    std::cout << "]\n";

    ZelUnicodeString json;
    Check(parameters.ToJSON(json) >= 0, "ToJSON");
    std::cout << "as JSON: " << json << std::endl;  // flushed: stderr comes next

    // Not there: a negative result, and the reason goes to the error listener (stderr).
    int missing = 0;
    const long result = parameters.ReadInt32("missing", missing);
    std::cout << "ReadInt32(\"missing\") returned " << (result < 0 ? "a failure" : "success")
              << " (" << result << ")" << std::endl;
    Check(result < 0, "reading a missing property");

}

// The served command: one instance per call, answering every phase on its channel.
class Greet : public Tarn::CommandInterface {
public:
    explicit Greet(Tarn::Node& node) : node_(node) {}

    long OnBegin(Tarn::Parameters& p, Tarn::Channel& channel) override {
        p.ReadString("who", who_);
        return Reply(channel, "hello " + who_);
    }
    long OnCommand(Tarn::Parameters& p, Tarn::Channel& channel) override {
        int times = 0;
        p.ReadInt32("times", times);
        return Reply(channel, "greeting " + who_ + " " +
                                  ZelUnicodeString().BuildFromNum(times, "%d") + " times");
    }
    long OnEnd(Tarn::Parameters&, Tarn::Channel& channel) override {
        long result = Reply(channel, "goodbye " + who_);
        Tarn::Parameters event = node_.CreateParameters();
        event.WriteString("who", who_);
        node_.Emit("greeted", event);
        return result;
    }
    long OnDisconnect() override { return S_OK; }

private:
    long Reply(Tarn::Channel& channel, const ZelUnicodeString& text) {
        Tarn::Parameters answer = node_.CreateParameters();
        answer.WriteString("text", text);
        return channel.Answer(answer);
    }

    Tarn::Node& node_;
    ZelUnicodeString who_;
};

// What the client received, and a way to wait for it.
struct Inbox {
    std::mutex mutex;
    std::condition_variable changed;
    std::vector<std::string> lines;

    long Add(const std::string& line) {
        std::lock_guard<std::mutex> hold(mutex);
        std::cout << line << std::endl;
        lines.push_back(line);
        changed.notify_all();
        return S_OK;
    }
    bool WaitFor(std::size_t count) {
        std::unique_lock<std::mutex> hold(mutex);
        return changed.wait_for(hold, std::chrono::seconds(10),
                                [&] { return lines.size() >= count; });
    }
};

void CommandsTour() {
    Tarn::Commands commands;
    Tarn::Pool& greeter = commands.GetPool("greeter");
    greeter.RegisterCommand("greet", 1, [](Tarn::Node& node) { return new Greet(node); });
    Tarn::Node* server = greeter.CreateNode();
    Tarn::Node* client = commands.GetPool("client").CreateCallbackNode();
    Check(server != nullptr && client != nullptr, "creating the nodes");
    if (server == nullptr || client == nullptr) return;

    Nimbo::NodeId target;
    Check(client->Select("greeter", target) == S_OK, "selecting a node of \"greeter\"");

    Inbox inbox;
    Check(client->Subscribe(target, "greeted", Tarn::Node::Callable([&](const Tarn::Parameters& p) {
              ZelUnicodeString who;
              p.ReadString("who", who);
              return inbox.Add("event   greeted: " + who.str());
          })) == S_OK,
          "subscribing to \"greeted\"");

    Tarn::IterativeRequest call = client->CreateIterativeRequest(
        target, "greet", 1, Tarn::Node::Callable([&](const Tarn::Parameters& p) {
            ZelUnicodeString text;
            p.ReadString("text", text);
            return inbox.Add("answer  " + text.str());
        }));
    Tarn::Parameters begin = client->CreateParameters();
    begin.WriteString("who", "world");
    Tarn::Parameters send = client->CreateParameters();
    send.WriteInt32("times", 3);
    Check(call.Begin(begin) == S_OK, "Begin");
    Check(call.Send(send) == S_OK, "Send");
    Check(call.End(client->CreateParameters()) == S_OK, "End");
    // Three answers and the event.
    Check(inbox.WaitFor(4), "receiving three answers and the event");
}

}  // namespace

int main() {
    ParametersTour();
    std::cout << "\n";
    CommandsTour();
    return failures == 0 ? 0 : 1;
}
