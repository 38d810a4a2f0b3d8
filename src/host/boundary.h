// The one boundary between the exported C functions and the C++ behind them: no exception crosses
// it, and every entry point treats errors alike.
#pragma once

#include <zqvissvc/types.h>

#include <cstdint>
#include <memory>
#include <type_traits>

#include "host/function_ids.h"

namespace zq::host {

// What an entry point does: a borrowed callable that returns nothing or a code. Alive for the call
// only.
class Body {
  public:
    template <class Callable>
    requires(!std::is_same_v<std::remove_cvref_t<Callable>, Body>)
        // NOLINTNEXTLINE(google-explicit-constructor, bugprone-forwarding-reference-overload)
        Body(Callable&& callable)
        : callable_(const_cast<void*>(static_cast<const void*>(std::addressof(callable)))),
          call_([](void* target) -> std::int32_t {
              auto& body = *static_cast<std::remove_reference_t<Callable>*>(target);
              if constexpr (std::is_void_v<decltype(body())>) {
                  body();
                  return 0;
              } else {
                  return static_cast<std::int32_t>(body());
              }
          }) {}

    std::int32_t operator()() const { return call_(callable_); }

  private:
    void* callable_;
    std::int32_t (*call_)(void*);
};

// For entry points without an error cluster: runs the body and returns its code; a thrown
// GRLIBError_enum is its code, anything else thrown is kNotEnoughMemory.
std::int32_t run_core(Body body) noexcept;

// The same for host-facing entry points: in a thread whose record is inactive nothing happens and
// kSystemError is returned.
std::int32_t run_host(Body body) noexcept;

// For entry points with an error cluster (a null one is tolerated). An error that is already there
// is returned untouched and the body does not run; otherwise the result is reported into the
// cluster under the function's name. In a thread whose record is inactive nothing happens and
// kSystemError is returned.
std::int32_t run_entry(ZqErrorCluster* error, FunctionId function, Body body) noexcept;

// The same for entry points that do their work despite an error that is already there; it is then
// returned untouched.
std::int32_t run_entry_always(ZqErrorCluster* error, FunctionId function, Body body) noexcept;

}  // namespace zq::host
