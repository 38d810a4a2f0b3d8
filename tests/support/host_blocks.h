// Arrays of strings and plain blocks as a host holds them.
#pragma once

#include <zqvissvc/types.h>

#include <functional>
#include <string>
#include <vector>

#include "refhost/refhost.h"

namespace zqtest {

// An array of strings as a host holds it.
class Keys : public refhost::Owned<ZqStringArrayHandle> {
  public:
    ~Keys() {
        each([](ZqStringHandle string) { refhost::dispose(string); });
    }
    std::vector<std::string> texts() const {
        std::vector<std::string> all;
        each([&](ZqStringHandle string) { all.push_back(refhost::text(string)); });
        return all;
    }

  private:
    void each(const std::function<void(ZqStringHandle)>& visit) const {
        for (int32_t i = 0; get() != nullptr && i < (*get())->count; ++i) {
            visit((*get())->elements[i]);
        }
    }
};

// A host block without a count.
class Block : public refhost::Owned<ZqHandle> {
  public:
    explicit Block(ZqHandle handle = nullptr) : Owned(handle) {}
    std::string bytes() const {
        if (get() == nullptr) return {};
        return {reinterpret_cast<const char*>(*get()), refhost::handle_size(get()).value()};
    }
};

}  // namespace zqtest
