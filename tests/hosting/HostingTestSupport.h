// Helpers shared by the hosting tests: a kernel node that stands outside every Commands, and a
// recorder of the error texts the kernel publishes.
#ifndef TESTS_HOSTING_HOSTINGTESTSUPPORT_H_
#define TESTS_HOSTING_HOSTINGTESTSUPPORT_H_

#include <gtest/gtest.h>

#include <chrono>
#include <mutex>
#include <string>
#include <vector>

#include "Nimbo/Nimbo.h"
#include "Tarn/Commands.h"
#include "Tarn/Node.h"
#include "Tarn/NodeId.h"
#include "Tarn/Parameters.h"
#include "Tarn/Pool.h"
#include "hosting/CommandsImpl.h"

namespace HostingTest {

// Only bounds how long a broken library takes to fail a test.
constexpr std::chrono::seconds kTimeout{20};

inline const Nimbo::Context& ContextOf(const Tarn::Commands& commands) {
    return Tarn::CommandsInternal::Impl(commands).GetContext();
}

// A Nimbo::CallbackNode on a launcher of its own in `context`: it sees the nodes of every Commands
// on that context and belongs to none of them.
class Outsider {
public:
    explicit Outsider(const Nimbo::Context& context) : launcher_(context) {
        EXPECT_TRUE(launcher_.Launch(*node_));
    }
    Nimbo::Node& Kernel() { return *node_; }

    // What `count` round-robin selections of `poolName` return; fewer once none runs.
    std::vector<Nimbo::NodeId> Select(const ZelUnicodeString& poolName, int count) {
        std::vector<Nimbo::NodeId> ids;
        Nimbo::NodePool pool;
        Nimbo::NodeId id;
        if (node_->Connect(poolName, pool) < 0) return ids;
        while (static_cast<int>(ids.size()) < count && pool.Select(id) >= 0) ids.push_back(id);
        return ids;
    }

private:
    Nimbo::NodesLauncher launcher_;
    Nimbo::CallbackNode* node_ = new Nimbo::CallbackNode("outsider");  // the launcher's
};

// Records the error texts published while it lives, instead of printing them.
class PublishedErrors {
public:
    PublishedErrors() {
        Nimbo::PrivateServices::SetErrorListener(
            [this](const ZelUnicodeString& message, const ZelUnicodeString&) {
                std::lock_guard<std::mutex> hold(lock_);
                texts_.push_back(message.str());
            });
    }
    ~PublishedErrors() { Nimbo::PrivateServices::SetErrorListener(nullptr); }
    std::vector<std::string> Texts() const {
        std::lock_guard<std::mutex> hold(lock_);
        return texts_;
    }

private:
    mutable std::mutex lock_;
    std::vector<std::string> texts_;
};

}  // namespace HostingTest

#endif  // TESTS_HOSTING_HOSTINGTESTSUPPORT_H_
