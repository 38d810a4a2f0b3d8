// Sends every box to the installed procedure, or to the system.
#include "platform/message_box.h"

#include <atomic>

namespace zq::platform {
namespace {

constinit std::atomic<MessageBoxProc> installed{nullptr};

}  // namespace

void show_message_box(const char* caption, const char* text) {
    const MessageBoxProc procedure = installed.load();
    (procedure != nullptr ? procedure : show_system_message_box)(caption, text);
}

MessageBoxProc set_message_box_procedure(MessageBoxProc procedure) {
    return installed.exchange(procedure);
}

}  // namespace zq::platform
