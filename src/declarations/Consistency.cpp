#include "declarations/Consistency.h"

#include "Tarn/TypesImpl.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {

long CheckConsistency(Parameters& parameters, const ZelUnicodeString& typeName,
                      const ZelUnicodeString& context) {
    const TypesImpl& types = *ParametersInternal::Impl(parameters).types;
    if (types.GetDeclarativeContext() == nullptr) {
        types.PublishError("Cannot check Parameters consistency, no Tarn::DeclarativeContext - " +
                           context);
        return E_FAIL;
    }
    types.PublishError("Cannot check Parameters consistency, no declarative type for type: " +
                       typeName + " - " + context);
    return E_FAIL;
}

}  // namespace Tarn
