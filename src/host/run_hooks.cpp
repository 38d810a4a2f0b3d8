// Cleanup procedures and the bracket around modal dialogs.
#include "host/run_hooks.h"

#include <cstdint>

#include "host/boundary.h"
#include "host/services.h"
#include "host/thread_record.h"
#include "platform/message_box.h"

namespace zq::host {
namespace {

enum class CleanupMode : std::int32_t { kRemove = 0, kRegister = 2 };

void change_cleanup(ZqCleanupProc procedure, void* argument, CleanupMode mode) {
    if (!thread_is_active()) return;
    if (auto change = rt_set_cleanup_proc.find()) {
        change(procedure, argument, static_cast<std::int32_t>(mode));
    }
}

void tell_host(Service<ZqNativeDialogProc>& service) {
    if (!thread_is_active()) return;
    if (auto tell = service.find()) tell();
}

}  // namespace

void set_cleanup_procedure(ZqCleanupProc procedure, void* argument) {
    change_cleanup(procedure, argument, CleanupMode::kRegister);
}

void remove_cleanup_procedure(ZqCleanupProc procedure, void* argument) {
    change_cleanup(procedure, argument, CleanupMode::kRemove);
}

void enter_modal_dialog() {
    tell_host(native_dialog_setup);
}
void leave_modal_dialog() {
    tell_host(native_dialog_restore);
}

// A dialog that reports a failure is shown even when there is no memory left for the bracket.
ModalDialog::ModalDialog() noexcept {
    run_core([] { enter_modal_dialog(); });
}
ModalDialog::~ModalDialog() {
    run_core([] { leave_modal_dialog(); });
}

void show_modal_box(const char* caption, const char* text) {
    const ModalDialog bracket;
    platform::show_message_box(caption, text);
}

}  // namespace zq::host
