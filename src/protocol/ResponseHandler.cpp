#include "protocol/ResponseHandler.h"

#include <exception>

#include "Nimbo/ResultCodes.h"
#include "Tarn/TypesImpl.h"
#include "parameters/ParametersImpl.h"
#include "protocol/ProtocolMessage.h"

namespace Tarn {

class ResponseInternal {
public:
    static unsigned Count(const Response& response) { return response.GetDomainCount(); }
};

long ResponseHandler::Call(Node& node, const Parameters& message,
                           const ZelUnicodeString& what) const {
    const ParametersImpl& impl = ParametersInternal::Impl(message);
    const Parameters* params = impl.FindObject(Protocol::kParams);
    std::string error;
    try {
        if (params != nullptr) {
            if (function != nullptr) return function(node, *params);
            if (callable) return callable(*params);
            if (ResponseInternal::Count(response) == 0) return S_OK;
            return response.CallDomains(*params);
        }
        // Domains at the top level (an emitted Message) only reach a Response.
        if (ResponseInternal::Count(response) == 0) return E_FAIL;
        return response.CallDomains(message);
    } catch (const std::exception& e) {
        error = e.what();
    } catch (...) {
        error = "unknown exception";
    }
    impl.types->PublishError(what + " threw an exception: " + error);
    return E_FAIL;
}

}  // namespace Tarn
