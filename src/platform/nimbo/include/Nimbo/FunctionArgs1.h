// Nimbo::FunctionArgs1<R, A>: a one-argument callable. It binds a plain function, an object with
// one of its member functions, or any callable (a lambda with captures). An empty FunctionArgs1
// converts to false; calling it returns a value-initialised R, and so does one bound to a null
// function, a null object or a null member. Copies share the bound callable (a stateful lambda
// keeps one state across every copy), which must be safe to call from the threads that call the
// copies.
#ifndef NIMBO_FUNCTIONARGS1_H_
#define NIMBO_FUNCTIONARGS1_H_

#include <functional>
#include <memory>
#include <type_traits>
#include <utility>

namespace Nimbo {

template <typename R, typename A>
class FunctionArgs1 {
public:
    using Function = R (*)(A);

    FunctionArgs1() = default;
    FunctionArgs1(Function function) {  // NOLINT: a plain function converts implicitly
        if (function != nullptr) Bind(function);
    }
    template <typename T>
    FunctionArgs1(T* object, R (T::*member)(A)) {
        if (object == nullptr || member == nullptr) return;
        Bind([object, member](A argument) -> R {
            return (object->*member)(std::forward<A>(argument));
        });
    }
    template <typename T>
    FunctionArgs1(const T* object, R (T::*member)(A) const) {
        if (object == nullptr || member == nullptr) return;
        Bind([object, member](A argument) -> R {
            return (object->*member)(std::forward<A>(argument));
        });
    }
    template <typename F,
              typename = std::enable_if_t<!std::is_same<std::decay_t<F>, FunctionArgs1>::value &&
                                          !std::is_convertible<F, Function>::value &&
                                          std::is_invocable_r<R, F&, A>::value>>
    FunctionArgs1(F&& callable) {  // NOLINT: any callable converts implicitly
        Bind(std::forward<F>(callable));
    }

    explicit operator bool() const { return static_cast<bool>(call_); }

    R operator()(A argument) const {
        if (!call_) return R();
        return (*call_)(std::forward<A>(argument));
    }

private:
    // An empty std::function (or one made from a null pointer) leaves this empty.
    template <typename F>
    void Bind(F&& callable) {
        std::function<R(A)> call(std::forward<F>(callable));
        if (call) call_ = std::make_shared<const std::function<R(A)>>(std::move(call));
    }

    std::shared_ptr<const std::function<R(A)>> call_;
};

}  // namespace Nimbo

#endif  // NIMBO_FUNCTIONARGS1_H_
