// Services around a run of the caller: the version variable, cleanup procedures, dialogs, scroll
// bars.
#include <zqvissvc/host.h>
#include <zqvissvc/slots.h>

#include <algorithm>
#include <utility>
#include <vector>

#include "refhost.h"
#include "service.h"

namespace refhost {
namespace {

using CleanupPair = std::pair<ZqCleanupProc, void*>;

// Never destroyed: the library may remove procedures while the process is being taken down.
std::vector<CleanupPair>& cleanups() {
    static auto* all = new std::vector<CleanupPair>;
    return *all;
}

int dialog_depth = 0;
int dialog_count = 0;

int32_t set_cleanup(CleanupPair pair, int32_t mode) {
    constexpr int32_t kRemove = 0;
    constexpr int32_t kRegister = 2;
    if (pair.first == nullptr || (mode != kRemove && mode != kRegister)) return kBadArgument;
    const auto found = std::find(cleanups().begin(), cleanups().end(), pair);
    if (mode == kRegister) {
        if (found == cleanups().end()) cleanups().push_back(pair);
        return kOk;
    }
    if (found == cleanups().end()) return kBadArgument;
    cleanups().erase(found);
    return kOk;
}

}  // namespace

size_t cleanup_procs() {
    const std::lock_guard lock(host_mutex());
    return cleanups().size();
}

// One at a time and without the lock: a procedure may call services, and may register or remove
// others.
void run_cleanup() {
    for (;;) {
        CleanupPair next;
        {
            const std::lock_guard lock(host_mutex());
            if (cleanups().empty()) return;
            next = cleanups().back();
            cleanups().pop_back();
        }
        next.first(next.second);
    }
}

int open_dialogs() {
    const std::lock_guard lock(host_mutex());
    return dialog_depth;
}

int dialogs_shown() {
    const std::lock_guard lock(host_mutex());
    return dialog_count;
}

// By this variable the library recognises a program as a host.
REFHOST_EXPORT int32_t gDFRTVersion;
int32_t gDFRTVersion = 1;

REFHOST_EXPORT int32_t ZQ_CALL RTSetCleanupProc(ZqCleanupProc procedure, void* argument,
                                                int32_t mode) {
    return serve(Service::kRTSetCleanupProc, kOutOfMemory, [=] {
        return set_cleanup({procedure, argument}, mode);
    });
}

REFHOST_EXPORT int32_t ZQ_CALL WNativeDialogSetup() {
    return serve(Service::kWNativeDialogSetup, kBadArgument, [] {
        ++dialog_depth;
        ++dialog_count;
        return kOk;
    });
}

REFHOST_EXPORT int32_t ZQ_CALL WNativeDialogRestore() {
    return serve(Service::kWNativeDialogRestore, kBadArgument, [] {
        if (dialog_depth == 0) return kBadArgument;
        --dialog_depth;
        return kOk;
    });
}

// The reference host has no panels, so there is no scroll bar to draw or to follow: the calls are
// counted only.
REFHOST_EXPORT void ZQ_CALL DrawSBar(ZqPort* /*port*/, int32_t, int32_t, int32_t, int32_t, void*,
                                     void*, int32_t, int32_t) {
    serve(Service::kDrawSBar, false, [] { return true; });
}

REFHOST_EXPORT int32_t ZQ_CALL TrackSBarEvent(ZqPort* /*port*/, ZqPoint, int32_t, int32_t, int32_t,
                                              int32_t, void*, void*, int32_t, int32_t) {
    return serve(Service::kTrackSBarEvent, int32_t{0}, [] { return int32_t{0}; });
}

static_assert(has_signature<ZqSetCleanupProcProc>(RTSetCleanupProc));
static_assert(has_signature<ZqNativeDialogProc>(WNativeDialogSetup));
static_assert(has_signature<ZqNativeDialogProc>(WNativeDialogRestore));
static_assert(has_signature<ZqDrawSBarProc>(DrawSBar));
static_assert(has_signature<ZqTrackSBarEventProc>(TrackSBarEvent));

}  // namespace refhost
