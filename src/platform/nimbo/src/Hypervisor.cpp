#include "Nimbo/Hypervisor.h"

#include "ContextImpl.h"
#include "Nimbo/ResultCodes.h"

namespace Nimbo {

Hypervisor::Hypervisor(const Context& context) : Hypervisor(context, HypervisorSettings()) {}

Hypervisor::Hypervisor(const Context&, const HypervisorSettings& settings) : settings_(settings) {}

Hypervisor::~Hypervisor() {
    if (started_) ContextImpl::StartedHypervisors().fetch_sub(1);
}

long Hypervisor::Start() {
    if (started_) return S_FALSE;
    started_ = true;
    ContextImpl::StartedHypervisors().fetch_add(1);
    return S_OK;
}

long Hypervisor::ListenOnWebSocket() { return E_NOTIMPL; }

long Hypervisor::Execute(const ZelUnicodeString&, ExecutePolicy) { return E_NOTIMPL; }

}  // namespace Nimbo
