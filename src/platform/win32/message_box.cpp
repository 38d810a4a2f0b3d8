// Message boxes of the desktop.
#include "platform/message_box.h"

#include <windows.h>

namespace zq::platform {

void show_system_message_box(const char* caption, const char* text) {
    // No icon: a box may report success as well.
    MessageBoxA(nullptr, text, caption, MB_OK);
}

}  // namespace zq::platform
