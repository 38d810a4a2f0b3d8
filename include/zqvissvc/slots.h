/* The callback slots that a host fills, the function variables through which sibling libraries call
 * this one, and the hooks around a host's run. */
#ifndef ZQVISSVC_SLOTS_H
#define ZQVISSVC_SLOTS_H

#include "errors.h"
#include "host.h"

/* Types of the host that this library passes on and never looks into. */
typedef struct ZqPort ZqPort;             /* where the host draws */
typedef struct ZqBaseMenu ZqBaseMenu;     /* a menu */
typedef struct ZqHostRect ZqHostRect;     /* the host's own rectangle */
typedef int32_t ZqMenuType;               /* MenuTypeEnum */
typedef int32_t ZqPlugInClientPanelCheck; /* PlugInClientPanelToCheck */
typedef struct ZqPoint {
    int16_t vertical;
    int16_t horizontal;
} ZqPoint;
typedef void(ZQ_CALL* ZqColorProc)(void); /* the host casts it to the type that it calls */

/* Signatures that several slots share, or that the library calls. Unnamed values are the host's. */
typedef void(ZQ_CALL* ZqDrawSBarProc)(ZqPort*, int32_t, int32_t, int32_t, int32_t, void*, void*,
                                      int32_t, int32_t);
typedef int32_t(ZQ_CALL* ZqTrackSBarEventProc)(ZqPort*, ZqPoint, int32_t, int32_t, int32_t, int32_t,
                                               void*, void*, int32_t, int32_t);
typedef int32_t(ZQ_CALL* ZqMenuItemProc)(ZqBaseMenu* menu, int32_t item);
typedef int32_t(ZQ_CALL* ZqFiveValuesProc)(int32_t, int32_t, int32_t, int32_t, int32_t);

/* ---- Callback slots: variables that the host may set before other threads enter the library.
 * Null: the host does not offer the service. The bound ones start as functions that find the host's
 * function of the same name when they are called, and tell the user in a message box when there is
 * none; the others start null. Status results are 0 on success, a host error number otherwise. */
#ifdef __cplusplus
namespace Dataflux {
#endif
ZQ_BEGIN_C

/* Bound. */
extern ZQ_DATA ZqNewHandleProc AZNewHandle_EX;
extern ZQ_DATA ZqSetHandleSizeProc AZSetHandleSize_EX;
extern ZQ_DATA ZqGetHandleSizeProc AZGetHandleSize_EX;
extern ZQ_DATA ZqDisposeHandleProc AZDisposeHandle_EX;
/* Takes the handle itself, whatever it holds. */
extern ZQ_DATA int(ZQ_CALL* DSDisposeHandle_EX)(void** handle);
extern ZQ_DATA ZqMoveBlockProc MoveBlock_EX;
extern ZQ_DATA ZqStrLenProc StrLen_EX;
extern ZQ_DATA ZqCToPStrProc CToPStr_EX;
extern ZQ_DATA ZqTextToPathProc FTextToPath_EX;
extern ZQ_DATA ZqEmptyPathProc FEmptyPath_EX;
extern ZQ_DATA ZqAddPathProc FAddPath_EX;
extern ZQ_DATA ZqDrawSBarProc DrawSBar_EX;
extern ZQ_DATA ZqTrackSBarEventProc TrackSBarEvent_EX;

/* Set by the host: paths and calls of instruments. */
extern ZQ_DATA void(ZQ_CALL* FDestroyPath_EX)(ZqPath* path);
extern ZQ_DATA int32_t(ZQ_CALL* FGetSpecialDir_EX)(int32_t selector, ZqPath* path);
extern ZQ_DATA int32_t(ZQ_CALL* CallInstrument_EX)(void* instrument, int32_t, int32_t, int32_t,
                                                   ...);
extern ZQ_DATA int32_t(ZQ_CALL* CallInstrumentForPIPre_EX)(void);
extern ZQ_DATA int32_t(ZQ_CALL* CallInstrumentForPIPost_EX)(void);

/* Set by the host: menus of plug-in controls. */
extern ZQ_DATA int32_t(ZQ_CALL* CreatePIMenu_EX)(ZqBaseMenu** menu, const char* name, ZqMenuType,
                                                 int32_t* out);
extern ZQ_DATA ZqMenuItemProc DestroyPIMenu_EX;
extern ZQ_DATA ZqMenuItemProc EnablePIMenuItem_EX;
extern ZQ_DATA ZqMenuItemProc DisablePIMenuItem_EX;
extern ZQ_DATA ZqMenuItemProc RemovePIMenuItem_EX;
extern ZQ_DATA int32_t(ZQ_CALL* CheckPIMenuItem_EX)(ZqBaseMenu* menu, int32_t item,
                                                    int32_t checked);
extern ZQ_DATA int32_t(ZQ_CALL* InsertPIMenu_EX)(int32_t control, ZqBaseMenu** menu,
                                                 ZqBaseMenu* parent, int32_t position);
extern ZQ_DATA int32_t(ZQ_CALL* InsertPIMenuItem_EX)(int32_t control, ZqBaseMenu* menu,
                                                     const char* text, int32_t, int32_t, void*,
                                                     int32_t* out);
extern ZQ_DATA int32_t(ZQ_CALL* InsertPIGlobalColorMenu_EX)(int32_t control, ZqBaseMenu* menu,
                                                            int32_t position, uint32_t color1,
                                                            uint32_t color2, int32_t,
                                                            ZqColorProc callback, int32_t, int32_t);
extern ZQ_DATA int32_t(ZQ_CALL* FinishPIGlobalColorMenu_EX)(int32_t, int32_t, int32_t);

/* Set by the host: controls, the parts of clusters, tools. Unnamed values are the host's. */
extern ZQ_DATA int32_t(ZQ_CALL* GetPIBounds_EX)(int32_t, int32_t, int32_t, ZqHostRect* bounds);
extern ZQ_DATA int32_t(ZQ_CALL* GetPIClusterPartBounds_EX)(int32_t, int32_t, int32_t, int32_t,
                                                           ZqHostRect* bounds);
extern ZQ_DATA int32_t(ZQ_CALL* GetPIDataPtr_EX)(int32_t, int32_t, int32_t, int32_t, void** data);
extern ZQ_DATA int32_t(ZQ_CALL* GetPIGraphicsPort_EX)(int32_t control, ZqPort** port);
extern ZQ_DATA int32_t(ZQ_CALL* InvalPICtl_EX)(int32_t, int32_t, int32_t);
extern ZQ_DATA int32_t(ZQ_CALL* IsPIClientPanel_EX)(int32_t control, ZqPlugInClientPanelCheck,
                                                    int32_t* out);
extern ZQ_DATA int32_t(ZQ_CALL* IsPIClusterPartShown_EX)(int32_t, int32_t, int32_t, int32_t,
                                                         int32_t* out);
extern ZQ_DATA int32_t(ZQ_CALL* IsPIOwnedBy_EX)(int32_t, int32_t, int32_t* out);
extern ZQ_DATA int32_t(ZQ_CALL* MoveToPIClusterPart_EX)(int32_t, int32_t, int32_t, int32_t,
                                                        ZqPoint position);
extern ZQ_DATA ZqFiveValuesProc SetPIClusterPartPopUp_EX;
extern ZQ_DATA int32_t(ZQ_CALL* SetPIClusterPartSize_EX)(int32_t, int32_t, int32_t, int32_t,
                                                         uint32_t width, uint32_t height);
extern ZQ_DATA int32_t(ZQ_CALL* SetPIMouseCursor_EX)(int32_t, int32_t);
extern ZQ_DATA int32_t(ZQ_CALL* AutoSetPITool_EX)(int32_t, void*, void*);
extern ZQ_DATA int32_t(ZQ_CALL* ShouldAutoSetPITool_EX)(int32_t, void*, int32_t* out);
extern ZQ_DATA ZqFiveValuesProc ShowHidePIClusterPart_EX;
extern ZQ_DATA ZqFiveValuesProc ShrinkWrapPICluster_EX;
extern ZQ_DATA int32_t(ZQ_CALL* ShowHidePIPart_EX)(int32_t, int32_t, int32_t, int32_t);

ZQ_END_C
#ifdef __cplusplus
} /* namespace Dataflux */
#endif

ZQ_BEGIN_C

/* ---- Function variables: they point at this library's own functions. Errors are returned as codes
 * of errors.h; on failure what was to be written is unchanged. */

/* ZqProcessResult. */
extern ZQ_DATA int32_t(ZQ_CALL* DF_ProcessError)(int32_t code, ZqErrorCluster* error,
                                                 int32_t functionId);

/* Finds a function of the host by its exported name, which is borrowed. Returns 0;
 * ZQ_ERR_NULL_POINTER; or, with *function null, ZQ_ERR_NOT_INITIALIZED when the host does not have
 * it. */
extern ZQ_DATA int32_t(ZQ_CALL* DF_GetFunction)(const char* name, void** function);

/* Makes *target (a null handle is given a block, owned by the caller) hold `length` bytes from
 * plain memory; a negative length is 0, and the bytes may then be null. Returns 0,
 * ZQ_ERR_NULL_POINTER or ZQ_ERR_NOT_ENOUGH_MEMORY. */
extern ZQ_DATA int32_t(ZQ_CALL* DF_SetString)(ZqStringHandle* target, const void* bytes,
                                              int32_t length);

/* Makes *target hold a copy of another host string (null: empty). Results as DF_SetString. */
extern ZQ_DATA int32_t(ZQ_CALL* DF_StringCopy)(ZqStringHandle* target, ZqStringHandle source);

/* Rectangles by corners into rectangles by size and back; what does not fit 32 bits is held at the
 * nearest value that does. Return 0 or ZQ_ERR_NULL_POINTER. */
extern ZQ_DATA int32_t(ZQ_CALL* TKR_CoordToRect)(const ZqCoordinates* corners, ZqRect* rect);
extern ZQ_DATA int32_t(ZQ_CALL* TKR_RectToCoord)(const ZqRect* rect, ZqCoordinates* corners);

/* Copy plain memory into a host array: the dimension counts as 32-bit values, then the elements
 * with nothing between. source       borrowed; count (or rows * columns, rows one after the other)
 * elements; may be null when there are none. elementSize  bytes; at least 1. array        written;
 * a null handle is given a block, owned by the caller. Return 0, ZQ_ERR_NULL_POINTER,
 * ZQ_ERR_INVALID_PARAMETER (a negative count, an element size below 1) or ZQ_ERR_NOT_ENOUGH_MEMORY.
 */
extern ZQ_DATA int32_t(ZQ_CALL* TKR_PtrToArray1D)(const void* source, int32_t elementSize,
                                                  int32_t count, ZqHandle* array);
extern ZQ_DATA int32_t(ZQ_CALL* TKR_PtrToArray2D)(const void* source, int32_t elementSize,
                                                  int32_t rows, int32_t columns, ZqHandle* array);

/* ---- Hooks around a host's run. All return 0 in every case: under a host without the service, and
 * in a thread whose record is inactive, nothing happens. Threads: safe as far as the host's
 * services are. */

/* Has the host call `procedure` once with `argument` when it tears the caller down;
 * RemoveCleanupProc takes that back. */
ZQ_API int32_t ZQ_CALL SetCleanupProc(ZqCleanupProc procedure, void* argument);
ZQ_API int32_t ZQ_CALL RemoveCleanupProc(ZqCleanupProc procedure, void* argument);

/* Tell the host that a modal dialog is about to be shown, and that it is gone. */
ZQ_API int32_t ZQ_CALL EnterModalDialog(void);
ZQ_API int32_t ZQ_CALL LeaveModalDialog(void);

/* ---- For sibling libraries (by ordinal only on Windows). */

/* What the library keeps for each thread. The owner of a thread may set `active` to 0: host-facing
 * entry points called from it then do nothing. */
typedef struct ZqThreadRecordData {
    int32_t kind; /* 2 */
    int32_t reserved;
    uint8_t reservedByte;
    int32_t active;     /* 1 */
    uint8_t activeByte; /* 1 */
    int32_t index;      /* -1 */
} ZqThreadRecordData;
ZQ_ASSERT_OFFSET(ZqThreadRecordData, active, 12);
ZQ_ASSERT_OFFSET(ZqThreadRecordData, index, 20);

/* The calling thread's record, made on first use and valid until the thread ends; null when out of
 * memory. */
ZQ_API ZqThreadRecordData* ZQ_CALL ZqThreadRecord(void);

ZQ_END_C

#endif
