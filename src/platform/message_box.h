// Message boxes. Windows shows a real one without an owner; elsewhere the text goes to standard
// error. A program without a desktop installs a procedure of its own, which then gets every box.
#pragma once

namespace zq::platform {

using MessageBoxProc = void (*)(const char* caption, const char* text);

void show_message_box(const char* caption, const char* text);

// The system's own box, whatever is installed.
void show_system_message_box(const char* caption, const char* text);

// Returns the procedure installed before; null restores the system's own box. Threads: atomic.
MessageBoxProc set_message_box_procedure(MessageBoxProc procedure);

}  // namespace zq::platform
