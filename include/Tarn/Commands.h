// Tarn::Commands: the per-process root of the library.
//
// A Commands owns (or borrows) the kernel context, the type registry with its declarations, the
// node pools and every node created through them, the kernel's node launcher and, once started,
// the hypervisor. Destroying it first cuts every node off from its kernel node, so that no message
// reaches the library any more, then stops the nodes and releases everything in order.
//
// Its operations may be called from any thread; pools and nodes stay valid until it is destroyed.
#ifndef TARN_COMMANDS_H_
#define TARN_COMMANDS_H_

#include "Tarn/Export.h"
#include "ZelUnicodeString.h"

namespace Nimbo {
class Context;
class HypervisorSettings;
}  // namespace Nimbo

namespace Tarn {

class CommandsImpl;
class CommandsInternal;
class Parameters;
class Pool;
class Response;
class Types;

class TARN_EXPORT Commands {
public:
    // Borrows `context`, which must outlive this object.
    explicit Commands(const Nimbo::Context& context);
    // Creates and owns a kernel context.
    Commands();
    ~Commands();
    Commands(const Commands&) = delete;
    Commands& operator=(const Commands&) = delete;

    // The pool of that name, created (and its deployed commands discovered) on first use.
    Pool& GetPool(const ZelUnicodeString& name);
    Parameters CreateParameters() const;

    long Execute(const ZelUnicodeString& name, int policy);
    long HypervisorExecute(const ZelUnicodeString& name);
    bool HasHypervisor();
    // Starts the hypervisor and listens; a second start fails. The plain form reports success
    // whatever the kernel says; the settings form returns the kernel's first failure.
    long StartHypervisor();
    long StartHypervisor(const Nimbo::HypervisorSettings& settings);
    // Waits until every node made by Pool::CreateNode has stopped, then forgets their kernel
    // nodes; callback nodes keep running.
    long WaitAll();

    Response& GetDefaultResponse();

private:
    friend class CommandsInternal;
    Types& GetTypes() const;

    CommandsImpl* impl_;
};

}  // namespace Tarn

#endif  // TARN_COMMANDS_H_
