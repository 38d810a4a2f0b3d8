// The host's services as typed calls. A service that the host lacks: the user is told in a message
// box and the call fails (null handle, out of memory, 0). Services that have an exported slot are
// called through it, so that a host can put functions of its own there.
#pragma once

#include <zqvissvc/host.h>

#include <cstddef>
#include <cstdint>
#include <optional>

#include "host/binding.h"

namespace zq::host {

// Status of a host call that failed for want of memory, or because the host lacks the service.
inline constexpr std::int32_t kHostOutOfMemory = 2;

// Element types of numeric_array_resize.
enum class ElementType : std::int32_t { kI16 = 2, kU8 = 5, kU16 = 6, kU32 = 7, kU64 = 8, kSgl = 9 };

ZqHandle az_new_handle(std::int32_t size);
std::int32_t az_set_handle_size(ZqHandle handle, std::int32_t size);
std::int32_t az_get_handle_size(ZqHandle handle);
std::int32_t az_dispose_handle(ZqHandle handle);
ZqHandle ds_new_handle(std::int32_t size);
std::int32_t ds_set_handle_size(ZqHandle handle, std::int32_t size);
std::int32_t ds_get_handle_size(ZqHandle handle);
std::int32_t ds_check_handle(ZqHandle handle);
std::int32_t ds_dispose_handle(ZqHandle handle);
void* ds_new_ptr(std::int32_t size);
std::int32_t ds_dispose_ptr(void* block);
std::int32_t numeric_array_resize(ElementType type, std::int32_t dimensions, ZqHandle* array,
                                  std::size_t elements);
void move_block(const void* source, void* destination, std::int32_t bytes);
std::int32_t str_len(const char* text);
std::int32_t c_to_p_str(const char* text, std::uint8_t* counted);
std::int32_t text_to_path(const char* text, std::int32_t length, ZqPath* path);
ZqPath empty_path(ZqPath path);
std::int32_t add_path(ZqPath base, ZqPath relative, ZqPath result);

// Services that a host may lack without a message box: find() gives null, require() throws
// kNotInitialized.
inline constinit Service<ZqCookieToSessionProc> ts_cookie_to_session{"TSCookieToSesn"};
inline constinit Service<ZqCookieToNameProc> ud_cookie_to_name{"UDCookieToName"};
inline constinit Service<ZqRegisterSessionProc> ud_register_session{"UDRegisterSesn"};
inline constinit Service<ZqRegisterSessionFlattenProc> ud_register_session_flatten{
    "UDRegisterSesnFlatten"};
inline constinit Service<ZqRegisterSessionFlatten2Proc> ud_register_session_flatten2{
    "UDRegisterSesnFlatten2"};
inline constinit Service<ZqRemoveSessionProc> ud_remove_session{"UDRemoveSesn"};
inline constinit Service<ZqUnregisterSessionProc> ud_unregister_session{"UDUnregisterSesn"};
inline constinit Service<ZqSetCleanupProcProc> rt_set_cleanup_proc{"RTSetCleanupProc"};
inline constinit Service<ZqNativeDialogProc> native_dialog_setup{"WNativeDialogSetup"};
inline constinit Service<ZqNativeDialogProc> native_dialog_restore{"WNativeDialogRestore"};

// Bytes of a DS block; none for what the host does not take for one, or when it lacks the services.
std::optional<std::size_t> ds_block_size(ZqHandle handle);

// Any function that the host module exports, or null.
void* find_session_service(const char* name);

}  // namespace zq::host
