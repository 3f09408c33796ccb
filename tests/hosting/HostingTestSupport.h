// What the hosting tests include and share: the context of a Commands, and a kernel node that
// stands outside every Commands.
#ifndef TESTS_HOSTING_HOSTINGTESTSUPPORT_H_
#define TESTS_HOSTING_HOSTINGTESTSUPPORT_H_

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <functional>
#include <future>
#include <initializer_list>
#include <memory>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "Nimbo/Nimbo.h"
#include "Tarn/Binary.h"
#include "Tarn/Commands.h"
#include "Tarn/InProcessCommand.h"
#include "Tarn/Message.h"
#include "Tarn/Node.h"
#include "Tarn/NodeId.h"
#include "Tarn/Parameters.h"
#include "Tarn/Pool.h"
#include "Tarn/Response.h"
#include "Tarn/TypesImpl.h"
#include "hosting/CommandsImpl.h"
#include "hosting/NodeImpl.h"
#include "parameters/ErrorCapture.h"

namespace HostingTest {

constexpr std::chrono::seconds kTimeout{20};  // only bounds how long a broken library takes to fail

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

}  // namespace HostingTest

#endif  // TESTS_HOSTING_HOSTINGTESTSUPPORT_H_
