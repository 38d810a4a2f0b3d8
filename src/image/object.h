// What the registry holds: an object with a lock that outlives it.
#pragma once

#include <memory>

#include "image/object_gate.h"

namespace zq {

// Nothing but the table of operations, so that a derived class decides what lies behind it.
class Object {
  public:
    Object() = default;
    virtual ~Object() = default;
    Object(const Object&) = delete;
    Object& operator=(const Object&) = delete;

    // Never null.
    virtual const std::shared_ptr<ObjectGate>& gate() const = 0;
};

}  // namespace zq
