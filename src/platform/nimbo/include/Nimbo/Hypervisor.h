// Nimbo::Hypervisor: the process's link to an outside supervisor, and how it runs named tasks.
//
// In-process, starting a hypervisor only makes it known (Context::HasHypervisor() is true until it
// is destroyed); listening on a web socket and executing tasks are not available yet and answer
// E_NOTIMPL. A Hypervisor is used from one thread at a time; its context must outlive it.
#ifndef NIMBO_HYPERVISOR_H_
#define NIMBO_HYPERVISOR_H_

#include "ZelUnicodeString.h"

namespace Nimbo {

class Context;

// How Execute runs a named task. Callers often hold the policy as an int and cast it.
enum ExecutePolicy : int {
    kExecuteDefault = 0,  // as the task's own declaration says
    kExecuteAsync = 1,    // start it and return
    kExecuteWait = 2,     // return once it ended
};

class HypervisorSettings {
public:
    HypervisorSettings() = default;

    // The port ListenOnWebSocket will listen on; 0 lets the system choose.
    HypervisorSettings& SetWebSocketPort(int port) {
        port_ = port;
        return *this;
    }
    int GetWebSocketPort() const { return port_; }

private:
    int port_ = 0;
};

class Hypervisor {
public:
    explicit Hypervisor(const Context& context);
    Hypervisor(const Context& context, const HypervisorSettings& settings);
    ~Hypervisor();
    Hypervisor(const Hypervisor&) = delete;
    Hypervisor& operator=(const Hypervisor&) = delete;

    // S_OK on the first call, S_FALSE when already started.
    long Start();
    long ListenOnWebSocket();
    long Execute(const ZelUnicodeString& name, ExecutePolicy policy);

    const HypervisorSettings& GetSettings() const { return settings_; }

private:
    HypervisorSettings settings_;
    bool started_ = false;
};

}  // namespace Nimbo

#endif  // NIMBO_HYPERVISOR_H_
