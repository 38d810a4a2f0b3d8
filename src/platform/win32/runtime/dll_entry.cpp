// Where the system enters the DLL.
#include <windows.h>

extern "C" {

// The run-time's own entry: sets up the run-time, and runs the destructors of static objects.
BOOL WINAPI DllMainCRTStartup(HINSTANCE module, DWORD reason, void* reserved);

// When the whole process ends, its other threads have been stopped wherever they were: with a lock
// held, or half through a change of a table. Nothing is tidied up then; the system takes it all.
BOOL WINAPI zqvissvc_dll_entry(HINSTANCE module, DWORD reason, void* reserved) {
    const bool process_ends = reason == DLL_PROCESS_DETACH && reserved != nullptr;
    return process_ends ? TRUE : DllMainCRTStartup(module, reason, reserved);
}

}  // extern "C"
