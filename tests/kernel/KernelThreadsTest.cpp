// The kernel under concurrent load: many senders, nodes coming and going, stops racing sends.
#include <gtest/gtest.h>

#include <atomic>
#include <cstdio>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "KernelTestNodes.h"
#include "Nimbo/NodePool.h"

namespace KernelTest {
namespace {

using Nimbo::Channel;
using Nimbo::NodeId;

constexpr int kSenders = 4;
constexpr int kPerSender = 10000;
constexpr int kTargets = 3;

// Counts every (sender, sequence) it receives and checks each sender's messages come in order.
// A waiting send gets the sequence number back. Disconnect notices ("bye") are counted apart.
class CountingNode : public Nimbo::Node {
public:
    explicit CountingNode(const char* name)
        : Nimbo::Node(name),
          seen_(kSenders, std::vector<int>(kPerSender, 0)),
          last_(kSenders, -1) {}

    long OnBinary(const Nimbo::Binary& message, Channel&) override {
        const std::string text = Text(message);
        std::lock_guard<std::mutex> hold(mutex_);
        if (text == "bye") {
            ++byes_;
            return 0;
        }
        int sender = -1;
        int sequence = -1;
        if (std::sscanf(text.c_str(), "%d:%d", &sender, &sequence) != 2 || sender < 0 ||
            sender >= kSenders || sequence < 0 || sequence >= kPerSender) {
            ++garbled_;
            return -1;
        }
        ++seen_[sender][sequence];
        if (sequence <= last_[sender]) ++outOfOrder_;
        last_[sender] = sequence;
        return sequence;
    }

    std::mutex mutex_;
    std::vector<std::vector<int>> seen_;
    std::vector<int> last_;
    int byes_ = 0;
    int garbled_ = 0;
    int outOfOrder_ = 0;
};

// A short-lived node that notes any delivery after its Stop returned.
class ChurnNode : public Nimbo::Node {
public:
    explicit ChurnNode(std::atomic<int>& lateDeliveries)
        : Nimbo::Node("churn"), late_(lateDeliveries) {}
    long OnBinary(const Nimbo::Binary&, Channel&) override {
        if (stopReturned_.load()) ++late_;
        return 0;
    }
    std::atomic<bool> stopReturned_{false};

private:
    std::atomic<int>& late_;
};

TEST(KernelThreadsTest, FourSendersThreeTargetsWhileNodesComeAndGo) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    std::vector<CountingNode*> targets;
    std::vector<NodeId> targetIds;
    for (int i = 0; i < kTargets; ++i) {
        targets.push_back(new CountingNode("target"));
        ASSERT_TRUE(launcher.Launch(*targets.back()));
        targetIds.push_back(IdOf(*targets.back()));
    }
    std::vector<RecordingCallbackNode*> senders;
    for (int i = 0; i < kSenders; ++i) {
        senders.push_back(LaunchNew<RecordingCallbackNode>(launcher, "sender"));
    }

    std::atomic<bool> sendersDone{false};
    std::atomic<int> lateDeliveries{0};
    std::atomic<int> churned{0};
    std::thread churn([&] {
        RecordingNode* helper = LaunchNew(launcher, "helper");
        while (!sendersDone.load()) {
            auto* node = new ChurnNode(lateDeliveries);
            if (!launcher.Launch(*node)) {
                delete node;
                ADD_FAILURE() << "launch failed";
                return;
            }
            ASSERT_EQ(node->SendBinaryOnDisconnection(targetIds[0], Bytes("bye")), S_OK);
            for (int i = 0; i < 20; ++i) helper->SendBinary(IdOf(*node), Bytes("churn"));
            node->Stop();
            node->stopReturned_ = true;
            ++churned;
        }
    });

    std::vector<std::thread> threads;
    std::atomic<int> failures{0};
    for (int t = 0; t < kSenders; ++t) {
        threads.emplace_back([&, t] {
            Nimbo::Node& sender = *senders[t];
            for (int i = 0; i < kPerSender; ++i) {
                const Nimbo::Binary message = Bytes(std::to_string(t) + ":" + std::to_string(i));
                const NodeId& target = targetIds[i % kTargets];
                if (i % 50 == 0) {
                    if (sender.SendBinaryAndWait(target, message) != i) ++failures;
                } else if (sender.SendBinary(target, message) != S_OK) {
                    ++failures;
                }
                if (i % 100 == 0) {
                    // Churn nodes may stop at any moment: refusals are fine, nothing else is.
                    Nimbo::NodePool pool;
                    NodeId churnId;
                    if (sender.Connect("churn", pool) != S_OK) ++failures;
                    if (pool.Select(churnId) == S_OK) sender.SendBinary(churnId, Bytes("x"));
                }
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    sendersDone = true;
    churn.join();
    ASSERT_TRUE(context.WaitUntilIdle(kTimeout));

    EXPECT_EQ(failures.load(), 0);
    EXPECT_EQ(lateDeliveries.load(), 0);
    EXPECT_GT(churned.load(), 0);
    for (int n = 0; n < kTargets; ++n) {
        CountingNode& target = *targets[n];
        std::lock_guard<std::mutex> hold(target.mutex_);
        EXPECT_EQ(target.garbled_, 0);
        EXPECT_EQ(target.outOfOrder_, 0);
        int wrong = 0;
        for (int t = 0; t < kSenders; ++t) {
            for (int i = 0; i < kPerSender; ++i) {
                if (target.seen_[t][i] != (i % kTargets == n ? 1 : 0)) ++wrong;
            }
        }
        EXPECT_EQ(wrong, 0) << "target " << n;
        EXPECT_EQ(target.byes_, n == 0 ? churned.load() : 0);
    }
}

TEST(KernelThreadsTest, StopRacingWithSendersLeavesNothingQueuedOrWaiting) {
    Nimbo::Context context;
    Nimbo::NodesLauncher launcher(context);
    for (int round = 0; round < 20; ++round) {
        std::atomic<int> late{0};
        auto* target = new ChurnNode(late);
        ASSERT_TRUE(launcher.Launch(*target));
        const NodeId targetId = IdOf(*target);
        std::vector<std::thread> threads;
        for (int t = 0; t < 3; ++t) {
            threads.emplace_back([&] {
                RecordingNode* sender = LaunchNew(launcher, "sender");
                // Each send either is refused or ends delivered or dropped: none hangs.
                for (int i = 0; i < 200; ++i) {
                    if (i % 10 == 0) {
                        sender->SendBinaryAndWait(targetId, Bytes("w"));
                    } else {
                        sender->SendBinary(targetId, Bytes("s"));
                    }
                }
            });
        }
        target->Stop();
        target->stopReturned_ = true;
        for (std::thread& thread : threads) thread.join();
        EXPECT_EQ(late.load(), 0);
        ASSERT_TRUE(context.WaitUntilIdle(kTimeout));
    }
}

}  // namespace
}  // namespace KernelTest
