// Message round trips through the kernel, against a plain two-thread ping-pong through a mutex and
// a condition variable carrying the same 100 bytes, measured in the same run. The program ends by
// printing each kernel round trip's time as a ratio of the ping-pong's.
//
//   BM_MutexCondVarPingPong     the peer: the benchmark thread hands 100 bytes to an echo thread
//                               and waits for its 100 bytes back.
//   BM_KernelChannelRoundTrip   node A sends 100 bytes to node B, B answers 100 bytes on the
//                               channel, A waits for the answer before sending again.
//   BM_KernelSendAndWait        the benchmark thread sends 100 bytes with SendBinaryAndWait and
//                               gets the target's result back.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <condition_variable>
#include <cstdio>
#include <cstring>
#include <future>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "MutexPingPong.h"
#include "Nimbo/Binary.h"
#include "Nimbo/CallbackNode.h"
#include "Nimbo/Channel.h"
#include "Nimbo/Context.h"
#include "Nimbo/Node.h"
#include "Nimbo/NodeId.h"
#include "Nimbo/NodesLauncher.h"

namespace {

using bench::kPayload;
using bench::MutexPingPong;
// Round trips per iteration of the channel benchmark, whose iterations start and end on the
// benchmark thread.
constexpr int kBatch = 1000;

// A fresh message, as a sender encodes one for each request.
Nimbo::Binary Payload(char fill) {
    char* bytes = new char[kPayload];
    std::memset(bytes, fill, kPayload);
    return Nimbo::Binary(bytes, kPayload, Nimbo::deallocateArrayChar);
}


void BM_MutexCondVarPingPong(benchmark::State& state) {
    MutexPingPong pingPong;
    char request[kPayload];
    char reply[kPayload];
    std::memset(request, 'p', kPayload);
    for (auto _ : state) {
        pingPong.RoundTrip(request, reply);
        benchmark::DoNotOptimize(reply);
    }
    state.counters["round_trips"] = 1;
}
BENCHMARK(BM_MutexCondVarPingPong)->UseRealTime();

// Answers every message on its channel.
class EchoNode : public Nimbo::Node {
public:
    EchoNode() : Nimbo::Node("echo") {}
    long OnBinary(const Nimbo::Binary& message, Nimbo::Channel& channel) override {
        const char first = *static_cast<const char*>(message.GetData());
        return channel.AnswerBinary(Payload(static_cast<char>(first + 1)));
    }
};

// Sends the next request on each answer until the batch is done.
class PingNode : public Nimbo::Node {
public:
    PingNode() : Nimbo::Node("ping") {}

    // Runs one batch of round trips with `echo`, from the benchmark thread.
    void RunBatch(const Nimbo::NodeId& echo) {
        remaining_ = kBatch;
        batchDone_ = std::promise<void>();
        std::future<void> done = batchDone_.get_future();
        SendBinary(echo, Payload('p'));
        done.wait();
    }

    long OnBinary(const Nimbo::Binary& answer, Nimbo::Channel& channel) override {
        benchmark::DoNotOptimize(*static_cast<const char*>(answer.GetData()));
        if (--remaining_ > 0) return channel.AnswerBinary(Payload('p'));
        batchDone_.set_value();
        return 0;
    }

private:
    int remaining_ = 0;
    std::promise<void> batchDone_;
};

void BM_KernelChannelRoundTrip(benchmark::State& state) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    auto* echo = new EchoNode();
    auto* ping = new PingNode();
    if (!launcher.Launch(*echo) || !launcher.Launch(*ping)) {
        state.SkipWithError("launch failed");
        return;
    }
    Nimbo::NodeId echoId;
    echo->SelectMyself(echoId);
    for (auto _ : state) ping->RunBatch(echoId);
    state.counters["round_trips"] = kBatch;
}
BENCHMARK(BM_KernelChannelRoundTrip)->UseRealTime();

// Reads the request and returns a result computed from it.
class ReaderNode : public Nimbo::Node {
public:
    ReaderNode() : Nimbo::Node("reader") {}
    long OnBinary(const Nimbo::Binary& message, Nimbo::Channel&) override {
        const char* bytes = static_cast<const char*>(message.GetData());
        return bytes[0] + bytes[message.GetSize() - 1];
    }
};

void BM_KernelSendAndWait(benchmark::State& state) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    auto* reader = new ReaderNode();
    auto* client = new Nimbo::CallbackNode("client");
    if (!launcher.Launch(*reader) || !launcher.Launch(*client)) {
        state.SkipWithError("launch failed");
        return;
    }
    Nimbo::NodeId readerId;
    reader->SelectMyself(readerId);
    for (auto _ : state) {
        benchmark::DoNotOptimize(client->SendBinaryAndWait(readerId, Payload('r')));
    }
    state.counters["round_trips"] = 1;
}
BENCHMARK(BM_KernelSendAndWait)->UseRealTime();

// The console report, then each benchmark's time per round trip against the peer's.
class RatioReporter : public benchmark::ConsoleReporter {
public:
    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs) {
            // Single runs, or with repetitions the median of them (all that is reported when
            // only aggregates are asked for).
            const bool median = run.run_type == Run::RT_Aggregate && run.aggregate_name == "median";
            if (run.error_occurred || (run.run_type != Run::RT_Iteration && !median)) continue;
            auto trips = run.counters.find("round_trips");
            const double perIteration = trips == run.counters.end() ? 1.0 : trips->second.value;
            const double seconds =
                run.GetAdjustedRealTime() / benchmark::GetTimeUnitMultiplier(run.time_unit);
            (median ? medians_ : perRoundTrip_)[run.run_name.function_name].push_back(seconds /
                                                                                      perIteration);
        }
    }

    void Finalize() override {
        ConsoleReporter::Finalize();
        const double peer = Median("BM_MutexCondVarPingPong");
        if (peer <= 0) return;
        std::printf(
            "\nround trip, median of runs (ratio to the mutex + condition variable peer):\n");
        std::map<std::string, std::vector<double>> all = perRoundTrip_;
        all.insert(medians_.begin(), medians_.end());
        for (const auto& entry : all) {
            const double time = Median(entry.first);
            std::printf("  %-28s %9.2f us  %5.2fx\n", entry.first.c_str(), time * 1e6, time / peer);
        }
    }

private:
    double Median(const std::string& name) const {
        for (const auto* table : {&medians_, &perRoundTrip_}) {
            auto found = table->find(name);
            if (found == table->end() || found->second.empty()) continue;
            std::vector<double> times = found->second;
            std::sort(times.begin(), times.end());
            return times[times.size() / 2];
        }
        return 0;
    }

    std::map<std::string, std::vector<double>> perRoundTrip_;
    std::map<std::string, std::vector<double>> medians_;
};

}  // namespace

int main(int argc, char** argv) {
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
    RatioReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    benchmark::Shutdown();
    return 0;
}
