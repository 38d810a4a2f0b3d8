// The exported callback slots. Thirteen start as stubs that bind the host's function when they are
// called.
#include <zqvissvc/slots.h>

#include "host/services.h"

namespace {

using zq::host::kHostOutOfMemory;
using zq::host::Service;

constinit Service<ZqNewHandleProc> g_az_new_handle{"AZNewHandle"};
constinit Service<ZqSetHandleSizeProc> g_az_set_handle_size{"AZSetHandleSize"};
constinit Service<ZqGetHandleSizeProc> g_az_get_handle_size{"AZGetHandleSize"};
constinit Service<ZqDisposeHandleProc> g_az_dispose_handle{"AZDisposeHandle"};
constinit Service<ZqDisposeHandleProc> g_ds_dispose_handle{"DSDisposeHandle"};
constinit Service<ZqMoveBlockProc> g_move_block{"MoveBlock"};
constinit Service<ZqStrLenProc> g_str_len{"StrLen"};
constinit Service<ZqCToPStrProc> g_c_to_p_str{"CToPStr"};
constinit Service<ZqTextToPathProc> g_text_to_path{"FTextToPath"};
constinit Service<ZqEmptyPathProc> g_empty_path{"FEmptyPath"};
constinit Service<ZqAddPathProc> g_add_path{"FAddPath"};
constinit Service<ZqDrawSBarProc> g_draw_bar{"DrawSBar"};
constinit Service<ZqTrackSBarEventProc> g_track_bar{"TrackSBarEvent"};

ZqHandle ZQ_CALL az_new_handle(int32_t size) {
    return g_az_new_handle.call_or(nullptr, size);
}
int32_t ZQ_CALL az_set_handle_size(ZqHandle handle, int32_t size) {
    return g_az_set_handle_size.call_or(kHostOutOfMemory, handle, size);
}
int32_t ZQ_CALL az_get_handle_size(ZqHandle handle) {
    return g_az_get_handle_size.call_or(0, handle);
}
int32_t ZQ_CALL az_dispose_handle(ZqHandle handle) {
    return g_az_dispose_handle.call_or(kHostOutOfMemory, handle);
}
int ZQ_CALL ds_dispose_handle(void** handle) {
    return g_ds_dispose_handle.call_or(kHostOutOfMemory, reinterpret_cast<ZqHandle>(handle));
}
void ZQ_CALL move_block(const void* source, void* destination, int32_t bytes) {
    g_move_block.call(source, destination, bytes);
}
int32_t ZQ_CALL str_len(const char* text) {
    return g_str_len.call_or(0, text);
}
int32_t ZQ_CALL c_to_p_str(const char* text, uint8_t* counted) {
    return g_c_to_p_str.call_or(kHostOutOfMemory, text, counted);
}
int32_t ZQ_CALL text_to_path(const char* text, int32_t length, ZqPath* path) {
    return g_text_to_path.call_or(kHostOutOfMemory, text, length, path);
}
ZqPath ZQ_CALL empty_path(ZqPath path) {
    return g_empty_path.call_or(nullptr, path);
}
int32_t ZQ_CALL add_path(ZqPath base, ZqPath relative, ZqPath result) {
    return g_add_path.call_or(kHostOutOfMemory, base, relative, result);
}
void ZQ_CALL draw_bar(ZqPort* port, int32_t a, int32_t b, int32_t c, int32_t d, void* e, void* f,
                      int32_t g, int32_t h) {
    g_draw_bar.call(port, a, b, c, d, e, f, g, h);
}
int32_t ZQ_CALL track_bar(ZqPort* port, ZqPoint point, int32_t a, int32_t b, int32_t c, int32_t d,
                          void* e, void* f, int32_t g, int32_t h) {
    return g_track_bar.call_or(0, port, point, a, b, c, d, e, f, g, h);
}

}  // namespace

namespace Dataflux {
extern "C" {

ZqNewHandleProc AZNewHandle_EX = az_new_handle;
ZqSetHandleSizeProc AZSetHandleSize_EX = az_set_handle_size;
ZqGetHandleSizeProc AZGetHandleSize_EX = az_get_handle_size;
ZqDisposeHandleProc AZDisposeHandle_EX = az_dispose_handle;
decltype(DSDisposeHandle_EX) DSDisposeHandle_EX = ds_dispose_handle;
ZqMoveBlockProc MoveBlock_EX = move_block;
ZqStrLenProc StrLen_EX = str_len;
ZqCToPStrProc CToPStr_EX = c_to_p_str;
ZqTextToPathProc FTextToPath_EX = text_to_path;
ZqEmptyPathProc FEmptyPath_EX = empty_path;
ZqAddPathProc FAddPath_EX = add_path;
ZqDrawSBarProc DrawSBar_EX = draw_bar;
ZqTrackSBarEventProc TrackSBarEvent_EX = track_bar;

// NOLINTNEXTLINE(bugprone-macro-parentheses): a declared name takes none.
#define ZQ_HOST_SLOT(name) decltype(name) name = nullptr
ZQ_HOST_SLOT(FDestroyPath_EX);
ZQ_HOST_SLOT(FGetSpecialDir_EX);
ZQ_HOST_SLOT(CallInstrument_EX);
ZQ_HOST_SLOT(CallInstrumentForPIPre_EX);
ZQ_HOST_SLOT(CallInstrumentForPIPost_EX);
ZQ_HOST_SLOT(CreatePIMenu_EX);
ZQ_HOST_SLOT(DestroyPIMenu_EX);
ZQ_HOST_SLOT(EnablePIMenuItem_EX);
ZQ_HOST_SLOT(DisablePIMenuItem_EX);
ZQ_HOST_SLOT(RemovePIMenuItem_EX);
ZQ_HOST_SLOT(CheckPIMenuItem_EX);
ZQ_HOST_SLOT(InsertPIMenu_EX);
ZQ_HOST_SLOT(InsertPIMenuItem_EX);
ZQ_HOST_SLOT(InsertPIGlobalColorMenu_EX);
ZQ_HOST_SLOT(FinishPIGlobalColorMenu_EX);
ZQ_HOST_SLOT(GetPIBounds_EX);
ZQ_HOST_SLOT(GetPIClusterPartBounds_EX);
ZQ_HOST_SLOT(GetPIDataPtr_EX);
ZQ_HOST_SLOT(GetPIGraphicsPort_EX);
ZQ_HOST_SLOT(InvalPICtl_EX);
ZQ_HOST_SLOT(IsPIClientPanel_EX);
ZQ_HOST_SLOT(IsPIClusterPartShown_EX);
ZQ_HOST_SLOT(IsPIOwnedBy_EX);
ZQ_HOST_SLOT(MoveToPIClusterPart_EX);
ZQ_HOST_SLOT(SetPIClusterPartPopUp_EX);
ZQ_HOST_SLOT(SetPIClusterPartSize_EX);
ZQ_HOST_SLOT(SetPIMouseCursor_EX);
ZQ_HOST_SLOT(AutoSetPITool_EX);
ZQ_HOST_SLOT(ShouldAutoSetPITool_EX);
ZQ_HOST_SLOT(ShowHidePIClusterPart_EX);
ZQ_HOST_SLOT(ShrinkWrapPICluster_EX);
ZQ_HOST_SLOT(ShowHidePIPart_EX);
#undef ZQ_HOST_SLOT

}  // extern "C"
}  // namespace Dataflux
