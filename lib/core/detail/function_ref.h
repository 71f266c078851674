// A reference to a callable, for parameters that are called before the function returns. It owns nothing.
#ifndef TAVO_CORE_DETAIL_FUNCTION_REF_H
#define TAVO_CORE_DETAIL_FUNCTION_REF_H

#include <type_traits>

namespace tavo {

template <class Signature>
class FunctionRef;

template <class Result, class... Args>
class FunctionRef<Result(Args...)> {
  public:
    template <class Function>
    requires(!std::is_same_v<std::remove_cvref_t<Function>, FunctionRef>) FunctionRef(Function &&function)
    noexcept
        : object_(const_cast<void *>(static_cast<const void *>(&function))),
          call_([](void *object, Args... args) -> Result {
              return (*static_cast<std::remove_reference_t<Function> *>(object))(static_cast<Args>(args)...);
          })
    {
    }

    Result operator()(Args... args) const { return call_(object_, static_cast<Args>(args)...); }

  private:
    void *object_;
    Result (*call_)(void *, Args...);
};

}  // namespace tavo

#endif
