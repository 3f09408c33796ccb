// Shared by the kernel's tests: a node that records what it receives and can react to it, byte
// helpers and launch shortcuts.
#ifndef TESTS_KERNEL_KERNELTESTNODES_H_
#define TESTS_KERNEL_KERNELTESTNODES_H_

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstring>
#include <functional>
#include <future>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

// The umbrella header, so that it is compiled with every kernel test.
#include "Nimbo/Nimbo.h"

namespace KernelTest {

// Generous: it only bounds how long a broken kernel takes to fail a test.
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
};

// Records each message as it arrives, then runs `react` (set before launch), whose result
// OnBinary returns.
template <typename Base>
class Recorder : public Base {
public:
    using Base::Base;

    long OnBinary(const Nimbo::Binary& message, Nimbo::Channel& channel) override {
        if (inside_.fetch_add(1) != 0) overlapped = true;
        {
            std::lock_guard<std::mutex> hold(mutex_);
            deliveries_.push_back({Text(message), channel.GetId()});
        }
        arrived_.notify_all();
        const long result = react ? react(Text(message), channel) : 0;
        inside_.fetch_sub(1);
        return result;
    }

    bool WaitForCount(std::size_t count) {
        std::unique_lock<std::mutex> hold(mutex_);
        return arrived_.wait_for(hold, kTimeout, [&] { return deliveries_.size() >= count; });
    }
    std::vector<Delivery> Deliveries() {
        std::lock_guard<std::mutex> hold(mutex_);
        return deliveries_;
    }
    std::vector<std::string> Texts() {
        std::vector<std::string> texts;
        for (const Delivery& delivery : Deliveries()) texts.push_back(delivery.text);
        return texts;
    }

    std::function<long(const std::string& text, Nimbo::Channel& channel)> react;
    std::atomic<bool> overlapped{false};  // OnBinary entered while already running

private:
    std::mutex mutex_;
    std::condition_variable arrived_;
    std::vector<Delivery> deliveries_;
    std::atomic<int> inside_{0};
};

using RecordingNode = Recorder<Nimbo::Node>;
using RecordingCallbackNode = Recorder<Nimbo::CallbackNode>;
using Strings = std::vector<std::string>;

// Makes a node with new and launches it; the launcher owns it from then on.
template <typename N = RecordingNode>
N* LaunchNew(Nimbo::NodesLauncher& launcher, const char* name,
             std::function<long(const std::string&, Nimbo::Channel&)> react = nullptr) {
    N* node = new N(name);
    node->react = std::move(react);
    EXPECT_TRUE(launcher.Launch(*node));
    return node;
}

inline Nimbo::NodeId IdOf(Nimbo::Node& node) {
    Nimbo::NodeId id;
    EXPECT_EQ(node.SelectMyself(id), S_OK);
    return id;
}

// A reaction that blocks until the gate opens.
inline std::function<long(const std::string&, Nimbo::Channel&)> Blocked(
    std::shared_future<void> gate) {
    return [gate](const std::string&, Nimbo::Channel&) {
        gate.wait();
        return 0L;
    };
}

}  // namespace KernelTest

#endif  // TESTS_KERNEL_KERNELTESTNODES_H_
