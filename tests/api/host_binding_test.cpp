// The exported slots and function variables, the per-thread record, the hooks around a host's run.
#include <gtest/gtest.h>
#include <zqvissvc/errors.h>
#include <zqvissvc/host.h>
#include <zqvissvc/slots.h>
#include <zqvissvc/values.h>

#include <climits>
#include <cstring>
#include <string>
#include <thread>
#include <vector>

#include "refhost/refhost.h"

extern "C" int32_t DSSetHandleSize(ZqHandle handle, int32_t size);

namespace {

TEST(HostSlotsTest, ThirteenAreBoundAndTheRestAreTheHosts) {
    using namespace Dataflux;
    EXPECT_TRUE(AZNewHandle_EX && AZSetHandleSize_EX && AZGetHandleSize_EX && AZDisposeHandle_EX &&
                DSDisposeHandle_EX && MoveBlock_EX && StrLen_EX && CToPStr_EX && FTextToPath_EX &&
                FEmptyPath_EX && FAddPath_EX && DrawSBar_EX && TrackSBarEvent_EX);
    EXPECT_FALSE(FDestroyPath_EX || FGetSpecialDir_EX || CallInstrument_EX ||
                 CallInstrumentForPIPre_EX || CallInstrumentForPIPost_EX || CreatePIMenu_EX ||
                 DestroyPIMenu_EX || EnablePIMenuItem_EX || DisablePIMenuItem_EX ||
                 RemovePIMenuItem_EX || CheckPIMenuItem_EX || InsertPIMenu_EX ||
                 InsertPIMenuItem_EX || InsertPIGlobalColorMenu_EX || FinishPIGlobalColorMenu_EX);
    EXPECT_FALSE(GetPIBounds_EX || GetPIClusterPartBounds_EX || GetPIDataPtr_EX ||
                 GetPIGraphicsPort_EX || InvalPICtl_EX || IsPIClientPanel_EX ||
                 IsPIClusterPartShown_EX || IsPIOwnedBy_EX || MoveToPIClusterPart_EX ||
                 SetPIClusterPartPopUp_EX || SetPIClusterPartSize_EX || SetPIMouseCursor_EX ||
                 AutoSetPITool_EX || ShouldAutoSetPITool_EX || ShowHidePIClusterPart_EX ||
                 ShrinkWrapPICluster_EX || ShowHidePIPart_EX);
}

TEST(HostSlotsTest, BoundSlotsReachTheHost) {
    ZqHandle handle = Dataflux::AZNewHandle_EX(3);
    ASSERT_NE(handle, nullptr);
    std::memcpy(*handle, "abc", 3);
    EXPECT_EQ(Dataflux::AZSetHandleSize_EX(handle, 6), 0);
    EXPECT_EQ(Dataflux::AZGetHandleSize_EX(handle), 6);
    Dataflux::MoveBlock_EX(*handle, *handle + 1, 3);
    EXPECT_EQ(std::memcmp(*handle, "aabc", 4), 0);
    uint8_t counted[8];
    EXPECT_EQ(Dataflux::CToPStr_EX("xyz", counted), 0);
    EXPECT_EQ(counted[0], Dataflux::StrLen_EX("xyz"));
    EXPECT_EQ(Dataflux::AZDisposeHandle_EX(handle), 0);
    ZqStringHandle string = refhost::new_string("x");
    EXPECT_EQ(Dataflux::DSDisposeHandle_EX(reinterpret_cast<void**>(string)), 0);
    EXPECT_EQ(refhost::live_handles(), 0U);
}

TEST(HostThreadRecordTest, IsEachThreadsOwn) {
    ZqThreadRecordData* mine = ZqThreadRecord();
    mine->active = 0;
    std::thread([mine] {
        const ZqThreadRecordData* other = ZqThreadRecord();
        EXPECT_NE(other, mine);
        EXPECT_EQ(other->kind, 2);
        EXPECT_EQ(other->reserved, 0);
        EXPECT_EQ(other->reservedByte, 0);
        EXPECT_EQ(other->active, 1);
        EXPECT_EQ(other->activeByte, 1);
        EXPECT_EQ(other->index, -1);
    }).join();
    EXPECT_EQ(ZqThreadRecord(), mine);
    EXPECT_EQ(mine->active, 0);
    mine->active = 1;
}

TEST(HostThreadRecordTest, InactiveThreadDoesNothing) {
    refhost::String source("before");
    ZqErrorCluster error{.status = 0, .code = 0, .source = source.get()};
    const int dialogs = refhost::dialogs_shown();
    ZqThreadRecord()->active = 0;
    EXPECT_EQ(ZqProcessResult(-1, &error, 313), ZQ_ERR_SYSTEM);
    EXPECT_EQ(DF_ProcessError(-1, &error, 313), ZQ_ERR_SYSTEM);
    EXPECT_EQ(DF_ProcessErrorWithVIName(-1, &error, "x"), ZQ_ERR_SYSTEM);
    EXPECT_EQ(DF_CreateErrorCluster(-1, "x", &error), ZQ_ERR_SYSTEM);
    ZqImageValue value{};
    ZqImageHandle image = nullptr;
    EXPECT_EQ(ZqLookUpImage(&value, &image), ZQ_ERR_SYSTEM);
    EXPECT_EQ(DF_DFDTToImage(&value, &value), ZQ_ERR_SYSTEM);
    EXPECT_EQ(DF_ImageToDFDT(&value, &value), ZQ_ERR_SYSTEM);
    EXPECT_EQ(SetImageCookies(nullptr, 1), ZQ_ERR_SYSTEM);
    EXPECT_EQ(SetCleanupProc([](void*) {}, nullptr), 0);
    EXPECT_EQ(EnterModalDialog(), 0);
    EXPECT_EQ(LeaveModalDialog(), 0);
    ZqThreadRecord()->active = 1;
    EXPECT_EQ(error.status, 0);
    EXPECT_EQ(source.text(), "before");
    EXPECT_EQ(refhost::cleanup_procs(), 0U);
    EXPECT_EQ(refhost::dialogs_shown(), dialogs);
}

TEST(HostHooksTest, RegisteredProceduresRunOnceAndRemovedOnesDoNot) {
    const ZqCleanupProc count = [](void* argument) { ++*static_cast<int*>(argument); };
    int kept = 0;
    int removed = 0;
    EXPECT_EQ(SetCleanupProc(count, &kept), 0);
    EXPECT_EQ(SetCleanupProc(count, &removed), 0);
    EXPECT_EQ(RemoveCleanupProc(count, &removed), 0);
    refhost::run_cleanup();
    refhost::run_cleanup();
    EXPECT_EQ(kept, 1);
    EXPECT_EQ(removed, 0);
    refhost::refuse("RTSetCleanupProc", -1);
    EXPECT_EQ(SetCleanupProc(count, &kept), 0) << "what the host says does not matter";
}

TEST(HostStringTest, SetsAndCopiesWithHandlesThatMove) {
    refhost::String target;
    EXPECT_EQ(DF_SetString(target.out(), "some text", 9), 0);
    EXPECT_EQ(target.text(), "some text");
    EXPECT_EQ(DF_SetString(target.out(), "a\0b", 3), 0);
    EXPECT_EQ(target.text(), std::string("a\0b", 3));
    EXPECT_EQ(DF_StringCopy(target.out(), target.get()), 0) << "onto itself";
    refhost::String copy("older and longer");
    EXPECT_EQ(DF_StringCopy(copy.out(), target.get()), 0);
    EXPECT_EQ(copy.text(), std::string("a\0b", 3));
    EXPECT_EQ(DF_SetString(copy.out(), nullptr, -4), 0);
    EXPECT_EQ(copy.text(), "");
    EXPECT_EQ(DF_StringCopy(target.out(), nullptr), 0);
    EXPECT_EQ(target.text(), "");
    (*target.get())->length = -5;
    EXPECT_EQ(DF_StringCopy(copy.out(), target.get()), 0) << "a length that cannot be";
    EXPECT_EQ(copy.text(), "");
    EXPECT_EQ(DF_SetString(target.out(), "", 0), 0);
    EXPECT_EQ((*target.get())->length, 0);
    // Blocks without room for a count yet, which garbage stands in for.
    for (refhost::String* string : {&target, &copy}) {
        ASSERT_EQ(DF_SetString(string->out(), "abc", 3), 0);
        ASSERT_EQ(DSSetHandleSize(reinterpret_cast<ZqHandle>(string->get()), 0), 0);
    }
    EXPECT_EQ(DF_StringCopy(copy.out(), target.get()), 0);
    EXPECT_EQ(DF_SetString(target.out(), "", 0), 0);
    for (const refhost::String* string : {&target, &copy}) EXPECT_EQ(string->text(), "");
}

TEST(HostStringTest, FailureLeavesTheStringAsItWas) {
    refhost::String target("kept");
    const refhost::String source("other");
    EXPECT_EQ(DF_SetString(nullptr, "x", 1), ZQ_ERR_NULL_POINTER);
    EXPECT_EQ(DF_StringCopy(nullptr, source.get()), ZQ_ERR_NULL_POINTER);
    EXPECT_EQ(DF_SetString(target.out(), nullptr, 1), ZQ_ERR_NULL_POINTER);
    refhost::refuse("NumericArrayResize", 2);
    EXPECT_EQ(DF_SetString(target.out(), "longer than before", 18), ZQ_ERR_NOT_ENOUGH_MEMORY);
    EXPECT_EQ(DF_StringCopy(target.out(), source.get()), ZQ_ERR_NOT_ENOUGH_MEMORY);
    EXPECT_EQ(target.text(), "kept");
}

TEST(CEnvironmentTest, RectanglesSaturate) {
    struct Case {
        ZqCoordinates corners;
        ZqRect rect;
        ZqCoordinates back;
    };
    const Case cases[] = {
        {{1, 2, 11, 22}, {1, 2, 10, 20}, {1, 2, 11, 22}},
        {{5, 5, 5, 2}, {5, 5, 0, -3}, {5, 5, 5, 2}},
        {{INT_MIN, -1, INT_MAX, INT_MAX},
         {INT_MIN, -1, INT_MAX, INT_MAX},
         {INT_MIN, -1, -1, INT_MAX - 1}},
        {{INT_MAX, 1, INT_MIN, INT_MIN},
         {INT_MAX, 1, INT_MIN, INT_MIN},
         {INT_MAX, 1, -1, INT_MIN + 1}},
        {{0, 0, INT_MAX, INT_MAX}, {0, 0, INT_MAX, INT_MAX}, {0, 0, INT_MAX, INT_MAX}},
    };
    for (const Case& c : cases) {
        ZqRect rect{};
        ZqCoordinates back{};
        EXPECT_EQ(TKR_CoordToRect(&c.corners, &rect), 0);
        EXPECT_EQ(TKR_RectToCoord(&rect, &back), 0);
        EXPECT_EQ(std::memcmp(&rect, &c.rect, sizeof rect), 0);
        EXPECT_EQ(std::memcmp(&back, &c.back, sizeof back), 0);
    }
    const ZqRect far{INT_MAX, INT_MIN, 5, -5};
    ZqCoordinates corners{};
    EXPECT_EQ(TKR_RectToCoord(&far, &corners), 0);
    EXPECT_EQ(corners.right, INT_MAX);
    EXPECT_EQ(corners.bottom, INT_MIN);
    EXPECT_EQ(TKR_CoordToRect(nullptr, nullptr), ZQ_ERR_NULL_POINTER);
    EXPECT_EQ(TKR_RectToCoord(&far, nullptr), ZQ_ERR_NULL_POINTER);
}

std::vector<uint8_t> block(ZqHandle handle) {
    if (handle == nullptr) return {};
    return {*handle, *handle + *refhost::handle_size(handle)};
}

// Dimension counts, little-endian, then the elements.
TEST(CEnvironmentTest, CopiesMemoryBehindItsCounts) {
    const uint8_t source[] = {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16};
    refhost::Owned<ZqHandle> array;
    struct Case {
        int32_t element_size, rows, columns;  // rows -1: one dimension
        std::vector<uint8_t> counts;
    };
    const Case cases[] = {
        {1, -1, 5, {5, 0, 0, 0}},
        {2, -1, 8, {8, 0, 0, 0}},
        {8, -1, 2, {2, 0, 0, 0}},
        {3, -1, 4, {4, 0, 0, 0}},
        {4, 2, 2, {2, 0, 0, 0, 2, 0, 0, 0}},
        {1, 3, 0, {3, 0, 0, 0, 0, 0, 0, 0}},
        {16, 1, 1, {1, 0, 0, 0, 1, 0, 0, 0}},
    };
    for (const Case& c : cases) {
        std::vector<uint8_t> expected = c.counts;
        const int elements = c.rows < 0 ? c.columns : c.rows * c.columns;
        expected.insert(expected.end(), source, source + elements * c.element_size);
        EXPECT_EQ(c.rows < 0
                      ? TKR_PtrToArray1D(source, c.element_size, c.columns, array.out())
                      : TKR_PtrToArray2D(source, c.element_size, c.rows, c.columns, array.out()),
                  0);
        EXPECT_EQ(block(array.get()), expected);
    }
    EXPECT_EQ(TKR_PtrToArray1D(nullptr, 1, 0, array.out()), 0) << "no elements, no source";
    EXPECT_EQ(block(array.get()), std::vector<uint8_t>(4, 0));
}

TEST(CEnvironmentTest, RefusesWhatItCannotCopyAndKeepsTheArray) {
    const uint8_t source[4] = {};
    refhost::Owned<ZqHandle> array;
    ASSERT_EQ(TKR_PtrToArray1D("ab", 1, 2, array.out()), 0);
    const std::vector<uint8_t> before = block(array.get());
    struct Case {
        const void* source;
        int32_t element_size, rows, columns, code;
    };
    const Case cases[] = {
        {nullptr, 1, 1, 1, ZQ_ERR_NULL_POINTER},
        {source, 0, 1, 1, ZQ_ERR_INVALID_PARAMETER},
        {source, -1, 1, 1, ZQ_ERR_INVALID_PARAMETER},
        {source, 1, -1, 1, ZQ_ERR_INVALID_PARAMETER},
        {source, 1, 1, -1, ZQ_ERR_INVALID_PARAMETER},
        {source, 1, INT_MAX, INT_MAX, ZQ_ERR_NOT_ENOUGH_MEMORY},
        {source, INT_MAX, INT_MAX, INT_MAX, ZQ_ERR_NOT_ENOUGH_MEMORY},
        {source, INT_MAX - 7, 1, 1, ZQ_ERR_NOT_ENOUGH_MEMORY},
        {source, 2, 1 << 15, 1 << 15, ZQ_ERR_NOT_ENOUGH_MEMORY},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(TKR_PtrToArray2D(c.source, c.element_size, c.rows, c.columns, array.out()),
                  c.code);
        EXPECT_EQ(block(array.get()), before);
    }
    EXPECT_EQ(TKR_PtrToArray1D(source, 1, -1, array.out()), ZQ_ERR_INVALID_PARAMETER);
    EXPECT_EQ(TKR_PtrToArray1D(source, 1, 1, nullptr), ZQ_ERR_NULL_POINTER);
    refhost::refuse("NumericArrayResize");
    EXPECT_EQ(TKR_PtrToArray1D(source, 1, 4, array.out()), ZQ_ERR_NOT_ENOUGH_MEMORY);
    EXPECT_EQ(block(array.get()), before);
}

}  // namespace
