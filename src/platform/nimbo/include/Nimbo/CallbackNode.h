// Nimbo::CallbackNode: a node that serves the application's callbacks rather than the process's
// lifetime.
//
// It is a Node in every respect (launch, delivery, sending, stopping, ownership by its launcher),
// except that NodesLauncher::WaitAll does not wait for it: a process whose server nodes all stopped
// may end while its callback nodes still run. It takes a name only, no settings.
#ifndef NIMBO_CALLBACKNODE_H_
#define NIMBO_CALLBACKNODE_H_

#include "Nimbo/Node.h"

namespace Nimbo {

class CallbackNode : public Node {
public:
    explicit CallbackNode(const ZelUnicodeString& name) : Node(name, CallbackKind()) {}
};

}  // namespace Nimbo

#endif  // NIMBO_CALLBACKNODE_H_
