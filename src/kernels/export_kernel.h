// How a row kernel, compiled for several sets of vector instructions, becomes one function.
#pragma once

// Defines name(from, to, pixels), which runs the best of them. For namespace zq, once a source.
#define ZQ_EXPORT_ROW_KERNEL(name, From, To)                  \
    HWY_EXPORT(name);                                         \
    void name(const From* from, To* to, std::size_t pixels) { \
        HWY_DYNAMIC_DISPATCH(name)(from, to, pixels);         \
    }                                                         \
    static_assert(true, "wants a semicolon")

// The same for kernels that can write past the cache: name(from, to, pixels, stores).
#define ZQ_EXPORT_WIDE_ROW_KERNEL(name, From, To)                            \
    HWY_EXPORT(name);                                                        \
    void name(const From* from, To* to, std::size_t pixels, Stores stores) { \
        HWY_DYNAMIC_DISPATCH(name)(from, to, pixels, stores);                \
    }                                                                        \
    static_assert(true, "wants a semicolon")
