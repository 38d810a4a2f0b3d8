// Host functions bound by name when they are first called, and bound again when the host module is
// another one.
#pragma once

#include <atomic>
#include <cstdint>

#include "base/error_codes.h"
#include "platform/module.h"

namespace zq::host {

// One function's name and where it was found last. Threads may have different host modules, so
// module and address are read and written as a pair, guarded by a sequence number that is odd while
// a writer is at work.
class Binding {
  public:
    constexpr explicit Binding(const char* name) : name_(name) {}
    Binding(const Binding&) = delete;
    Binding& operator=(const Binding&) = delete;

    // Address of the function in the calling thread's host module, or null.
    void* find();

    // The same; tells the user in a message box before it returns null.
    void* find_or_report();

  private:
    void* cached(platform::ModuleHandle module) const;
    void remember(platform::ModuleHandle module, void* address);

    const char* name_;
    std::atomic<std::uint32_t> sequence_{0};
    std::atomic<platform::ModuleHandle> module_{nullptr};
    std::atomic<void*> address_{nullptr};
};

template <class Function>
class Service;

// A bound function with its signature.
template <class Result, class... Arguments>
class Service<Result (*)(Arguments...)> {
  public:
    using Function = Result (*)(Arguments...);
    constexpr explicit Service(const char* name) : binding_(name) {}

    // Null when the host lacks the service.
    Function find() { return reinterpret_cast<Function>(binding_.find()); }

    // Throws kNotInitialized when the host lacks the service.
    Function require() {
        Function function = find();
        if (function == nullptr) {
            throw kNotInitialized;
        }
        return function;
    }

    // Calls the service; when the host lacks it, tells the user and returns `failure`.
    Result call_or(Result failure, Arguments... arguments) {
        auto function = reinterpret_cast<Function>(binding_.find_or_report());
        return function == nullptr ? failure : function(arguments...);
    }

  private:
    Binding binding_;
};

template <class... Arguments>
class Service<void (*)(Arguments...)> {
  public:
    using Function = void (*)(Arguments...);
    constexpr explicit Service(const char* name) : binding_(name) {}

    // Calls the service; when the host lacks it, tells the user.
    void call(Arguments... arguments) {
        auto function = reinterpret_cast<Function>(binding_.find_or_report());
        if (function != nullptr) {
            function(arguments...);
        }
    }

  private:
    Binding binding_;
};

}  // namespace zq::host
