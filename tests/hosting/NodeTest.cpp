// Nodes and their kernel nodes: names, the binding that WaitAll loosens, stopping, ids, user data,
// and nodes whose kernel node cannot be launched.
#include <dlfcn.h>
#include <pthread.h>

#include <cerrno>

#include "HostingTestSupport.h"

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
using HostingTest::Outsider;

TEST(NodeTest, EveryNodeOfAPoolCarriesThePoolName) {
    Tarn::Commands commands;
    Tarn::Pool& pool = commands.GetPool("workers");
    Nimbo::NodeSettings settings;
    const Nimbo::NodeSettings& constSettings = settings;
    std::vector<Tarn::Node*> nodes;  // three server nodes, then three callback nodes
    for (bool callback : {false, true}) {
        nodes.push_back(callback ? pool.CreateCallbackNode() : pool.CreateNode());
        nodes.push_back(callback ? pool.CreateCallbackNode(settings) : pool.CreateNode(settings));
        nodes.push_back(callback ? pool.CreateCallbackNode(constSettings)
                                 : pool.CreateNode(constSettings));
    }
    for (Tarn::Node* node : nodes) {
        ASSERT_NE(nullptr, node);
        EXPECT_EQ("workers", Tarn::NodeInternal::Impl(*node).GetKernelNode()->GetName().str());
    }
    EXPECT_EQ(nullptr, nodes[0]->GetCallbackNode());
    ASSERT_NE(nullptr, nodes[3]->GetCallbackNode());
    EXPECT_EQ("workers", nodes[3]->GetCallbackNode()->GetName().str());

    // Six kernel nodes under one name: selection reaches each, until Node::Stop stops them.
    Outsider outsider(ContextOf(commands));
    const std::vector<Nimbo::NodeId> ids = outsider.Select("workers", 6);
    EXPECT_EQ(6u, std::set<Nimbo::NodeId>(ids.begin(), ids.end()).size());
    for (Tarn::Node* node : nodes) EXPECT_EQ(S_OK, node->Stop());
    EXPECT_TRUE(outsider.Select("workers", 1).empty());
}

// After WaitAll a stopped server node has no kernel node: what needs one fails, and Stop still
// answers 0. A callback node keeps working; each node keeps its user data. A copied NodeId keeps
// the kernel id but starts invalid.
TEST(NodeTest, ServerNodeLosesItsKernelNodeAtWaitAllWhileCallbackNodeKeepsWorking) {
    Tarn::Commands commands;
    Tarn::Node* server = commands.GetPool("pair").CreateNode();
    Tarn::Node* callback = commands.GetPool("pair").CreateCallbackNode();
    ASSERT_TRUE(server != nullptr && callback != nullptr);
    EXPECT_EQ(E_NOTIMPL, server->Execute("task", Nimbo::kExecuteDefault));  // the kernel's answer
    int a = 1, b = 2;
    void* data = &a;
    server->GetData(data);
    EXPECT_EQ(nullptr, data);  // none until set
    server->SetData(&a);
    callback->SetData(&b);
    EXPECT_EQ(S_OK, server->Stop());
    EXPECT_EQ(S_OK, commands.WaitAll());

    Tarn::Parameters event = commands.CreateParameters();
    Tarn::NodeId selected;
    Nimbo::NodeId self;
    EXPECT_EQ(E_FAIL, server->Emit("tick", event));
    EXPECT_EQ(E_FAIL, server->Emit("tick", server->CreateMessage()));
    EXPECT_EQ(E_FAIL, server->Select("pair", selected));
    EXPECT_EQ(E_FAIL, server->SelectMyself(self));
    EXPECT_EQ(E_FAIL, server->Subscribe(self, "tick", commands.GetDefaultResponse()));
    EXPECT_EQ(E_FAIL, server->Execute("task", Nimbo::kExecuteDefault));  // not E_NOTIMPL
    EXPECT_EQ(S_OK, server->Stop());

    EXPECT_EQ(S_OK, callback->Emit("tick", event));
    EXPECT_EQ(S_OK, callback->Select("pair", selected));
    EXPECT_EQ(S_OK, callback->SelectMyself(self));
    EXPECT_EQ(self, Nimbo::NodeId(selected));  // the pool's one live node
    EXPECT_EQ(E_NOTIMPL, callback->Execute("task", Nimbo::kExecuteDefault));
    server->GetData(data);
    EXPECT_EQ(&a, data);
    callback->GetData(data);
    EXPECT_EQ(&b, data);

    EXPECT_EQ(E_FAIL, Tarn::NodeId().IsValid());
    Tarn::NodeIdInternal::SetValid(selected, S_OK);
    const Tarn::NodeId copy(selected);
    EXPECT_EQ(E_FAIL, copy.IsValid());
    EXPECT_EQ(self, Nimbo::NodeId(copy));
    Tarn::NodeIdInternal::SetValid(selected, 5);
    selected = Tarn::NodeId();
    EXPECT_EQ(5, selected.IsValid());  // assignment takes the kernel id only
    EXPECT_EQ(0, Nimbo::NodeId(selected).GetStatus());
}

TEST(NodeTest, NodeWhoseThreadCannotStartLeavesNothingBehind) {
    Nimbo::Context context;
    Outsider outsider(context);
    Tarn::Commands commands(context);
    Tarn::Pool& pool = commands.GetPool("doomed");

    g_threadsRefused.store(true);
    Tarn::Node* server = pool.CreateNode();
    Tarn::Node* callback = pool.CreateCallbackNode(Nimbo::NodeSettings());
    g_threadsRefused.store(false);
    EXPECT_TRUE(server == nullptr && callback == nullptr);

    // Not in the kernel's registry, not waited for, not among the nodes WaitAll unbinds.
    EXPECT_TRUE(outsider.Select("doomed", 1).empty());
    EXPECT_EQ(S_OK, commands.WaitAll());

    // The pool goes on, and its one node is all that selection finds.
    Tarn::Node* survivor = pool.CreateCallbackNode();
    Nimbo::NodeId self;
    ASSERT_NE(nullptr, survivor);
    ASSERT_EQ(S_OK, survivor->SelectMyself(self));
    for (const Nimbo::NodeId& id : outsider.Select("doomed", 3)) EXPECT_EQ(self, id);
}

}  // namespace
