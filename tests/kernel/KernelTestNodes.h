// Nodes and helpers shared by the kernel's tests: a node that records what it receives and can
// react to it, byte helpers, and launch shortcuts.
#ifndef TESTS_KERNEL_KERNELTESTNODES_H_
#define TESTS_KERNEL_KERNELTESTNODES_H_

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstring>
#include <functional>
#include <mutex>
#include <string>
#include <thread>
#include <utility>
#include <vector>

// The umbrella header, so that it is compiled with every kernel test.
#include "Nimbo/Nimbo.h"

namespace KernelTest {

// Generous: these only bound how long a broken kernel takes to fail a test.
constexpr std::chrono::seconds kTimeout{20};

inline Nimbo::Binary Bytes(const std::string& text) {
    char* copy = new char[text.size() + 1];
    std::memcpy(copy, text.data(), text.size());
    return Nimbo::Binary(copy, static_cast<unsigned int>(text.size()), Nimbo::deallocateArrayChar);
}

inline std::string Text(const Nimbo::Binary& bytes) {
    if (bytes.IsEmpty()) return std::string();
    return std::string(static_cast<const char*>(bytes.GetData()), bytes.GetSize());
}

struct Delivery {
    std::string text;
    Nimbo::ChannelId channel;
    std::thread::id thread;
};

// Records every message it receives (before reacting to it), then runs its reaction, whose
// result OnBinary returns. Set the reaction before the node is launched.
template <typename Base>
class Recorder : public Base {
public:
    using Reaction = std::function<long(const std::string& text, Nimbo::Channel& channel)>;

    template <typename... Args>
    explicit Recorder(Args&&... args) : Base(std::forward<Args>(args)...) {}

    void React(Reaction reaction) { reaction_ = std::move(reaction); }

    long OnBinary(const Nimbo::Binary& message, Nimbo::Channel& channel) override {
        if (inside_.fetch_add(1) != 0) overlapped_ = true;
        {
            std::lock_guard<std::mutex> hold(mutex_);
            deliveries_.push_back({Text(message), channel.GetId(), std::this_thread::get_id()});
        }
        arrived_.notify_all();
        const long result = reaction_ ? reaction_(Text(message), channel) : 0;
        inside_.fetch_sub(1);
        return result;
    }

    // True once at least `count` messages arrived.
    bool WaitForCount(std::size_t count) {
        std::unique_lock<std::mutex> hold(mutex_);
        return arrived_.wait_for(hold, kTimeout, [&] { return deliveries_.size() >= count; });
    }
    std::vector<Delivery> Deliveries() const {
        std::lock_guard<std::mutex> hold(mutex_);
        return deliveries_;
    }
    std::vector<std::string> Texts() const {
        std::vector<std::string> texts;
        for (const Delivery& delivery : Deliveries()) texts.push_back(delivery.text);
        return texts;
    }
    std::size_t Count() const {
        std::lock_guard<std::mutex> hold(mutex_);
        return deliveries_.size();
    }
    // True when OnBinary was ever entered while another call of it was running.
    bool Overlapped() const { return overlapped_; }

private:
    Reaction reaction_;
    mutable std::mutex mutex_;
    std::condition_variable arrived_;
    std::vector<Delivery> deliveries_;
    std::atomic<int> inside_{0};
    std::atomic<bool> overlapped_{false};
};

using RecordingNode = Recorder<Nimbo::Node>;
using RecordingCallbackNode = Recorder<Nimbo::CallbackNode>;

// Makes a node with new and launches it; the launcher owns it from then on.
template <typename N = RecordingNode, typename... Args>
N* LaunchNew(Nimbo::NodesLauncher& launcher, Args&&... args) {
    N* node = new N(std::forward<Args>(args)...);
    EXPECT_TRUE(launcher.Launch(*node));
    return node;
}

inline Nimbo::NodeId IdOf(Nimbo::Node& node) {
    Nimbo::NodeId id;
    EXPECT_EQ(node.SelectMyself(id), S_OK);
    return id;
}

}  // namespace KernelTest

#endif  // TESTS_KERNEL_KERNELTESTNODES_H_
