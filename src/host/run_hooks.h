// Hooks around the host's run: cleanup procedures, and the bracket around modal dialogs. In a
// thread whose record is inactive, or under a host that lacks the service, nothing happens.
#pragma once

#include <zqvissvc/host.h>

namespace zq::host {

// The host calls the procedure once with the argument when it tears the caller down, unless the
// pair is removed.
void set_cleanup_procedure(ZqCleanupProc procedure, void* argument);
void remove_cleanup_procedure(ZqCleanupProc procedure, void* argument);

void enter_modal_dialog();
void leave_modal_dialog();

// Brackets a modal dialog for a scope; never fails.
class ModalDialog {
  public:
    ModalDialog() noexcept;
    ~ModalDialog();
    ModalDialog(const ModalDialog&) = delete;
    ModalDialog& operator=(const ModalDialog&) = delete;
};

// A message box inside that bracket.
void show_modal_box(const char* caption, const char* text);

}  // namespace zq::host
