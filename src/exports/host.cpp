// Exported: how a host introduces itself, hooks around its run, the thread's record.
#include <zqvissvc/host.h>
#include <zqvissvc/slots.h>

#include "host/boundary.h"
#include "host/module.h"
#include "host/run_hooks.h"
#include "host/thread_record.h"

using namespace zq::host;

void ZQ_CALL SetDFRTModule(void* module) {
    set_host_module(module);
}
void ZQ_CALL SetZqVisSvcDFRTModule(void* module) {
    set_host_module(module);
}
void ZQ_CALL SetDFRTTLSIndex(int32_t index) {
    set_host_thread_slot(index);
}
void ZQ_CALL SetZqVisSvcDFRTTLSIndex(int32_t index) {
    set_host_thread_slot(index);
}

int32_t ZQ_CALL SetCleanupProc(ZqCleanupProc procedure, void* argument) {
    run_core([&] { set_cleanup_procedure(procedure, argument); });
    return 0;
}

int32_t ZQ_CALL RemoveCleanupProc(ZqCleanupProc procedure, void* argument) {
    run_core([&] { remove_cleanup_procedure(procedure, argument); });
    return 0;
}

int32_t ZQ_CALL EnterModalDialog(void) {
    run_core([] { enter_modal_dialog(); });
    return 0;
}

int32_t ZQ_CALL LeaveModalDialog(void) {
    run_core([] { leave_modal_dialog(); });
    return 0;
}

ZqThreadRecordData* ZQ_CALL ZqThreadRecord(void) {
    ZqThreadRecordData* record = nullptr;
    run_core([&] { record = &thread_record(); });
    return record;
}
