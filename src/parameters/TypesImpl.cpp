#include "Tarn/TypesImpl.h"

#include "Nimbo/PrivateServices.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {

namespace {

// The predefined type "Parameters": the object is itself a bag, and the target becomes a deep copy
// of it, object type included.
long SerializeParameters(Parameters& target, const void* object) {
    if (object == nullptr) return E_FAIL;
    ParametersInternal::Impl(target).CopyFrom(
        ParametersInternal::Impl(*static_cast<const Parameters*>(object)));
    return S_OK;
}

void* UnserializeParameters(const Parameters& source) { return new Parameters(source); }

}  // namespace

TypesImpl::TypesImpl(const Nimbo::Context& context) : context_(context) {
    DeclareType("Parameters", &SerializeParameters, &UnserializeParameters);
}

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
