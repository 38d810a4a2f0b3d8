// The host's services as typed calls.
#include "host/services.h"

#include <zqvissvc/slots.h>

#include <algorithm>
#include <type_traits>

#include "host/module.h"

namespace zq::host {
namespace {

constinit Service<ZqNewHandleProc> g_ds_new_handle{"DSNewHandle"};
constinit Service<ZqSetHandleSizeProc> g_ds_set_handle_size{"DSSetHandleSize"};
constinit Service<ZqGetHandleSizeProc> g_ds_get_handle_size{"DSGetHandleSize"};
constinit Service<ZqCheckHandleProc> g_ds_check_handle{"DSCheckHandle"};
constinit Service<ZqNewPtrProc> g_ds_new_ptr{"DSNewPtr"};
constinit Service<ZqDisposePtrProc> g_ds_dispose_ptr{"DSDisposePtr"};
constinit Service<ZqNumericArrayResizeProc> g_numeric_array_resize{"NumericArrayResize"};

// Calls through an exported slot; null is a host that does not offer the service.
template <class Result, class... Arguments>
Result call_slot(Result (*slot)(Arguments...), Result failure,
                 std::type_identity_t<Arguments>... arguments) {
    return slot == nullptr ? failure : slot(arguments...);
}

}  // namespace

ZqHandle az_new_handle(std::int32_t size) {
    return call_slot(Dataflux::AZNewHandle_EX, ZqHandle{}, size);
}
std::int32_t az_set_handle_size(ZqHandle handle, std::int32_t size) {
    return call_slot(Dataflux::AZSetHandleSize_EX, kHostOutOfMemory, handle, size);
}
std::int32_t az_get_handle_size(ZqHandle handle) {
    return call_slot(Dataflux::AZGetHandleSize_EX, 0, handle);
}
std::int32_t az_dispose_handle(ZqHandle handle) {
    return call_slot(Dataflux::AZDisposeHandle_EX, kHostOutOfMemory, handle);
}

ZqHandle ds_new_handle(std::int32_t size) {
    return g_ds_new_handle.call_or(nullptr, size);
}
std::int32_t ds_set_handle_size(ZqHandle handle, std::int32_t size) {
    return g_ds_set_handle_size.call_or(kHostOutOfMemory, handle, size);
}
std::int32_t ds_get_handle_size(ZqHandle handle) {
    return g_ds_get_handle_size.call_or(0, handle);
}
std::optional<std::size_t> ds_block_size(ZqHandle handle) {
    const ZqCheckHandleProc check = g_ds_check_handle.find();
    const ZqGetHandleSizeProc size_of = g_ds_get_handle_size.find();
    if (check == nullptr || size_of == nullptr || check(handle) != 0) return std::nullopt;
    return static_cast<std::size_t>(std::max(size_of(handle), 0));
}
std::int32_t ds_check_handle(ZqHandle handle) {
    return g_ds_check_handle.call_or(kHostOutOfMemory, handle);
}
std::int32_t ds_dispose_handle(ZqHandle handle) {
    return call_slot(Dataflux::DSDisposeHandle_EX, kHostOutOfMemory,
                     reinterpret_cast<void**>(handle));
}
void* ds_new_ptr(std::int32_t size) {
    return g_ds_new_ptr.call_or(nullptr, size);
}
std::int32_t ds_dispose_ptr(void* block) {
    return g_ds_dispose_ptr.call_or(kHostOutOfMemory, block);
}

std::int32_t numeric_array_resize(ElementType type, std::int32_t dimensions, ZqHandle* array,
                                  std::size_t elements) {
    return g_numeric_array_resize.call_or(kHostOutOfMemory, static_cast<std::int32_t>(type),
                                          dimensions, array, elements);
}

void move_block(const void* source, void* destination, std::int32_t bytes) {
    if (Dataflux::MoveBlock_EX != nullptr) Dataflux::MoveBlock_EX(source, destination, bytes);
}
std::int32_t str_len(const char* text) {
    return call_slot(Dataflux::StrLen_EX, 0, text);
}
std::int32_t c_to_p_str(const char* text, std::uint8_t* counted) {
    return call_slot(Dataflux::CToPStr_EX, kHostOutOfMemory, text, counted);
}

std::int32_t text_to_path(const char* text, std::int32_t length, ZqPath* path) {
    return call_slot(Dataflux::FTextToPath_EX, kHostOutOfMemory, text, length, path);
}
ZqPath empty_path(ZqPath path) {
    return call_slot(Dataflux::FEmptyPath_EX, ZqPath{}, path);
}
std::int32_t add_path(ZqPath base, ZqPath relative, ZqPath result) {
    return call_slot(Dataflux::FAddPath_EX, kHostOutOfMemory, base, relative, result);
}

void* find_session_service(const char* name) {
    platform::ModuleHandle module = host_module();
    return module == nullptr ? nullptr : platform::find_symbol(module, name);
}

}  // namespace zq::host
