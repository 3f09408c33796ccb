// Tarn::Pool: a named set of nodes. Every node created through a pool carries the pool's name as
// its kernel name, and other nodes find it by that name. A pool also holds the commands served
// in-process by its nodes. Pools are owned by their Commands; their operations may be called from
// any thread.
#ifndef TARN_POOL_H_
#define TARN_POOL_H_

#include <functional>

#include "Tarn/Export.h"
#include "ZelUnicodeString.h"

namespace Nimbo {
class NodeSettings;
}

namespace Tarn {

class CommandInterface;
class CommandsImpl;
class InProcessCommand;
class Node;
class PoolImpl;

class TARN_EXPORT Pool {
public:
    // A node on a kernel node that the launcher waits for; null when it cannot be launched.
    Node* CreateNode();
    Node* CreateNode(const Nimbo::NodeSettings& settings);
    Node* CreateNode(Nimbo::NodeSettings& settings);
    // A node on a kernel callback node, which keeps running after WaitAll.
    Node* CreateCallbackNode();
    Node* CreateCallbackNode(const Nimbo::NodeSettings& settings);
    Node* CreateCallbackNode(Nimbo::NodeSettings& settings);
    void deprecated();

    // Serves `command` (owned by the pool from now on, also on failure) for `name` and `version`
    // on every node of this pool, before any deployed command of that name and version. Fails
    // when that name and version are registered already, or for an empty name or null command.
    long RegisterCommand(const ZelUnicodeString& name, int version, InProcessCommand* command);
    // Serves in-process one instance per call, made by `factory` and released with delete: a
    // command written for a module runs here unchanged.
    long RegisterCommand(const ZelUnicodeString& name, int version,
                         std::function<CommandInterface*(Node&)> factory);

    const ZelUnicodeString& GetName() const;

private:
    friend class CommandsImpl;
    friend class PoolInternal;
    Pool(const ZelUnicodeString& name, CommandsImpl& commands);
    ~Pool();
    Pool(const Pool&) = delete;
    Pool& operator=(const Pool&) = delete;

    PoolImpl* impl_;
};

}  // namespace Tarn

#endif  // TARN_POOL_H_
