// Memory services: handles of the AZ and DS heaps, fixed blocks, numeric arrays, byte moves.
#include <zqvissvc/host.h>

#include <array>
#include <cstring>

#include "heap.h"
#include "service.h"

namespace refhost {
namespace {

ZqHandle new_handle(Service service, Pool pool, int32_t size) {
    return serve(service, ZqHandle{}, [=] { return heap().make(pool, size); });
}

int32_t set_size(Service service, Pool pool, ZqHandle handle, int32_t size) {
    return serve(service, kOutOfMemory,
                 [=] { return heap().resize(pool, handle, size, service_name(service)); });
}

int32_t get_size(Service service, Pool pool, ZqHandle handle) {
    return serve(service, int32_t{0},
                 [=] { return heap().size(pool, handle, service_name(service)); });
}

int32_t dispose_handle(Service service, Pool pool, ZqHandle handle) {
    return serve(service, kBadArgument,
                 [=] { return heap().dispose(pool, handle, service_name(service)); });
}

// Bytes of one element by type code; 0 for a code that is no number.
size_t element_size(int32_t type_code) {
    constexpr std::array<size_t, 11> kSizes = {0, 1, 2, 4, 8, 1, 2, 4, 8, 4, 8};
    return type_code >= 0 && type_code < std::ssize(kSizes)
               ? kSizes.at(static_cast<size_t>(type_code))
               : 0;
}

int32_t resize_array(int32_t type_code, int32_t dimensions, ZqHandle* array, size_t elements,
                     const char* service) {
    constexpr int32_t kMaxDimensions = 64;
    const size_t element = element_size(type_code);
    if (element == 0 || dimensions < 1 || dimensions > kMaxDimensions || array == nullptr)
        return kBadArgument;
    if (elements > INT32_MAX) return kOutOfMemory;
    const int64_t size = int64_t{dimensions} * int64_t{sizeof(int32_t)} +
                         static_cast<int64_t>(elements * uint64_t{element});
    return heap().reserve(array, size, service);
}

}  // namespace

REFHOST_EXPORT ZqHandle ZQ_CALL AZNewHandle(int32_t size) {
    return new_handle(Service::kAZNewHandle, Pool::kApplication, size);
}

REFHOST_EXPORT int32_t ZQ_CALL AZSetHandleSize(ZqHandle handle, int32_t size) {
    return set_size(Service::kAZSetHandleSize, Pool::kApplication, handle, size);
}

REFHOST_EXPORT int32_t ZQ_CALL AZGetHandleSize(ZqHandle handle) {
    return get_size(Service::kAZGetHandleSize, Pool::kApplication, handle);
}

REFHOST_EXPORT int32_t ZQ_CALL AZDisposeHandle(ZqHandle handle) {
    return dispose_handle(Service::kAZDisposeHandle, Pool::kApplication, handle);
}

REFHOST_EXPORT ZqHandle ZQ_CALL DSNewHandle(int32_t size) {
    return new_handle(Service::kDSNewHandle, Pool::kData, size);
}

REFHOST_EXPORT int32_t ZQ_CALL DSSetHandleSize(ZqHandle handle, int32_t size) {
    return set_size(Service::kDSSetHandleSize, Pool::kData, handle, size);
}

REFHOST_EXPORT int32_t ZQ_CALL DSGetHandleSize(ZqHandle handle) {
    return get_size(Service::kDSGetHandleSize, Pool::kData, handle);
}

REFHOST_EXPORT int32_t ZQ_CALL DSDisposeHandle(ZqHandle handle) {
    return dispose_handle(Service::kDSDisposeHandle, Pool::kData, handle);
}

REFHOST_EXPORT int32_t ZQ_CALL DSCheckHandle(ZqHandle handle) {
    return serve(Service::kDSCheckHandle, kBadArgument,
                 [=] { return heap().is_live(Pool::kData, handle) ? kOk : kBadArgument; });
}

REFHOST_EXPORT void* ZQ_CALL DSNewPtr(int32_t size) {
    return serve(Service::kDSNewPtr, static_cast<void*>(nullptr),
                 [=] { return heap().make_block(size); });
}

REFHOST_EXPORT int32_t ZQ_CALL DSDisposePtr(void* block) {
    return serve(Service::kDSDisposePtr, kBadArgument,
                 [=] { return heap().dispose_block(block, "DSDisposePtr"); });
}

REFHOST_EXPORT int32_t ZQ_CALL NumericArrayResize(int32_t type_code, int32_t dimensions,
                                                  ZqHandle* array, size_t elements) {
    return serve(Service::kNumericArrayResize, kOutOfMemory, [=] {
        return resize_array(type_code, dimensions, array, elements, "NumericArrayResize");
    });
}

REFHOST_EXPORT void ZQ_CALL MoveBlock(const void* source, void* destination, int32_t bytes) {
    serve(Service::kMoveBlock, false, [=] {
        if (source == nullptr || destination == nullptr || bytes <= 0) return false;
        std::memmove(destination, source, static_cast<size_t>(bytes));
        return true;
    });
}

static_assert(has_signature<ZqNewHandleProc>(AZNewHandle));
static_assert(has_signature<ZqSetHandleSizeProc>(AZSetHandleSize));
static_assert(has_signature<ZqGetHandleSizeProc>(AZGetHandleSize));
static_assert(has_signature<ZqDisposeHandleProc>(AZDisposeHandle));
static_assert(has_signature<ZqNewHandleProc>(DSNewHandle));
static_assert(has_signature<ZqSetHandleSizeProc>(DSSetHandleSize));
static_assert(has_signature<ZqGetHandleSizeProc>(DSGetHandleSize));
static_assert(has_signature<ZqDisposeHandleProc>(DSDisposeHandle));
static_assert(has_signature<ZqCheckHandleProc>(DSCheckHandle));
static_assert(has_signature<ZqNewPtrProc>(DSNewPtr));
static_assert(has_signature<ZqDisposePtrProc>(DSDisposePtr));
static_assert(has_signature<ZqNumericArrayResizeProc>(NumericArrayResize));
static_assert(has_signature<ZqMoveBlockProc>(MoveBlock));

}  // namespace refhost
