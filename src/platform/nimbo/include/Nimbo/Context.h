// Nimbo::Context: a registry of launched nodes. Applications usually have one; contexts never see
// each other's nodes. A Context must outlive every launcher, node and hypervisor made from it.
#ifndef NIMBO_CONTEXT_H_
#define NIMBO_CONTEXT_H_

namespace Nimbo {

class ContextImpl;

class Context {
public:
    Context();
    ~Context();
    Context(const Context&) = delete;
    Context& operator=(const Context&) = delete;

    // The kernel's own state of this context.
    ContextImpl& GetImpl() const { return *impl_; }

private:
    ContextImpl* impl_;
};

}  // namespace Nimbo

#endif  // NIMBO_CONTEXT_H_
