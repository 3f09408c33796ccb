#include "Nimbo/Context.h"

#include "ContextImpl.h"

namespace Nimbo {

Context::Context() : impl_(new ContextImpl()) {}

Context::~Context() { delete impl_; }

}  // namespace Nimbo
