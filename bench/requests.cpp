// Request round trips through the whole library: the client sends begin, send and end in one
// message with Request::Send and waits for the answer and the revoke; the server's in-process
// command answers its begin parameters. The peer, in the same run, is a plain two-thread ping-pong
// of the same 100 bytes through a mutex and a condition variable. Calls per second with 1, 4 and
// 16 concurrent clients, each with its own client node, against 2 server nodes of one pool.
#include <benchmark/benchmark.h>

#include <atomic>
#include <condition_variable>
#include <cstring>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

#include "MutexPingPong.h"
#include "Nimbo/NodeId.h"
#include "Tarn/Channel.h"
#include "Tarn/CommandInterface.h"
#include "Tarn/Commands.h"
#include "Tarn/Node.h"
#include "Tarn/Parameters.h"
#include "Tarn/Pool.h"
#include "Tarn/Request.h"
#include "hosting/NodeImpl.h"

namespace {

using bench::kPayload;
using bench::MutexPingPong;

class Echo : public Tarn::CommandInterface {
public:
    long OnBegin(Tarn::Parameters& p, Tarn::Channel& channel) override { return channel.Answer(p); }
    long OnCommand(Tarn::Parameters&, Tarn::Channel&) override { return 0; }
    long OnEnd(Tarn::Parameters&, Tarn::Channel&) override { return 0; }
    long OnDisconnect() override { return 0; }
};

// One client node and what it waits on.
struct Client {
    Tarn::Node* node = nullptr;
    Nimbo::NodeId target;
    std::atomic<bool> gotAnswer{false};
};

struct Service {
    Tarn::Commands commands;
    std::vector<std::unique_ptr<Client>> clients;
    std::mutex lock;

    Service() {
        Tarn::Pool& pool = commands.GetPool("echo");
        pool.RegisterCommand("echo", 1, [](Tarn::Node&) { return new Echo(); });
        pool.CreateNode();
        pool.CreateNode();
    }

    Client& ClientFor(int index) {
        std::lock_guard<std::mutex> hold(lock);
        while (clients.size() <= static_cast<std::size_t>(index)) {
            auto client = std::make_unique<Client>();
            client->node = commands.GetPool("clients").CreateCallbackNode();
            client->node->Select("echo", client->target);
            clients.push_back(std::move(client));
        }
        return *clients[index];
    }
};

Service& Shared() {
    static Service service;
    return service;
}

void RoundTrip(Service& service, Client& client, const Tarn::Parameters& payload,
               const Tarn::Parameters& empty) {
    Tarn::Request request = client.node->CreateRequest(
        client.target, "echo", 1, Tarn::Node::Callable([&client](const Tarn::Parameters&) {
            client.gotAnswer.store(true, std::memory_order_release);
            return 0L;
        }));
    request.Send(payload, empty, empty);
    // The caller waits by yielding, as a client busy with its own work would poll; the revoke
    // follows the answer on the same channel.
    while (!client.gotAnswer.load(std::memory_order_acquire)) std::this_thread::yield();
    client.gotAnswer.store(false, std::memory_order_relaxed);
    Tarn::NodeImpl& impl = Tarn::NodeInternal::Impl(*client.node);
    while (impl.PendingCount() != 0) std::this_thread::yield();
    (void)service;
}

void BM_RequestRoundTrip(benchmark::State& state) {
    Service& service = Shared();
    Client& client = service.ClientFor(state.thread_index());
    Tarn::Parameters payload(service.commands);
    std::vector<unsigned char> bytes(kPayload, 'p');
    payload.WriteBuffer("data", bytes.data(), kPayload);
    Tarn::Parameters empty(service.commands);
    for (auto _ : state) RoundTrip(service, client, payload, empty);
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_RequestRoundTrip)->Threads(1)->Threads(4)->Threads(16)->UseRealTime();


void BM_MutexCondVarPingPong(benchmark::State& state) {
    MutexPingPong pingPong;
    char request[kPayload], reply[kPayload];
    std::memset(request, 'p', kPayload);
    for (auto _ : state) pingPong.RoundTrip(request, reply);
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_MutexCondVarPingPong)->UseRealTime();

}  // namespace

BENCHMARK_MAIN();
