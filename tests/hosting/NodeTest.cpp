// Nodes and their kernel nodes: names, the binding that WaitAll loosens, stopping, ids, user data,
// and nodes whose kernel node cannot be launched.
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <pthread.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <future>

#include "HostingTestSupport.h"
#include "Tarn/Message.h"
#include "Tarn/Response.h"
#include "hosting/NodeImpl.h"

namespace Tarn {
// The library never changes a NodeId's validity mark; tests set it to see what copies keep.
class NodeIdInternal {
public:
    static void SetValid(NodeId& id, long valid) { id.SetValid(valid); }
};
}  // namespace Tarn

// Fault helper: while set, no new thread of this process starts, as when the system is out of
// threads. Interposed on the C library's pthread_create (or a sanitizer's).
static std::atomic<bool> g_threadsRefused{false};

extern "C" int pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                              void* (*start)(void*), void* argument) noexcept {
    using Create = int (*)(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*);
    static const auto real = reinterpret_cast<Create>(dlsym(RTLD_NEXT, "pthread_create"));
    return g_threadsRefused.load() ? EAGAIN : real(thread, attributes, start, argument);
}

namespace {

using HostingTest::ContextOf;
using HostingTest::kTimeout;
using HostingTest::Outsider;

TEST(NodeKernelNameTest, EveryNodeOfAPoolCarriesThePoolName) {
    Tarn::Commands commands;
    Tarn::Pool& pool = commands.GetPool("workers");
    Nimbo::NodeSettings settings;
    const Nimbo::NodeSettings& constSettings = settings;
    Tarn::Node* nodes[] = {pool.CreateNode(),
                           pool.CreateNode(settings),
                           pool.CreateNode(constSettings),
                           pool.CreateCallbackNode(),
                           pool.CreateCallbackNode(settings),
                           pool.CreateCallbackNode(constSettings)};
    for (Tarn::Node* node : nodes) {
        ASSERT_NE(nullptr, node);
        EXPECT_EQ("workers", Tarn::NodeInternal::Impl(*node).GetKernelNode()->GetName().str());
    }
    EXPECT_EQ(nullptr, nodes[0]->GetCallbackNode());
    ASSERT_NE(nullptr, nodes[3]->GetCallbackNode());
    EXPECT_EQ("workers", nodes[3]->GetCallbackNode()->GetName().str());

    // Six kernel nodes under one name: selection reaches each, until Node::Stop stops them.
    Outsider outsider(ContextOf(commands));
    std::vector<Nimbo::NodeId> ids = outsider.Select("workers", 6);
    std::sort(ids.begin(), ids.end());
    EXPECT_EQ(6, std::unique(ids.begin(), ids.end()) - ids.begin());
    for (Tarn::Node* node : nodes) EXPECT_EQ(S_OK, node->Stop());
    EXPECT_TRUE(outsider.Select("workers", 1).empty());
}

TEST(NodeWaitAllTest, ServerNodeLosesItsKernelNodeWhileCallbackNodeKeepsWorking) {
    Tarn::Commands commands;
    Tarn::Node* server = commands.GetPool("pair").CreateNode();
    Tarn::Node* callback = commands.GetPool("pair").CreateCallbackNode();
    ASSERT_NE(nullptr, server);
    ASSERT_NE(nullptr, callback);
    EXPECT_EQ(E_NOTIMPL, server->Execute("task", Nimbo::kExecuteDefault));  // the kernel's answer

    EXPECT_EQ(S_OK, server->Stop());
    auto waited = std::async(std::launch::async, [&] { return commands.WaitAll(); });
    ASSERT_EQ(std::future_status::ready, waited.wait_for(kTimeout));
    EXPECT_EQ(S_OK, waited.get());

    Tarn::Parameters event = commands.CreateParameters();
    Tarn::NodeId selected;
    Nimbo::NodeId self;
    EXPECT_EQ(E_FAIL, server->Emit("tick", event));
    EXPECT_EQ(E_FAIL, server->Emit("tick", server->CreateMessage()));
    EXPECT_EQ(E_FAIL, server->Select("pair", selected));
    EXPECT_EQ(E_FAIL, server->SelectMyself(self));
    EXPECT_EQ(E_FAIL, server->Subscribe(self, "tick", commands.GetDefaultResponse()));
    // The stopped kernel node would answer E_NOTIMPL: the node no longer has one.
    EXPECT_EQ(E_FAIL, server->Execute("task", Nimbo::kExecuteDefault));
    EXPECT_EQ(nullptr, Tarn::NodeInternal::Impl(*server).GetKernelNode());
    EXPECT_EQ(S_OK, server->Stop());  // without kernel nodes, still 0

    EXPECT_EQ(S_OK, callback->Emit("tick", event));
    EXPECT_EQ(S_OK, callback->Select("pair", selected));
    EXPECT_EQ(S_OK, callback->SelectMyself(self));
    EXPECT_EQ(self, Nimbo::NodeId(selected));  // the pool's one live node
    EXPECT_EQ(E_NOTIMPL, callback->Execute("task", Nimbo::kExecuteDefault));
}

TEST(NodeIdTest, CopyKeepsTheKernelIdButStartsInvalid) {
    Tarn::Commands commands;
    Tarn::Node* node = commands.GetPool("ids").CreateCallbackNode();
    Tarn::NodeId source;
    EXPECT_EQ(E_FAIL, source.IsValid());
    ASSERT_EQ(S_OK, node->Select("ids", source));
    Tarn::NodeIdInternal::SetValid(source, S_OK);

    Tarn::NodeId copy(source);
    EXPECT_EQ(E_FAIL, copy.IsValid());
    EXPECT_EQ(Nimbo::NodeId(source), Nimbo::NodeId(copy));
    EXPECT_NE(0, Nimbo::NodeId(copy).GetStatus());

    Tarn::NodeId assigned;
    Tarn::NodeIdInternal::SetValid(assigned, 5);
    assigned = Tarn::NodeId();
    EXPECT_EQ(5, assigned.IsValid());  // assignment takes the kernel id only
    EXPECT_EQ(0, Nimbo::NodeId(assigned).GetStatus());
}

TEST(NodeUserDataTest, EachNodeKeepsItsOwnPointerAfterWaitAll) {
    Tarn::Commands commands;
    Tarn::Node* first = commands.GetPool("data").CreateNode();
    Tarn::Node* second = commands.GetPool("data").CreateCallbackNode();
    int a = 1, b = 2;
    void* data = &a;
    first->GetData(data);
    EXPECT_EQ(nullptr, data);  // none until set
    first->SetData(&a);
    second->SetData(&b);
    first->Stop();
    commands.WaitAll();
    first->GetData(data);
    EXPECT_EQ(&a, data);
    second->GetData(data);
    EXPECT_EQ(&b, data);
}

TEST(NodeLaunchFailureTest, NodeWhoseThreadCannotStartLeavesNothingBehind) {
    Nimbo::Context context;
    Outsider outsider(context);
    Tarn::Commands commands(context);
    Tarn::Pool& pool = commands.GetPool("doomed");

    g_threadsRefused.store(true);
    Tarn::Node* server = pool.CreateNode();
    Tarn::Node* callback = pool.CreateCallbackNode(Nimbo::NodeSettings());
    g_threadsRefused.store(false);
    EXPECT_EQ(nullptr, server);
    EXPECT_EQ(nullptr, callback);

    // Not in the kernel's registry, not waited for, not among the nodes WaitAll unbinds.
    EXPECT_TRUE(outsider.Select("doomed", 1).empty());
    auto waited = std::async(std::launch::async, [&] { return commands.WaitAll(); });
    ASSERT_EQ(std::future_status::ready, waited.wait_for(kTimeout));

    // The pool goes on, and its one node is all that selection finds.
    Tarn::Node* survivor = pool.CreateCallbackNode();
    Nimbo::NodeId self;
    ASSERT_NE(nullptr, survivor);
    ASSERT_EQ(S_OK, survivor->SelectMyself(self));
    for (const Nimbo::NodeId& id : outsider.Select("doomed", 3)) EXPECT_EQ(self, id);
}

}  // namespace
