#include "Tarn/Response.h"

#include <exception>

#include "Nimbo/ResultCodes.h"
#include "Tarn/TypesImpl.h"
#include "parameters/ParametersImpl.h"
#include "protocol/ProtocolMessage.h"

namespace Tarn {

Response::Response() = default;

Response::Response(const Response& other) = default;

Response& Response::operator=(const Response& other) = default;

Response::~Response() = default;

bool Response::HasDomain(const ZelUnicodeString& name) const {
    return first_.count(name) != 0 || second_.count(name) != 0;
}

long Response::CallDomain(const ZelUnicodeString& name, Parameters& p) const {
    auto found = first_.find(name);
    if (found == first_.end()) {
        found = second_.find(name);
        if (found == second_.end()) return E_FAIL;
    }
    return found->second(p);
}

unsigned Response::GetDomainCount() const {
    return static_cast<unsigned>(first_.size() + second_.size());
}

long Response::CallDomains(const Parameters& m) const {
    const ParametersImpl& impl = ParametersInternal::Impl(m);
    const Parameters* domains = impl.FindObject(Protocol::kDomains);
    auto names = impl.stringArrays.find(Protocol::kDomainNames);
    if (domains == nullptr || names == impl.stringArrays.end() || names->second.empty()) {
        return E_FAIL;
    }
    long result = S_OK;
    for (const ZelUnicodeString& name : names->second) {
        if (!HasDomain(name)) continue;
        Parameters* domain = ParametersInternal::Impl(*domains).FindObject(name);
        if (domain == nullptr) continue;
        std::string what;
        try {
            if (CallDomain(name, *domain) < 0) result = E_FAIL;
            continue;
        } catch (const std::exception& e) {
            what = e.what();
        } catch (...) {
            what = "unknown exception";
        }
        impl.types->PublishError("Response callback of domain <" + name +
                                 "> threw an exception: " + what);
        result = E_FAIL;
    }
    return result;
}

}  // namespace Tarn
