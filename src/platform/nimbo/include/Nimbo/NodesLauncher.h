// Nimbo::NodesLauncher: starts nodes in a context and owns them from then on.
//
// Launch gives the node its NodeId, registers it under its name and starts delivering its
// messages on a thread of its own. A launched node belongs to the launcher: it must have been made
// with new, must not be deleted by anyone else, and is stopped and deleted when the launcher is
// destroyed. A node that failed to launch stays with its caller.
//
// Every operation is safe from any thread, except that the launcher must not be destroyed from one
// of its own nodes' delivery threads, nor while another thread still calls it. Its context must
// outlive it.
#ifndef NIMBO_NODESLAUNCHER_H_
#define NIMBO_NODESLAUNCHER_H_

namespace Nimbo {

class CallbackNode;
class Context;
class LauncherImpl;
class Node;

class NodesLauncher {
public:
    explicit NodesLauncher(const Context& context);
    // Stops every node it launched (all first, so nodes waiting on each other are released), then
    // sends their disconnect notices and deletes them.
    ~NodesLauncher();
    NodesLauncher(const NodesLauncher&) = delete;
    NodesLauncher& operator=(const NodesLauncher&) = delete;

    // True when the node runs. False when it was launched before (here or elsewhere), was stopped
    // before launch, or its thread could not start.
    bool Launch(Node& node);
    bool Launch(CallbackNode& node);

    // Returns S_OK once every Node launched here, callback nodes aside, has stopped; nodes launched
    // while it waits are waited for too.
    long WaitAll();

private:
    LauncherImpl* impl_;
};

}  // namespace Nimbo

#endif  // NIMBO_NODESLAUNCHER_H_
