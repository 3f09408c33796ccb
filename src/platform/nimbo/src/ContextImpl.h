// The state behind a Nimbo::Context.
#ifndef NIMBO_SRC_CONTEXTIMPL_H_
#define NIMBO_SRC_CONTEXTIMPL_H_

namespace Nimbo {

class ContextImpl {
public:
    ContextImpl() = default;
};

}  // namespace Nimbo

#endif  // NIMBO_SRC_CONTEXTIMPL_H_
