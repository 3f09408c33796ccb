// The kernel under concurrent load: many senders, nodes coming and going, stops racing sends.
#include <gtest/gtest.h>

#include <atomic>
#include <cstdio>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "KernelTestNodes.h"

namespace KernelTest {
namespace {

using Nimbo::NodeId;

constexpr int kSenders = 4;
constexpr int kPerSender = 10000;
constexpr int kTargets = 3;

// Counts every "<sender>:<sequence>" it receives, checks each sender's come in order, and gives
// the sequence back to a waiting sender. Disconnect notices ("bye") are counted apart.
class CountingNode : public Nimbo::Node {
public:
    CountingNode() : Nimbo::Node("target") {}
    long OnBinary(const Nimbo::Binary& message, Nimbo::Channel&) override {
        const std::string text = Text(message);
        std::lock_guard<std::mutex> hold(mutex);
        int sender = -1, sequence = -1;
        if (text == "bye") {
            ++byes;
        } else if (std::sscanf(text.c_str(), "%d:%d", &sender, &sequence) == 2 && sender >= 0 &&
                   sender < kSenders && sequence > last[sender] && sequence < kPerSender) {
            ++seen[sender][sequence];
            last[sender] = sequence;
        } else {
            ++wrong;
        }
        return sequence;
    }
    std::mutex mutex;
    std::vector<std::vector<int>> seen{kSenders, std::vector<int>(kPerSender, 0)};
    std::vector<int> last = std::vector<int>(kSenders, -1);
    int byes = 0;
    int wrong = 0;
};

// A short-lived node that counts deliveries made after its Stop returned.
class ChurnNode : public Nimbo::Node {
public:
    explicit ChurnNode(std::atomic<int>& late) : Nimbo::Node("churn"), late_(late) {}
    long OnBinary(const Nimbo::Binary&, Nimbo::Channel&) override {
        if (stopReturned) ++late_;
        return 0;
    }
    std::atomic<bool> stopReturned{false};

private:
    std::atomic<int>& late_;
};

TEST(KernelThreadsTest, FourSendersThreeTargetsWhileNodesComeAndGo) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    std::vector<CountingNode*> targets;
    std::vector<NodeId> ids;
    for (int i = 0; i < kTargets; ++i) {
        targets.push_back(new CountingNode());
        ASSERT_TRUE(launcher.Launch(*targets.back()));
        ids.push_back(IdOf(*targets.back()));
    }
    std::atomic<bool> sendersDone{false};
    std::atomic<int> late{0}, churned{0}, failures{0};
    // Launches nodes that arm a notice, get sent to from here and from the senders, and stop.
    std::thread churn([&] {
        RecordingNode* helper = LaunchNew(launcher, "helper");
        while (!sendersDone) {
            auto* node = new ChurnNode(late);
            if (!launcher.Launch(*node)) return delete node, void(++failures);
            if (node->SendBinaryOnDisconnection(ids[0], Bytes("bye")) != S_OK) ++failures;
            for (int i = 0; i < 20; ++i) helper->SendBinary(IdOf(*node), Bytes("churn"));
            node->Stop();
            node->stopReturned = true;
            ++churned;
        }
    });
    std::vector<std::thread> senders;
    for (int t = 0; t < kSenders; ++t) {
        auto* sender = LaunchNew<RecordingCallbackNode>(launcher, "sender");
        senders.emplace_back([&, t, sender] {
            for (int i = 0; i < kPerSender; ++i) {
                const Nimbo::Binary message = Bytes(std::to_string(t) + ":" + std::to_string(i));
                if (i % 50 == 0) {
                    if (sender->SendBinaryAndWait(ids[i % kTargets], message) != i) ++failures;
                } else if (sender->SendBinary(ids[i % kTargets], message) != S_OK) {
                    ++failures;
                }
                if (i % 100 == 0) {  // churn nodes may be gone by now: refusals are fine
                    Nimbo::NodePool pool;
                    NodeId churnId;
                    sender->Connect("churn", pool);
                    // Racing its Stop, this is delivered or refused, never left waiting.
                    if (pool.Select(churnId) == S_OK)
                        sender->SendBinaryAndWait(churnId, Bytes("x"));
                }
            }
        });
    }
    for (std::thread& thread : senders) thread.join();
    sendersDone = true;
    churn.join();
    ASSERT_TRUE(context.WaitUntilIdle(kTimeout));

    EXPECT_EQ(failures, 0);
    EXPECT_EQ(late, 0);
    for (int n = 0; n < kTargets; ++n) {
        std::lock_guard<std::mutex> hold(targets[n]->mutex);
        int missedOrRepeated = 0;
        for (int t = 0; t < kSenders; ++t) {
            for (int i = 0; i < kPerSender; ++i) {
                missedOrRepeated += targets[n]->seen[t][i] != (i % kTargets == n ? 1 : 0);
            }
        }
        EXPECT_EQ(missedOrRepeated, 0) << "target " << n;
        EXPECT_EQ(targets[n]->wrong, 0) << "target " << n;
        EXPECT_EQ(targets[n]->byes, n == 0 ? churned.load() : 0);
    }
}

}  // namespace
}  // namespace KernelTest
