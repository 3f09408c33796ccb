// LauncherState: what a NodesLauncher shares with the nodes it launched: the list of them, and
// the signal its WaitAll waits on. Shared, so that a node finishing late never reaches a launcher
// that is gone. Safe from any thread.
#ifndef NIMBO_SRC_LAUNCHERSTATE_H_
#define NIMBO_SRC_LAUNCHERSTATE_H_

#include <condition_variable>
#include <mutex>
#include <vector>

namespace Nimbo {

class Node;

class LauncherState {
public:
    void Add(Node& node);
    // Every node launched so far, in launch order; the list is left empty.
    std::vector<Node*> TakeAll();
    // Called by a node once it stopped and sent its notices.
    void NodeFinished();
    // Until every node on the list, callback nodes aside, has finished.
    void WaitAll();

private:
    std::mutex mutex_;
    std::condition_variable finished_;
    std::vector<Node*> nodes_;
};

}  // namespace Nimbo

#endif  // NIMBO_SRC_LAUNCHERSTATE_H_
