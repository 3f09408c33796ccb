#include "Tarn/TypesImpl.h"

#include "Nimbo/PrivateServices.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {

TypesImpl::TypesImpl(const Nimbo::Context& context) : context_(context) {}

TypesImpl::~TypesImpl() {}

void TypesImpl::CreateDeclarativeContext(Types&) {
    // The declarations are read from the deployment once that reader exists; until then a
    // registry holds none.
}

void TypesImpl::ClearParameters(Parameters& parameters) const {
    ParametersInternal::Impl(parameters).Clear();
}

void TypesImpl::PublishError(const ZelUnicodeString& message) const {
    Nimbo::PrivateServices::PublishError(context_, message, "TarnCommandBinder");
}

void TypesImpl::Monitor(Nimbo::Node& node, const ZelUnicodeString& text, long code) const {
    Nimbo::PrivateServices::Monitor(node, text, code);
}

}  // namespace Tarn
