#include "Tarn/Types.h"

#include "Tarn/Parameters.h"
#include "Tarn/TypesImpl.h"

namespace Tarn {

Types::Types(const Nimbo::Context& context) : impl_(new TypesImpl(context)) {
    // The registry is in place before the declarations are read: reading them lets modules
    // declare their types into it.
    impl_->CreateDeclarativeContext(*this);
}

Types::~Types() { delete impl_; }

Parameters Types::CreateParameters() const { return Parameters(*this); }

DeclarativeContext* Types::GetDeclarativeContext() const {
    return impl_->GetDeclarativeContext();
}

}  // namespace Tarn
