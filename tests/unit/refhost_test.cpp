// The reference host finds what a faulty client does. The other tests rely on it.
#include "refhost/refhost.h"

#include <gtest/gtest.h>

#include <array>
#include <functional>
#include <string>
#include <thread>

extern "C" {
ZqHandle AZNewHandle(int32_t size);
int32_t AZDisposeHandle(ZqHandle handle);
ZqHandle DSNewHandle(int32_t size);
int32_t DSSetHandleSize(ZqHandle handle, int32_t size);
int32_t DSGetHandleSize(ZqHandle handle);
int32_t DSCheckHandle(ZqHandle handle);
int32_t DSDisposeHandle(ZqHandle handle);
void* DSNewPtr(int32_t size);
int32_t DSDisposePtr(void* block);
int32_t NumericArrayResize(int32_t type, int32_t dimensions, ZqHandle* array, size_t elements);
int32_t CToPStr(const char* text, uint8_t* counted);
int32_t FTextToPath(const char* text, int32_t length, ZqPath* path);
int32_t FAddPath(ZqPath base, ZqPath relative, ZqPath result);
int32_t UDRegisterSesn(const char* type, const ZqImageValue* value, uint32_t* cookie);
int32_t UDCookieToName(const char* type, uint32_t cookie, ZqStringHandle* name, void** pointer);
int32_t UDUnregisterSesn(const char* type, const ZqImageValue* value);
int32_t TSCookieToSesn(const char* type, const ZqImageValue* value, void** pointer);
int32_t RTSetCleanupProc(ZqCleanupProc procedure, void* argument, int32_t mode);
}

namespace {

TEST(RefHost, NamesEveryFaultOfAClient) {
    struct Case {
        const char* name;
        size_t refhost::Report::*count;
        std::function<void()> fault;
    };
    const std::array cases = {
        Case{"leaked handle", &refhost::Report::leaked_handles, [] { AZNewHandle(3); }},
        Case{"leaked block", &refhost::Report::leaked_blocks, [] { DSNewPtr(3); }},
        Case{"leaked path", &refhost::Report::leaked_paths,
             [] {
                 ZqPath path = nullptr;
                 FTextToPath("a", 1, &path);
             }},
        Case{"double free", &refhost::Report::double_frees,
             [] {
                 ZqHandle handle = DSNewHandle(8);
                 DSDisposeHandle(handle);
                 EXPECT_EQ(DSDisposeHandle(handle), 1);
             }},
        Case{"stale use", &refhost::Report::stale_uses,
             [] {
                 ZqHandle handle = DSNewHandle(8);
                 DSDisposeHandle(handle);
                 EXPECT_EQ(DSSetHandleSize(handle, 9), 1);
             }},
        Case{"double free of a block", &refhost::Report::double_frees,
             [] {
                 void* block = DSNewPtr(8);
                 DSDisposePtr(block);
                 EXPECT_EQ(DSDisposePtr(block), 1);
             }},
        Case{"never a handle", &refhost::Report::foreign_uses,
             [] {
                 uint8_t* nothing = nullptr;
                 EXPECT_EQ(DSGetHandleSize(&nothing), 0);
             }},
        Case{"other heap", &refhost::Report::foreign_uses,
             [] {
                 ZqHandle handle = AZNewHandle(8);
                 EXPECT_EQ(DSDisposeHandle(handle), 1);
                 EXPECT_EQ(AZDisposeHandle(handle), 0);
             }},
#if !defined(__SANITIZE_ADDRESS__)  // which stops at the write itself
        Case{"write into a block left behind", &refhost::Report::stale_writes,
             [] {
                 ZqHandle handle = DSNewHandle(8);
                 volatile uint8_t* stale = *handle;
                 DSSetHandleSize(handle, 16);
                 stale[7] = 1;
                 DSDisposeHandle(handle);
             }},
#endif
    };
    for (const Case& one : cases) {
        SCOPED_TRACE(one.name);
        one.fault();
        const refhost::Report report = refhost::finish();
        EXPECT_EQ(report.*one.count, 1U) << report.details;
        EXPECT_TRUE(refhost::finish().clean()) << "reported twice";
    }
}

TEST(RefHost, MovesOnResizeAndKeepsTheContents) {
    ZqHandle handle = nullptr;
    ASSERT_EQ(NumericArrayResize(6, 2, &handle, 3), 0);
    EXPECT_EQ(DSGetHandleSize(handle), 2 * 4 + 3 * 2);
    const uint8_t* before = *handle;
    (*handle)[13] = 77;
    ASSERT_EQ(NumericArrayResize(6, 2, &handle, 4), 0);
    EXPECT_NE(*handle, before);
    EXPECT_EQ((*handle)[13], 77);
    EXPECT_EQ((*handle)[15], 0xCD);
    EXPECT_EQ(DSCheckHandle(handle), 0);

    for (const auto& [type, dimensions, elements, status] : {std::tuple{0, 1, size_t{1}, 1},
                                                             {11, 1, 1, 1},
                                                             {6, 0, 1, 1},
                                                             {10, 1, 0x10000000, 2},
                                                             {5, 1, SIZE_MAX, 2}})
        EXPECT_EQ(NumericArrayResize(type, dimensions, &handle, elements), status)
            << type << " " << elements;
    EXPECT_EQ(DSSetHandleSize(handle, -1), 1);
    EXPECT_EQ(DSGetHandleSize(handle), 16);
    DSDisposeHandle(handle);
    EXPECT_EQ(DSCheckHandle(handle), 1);
}

TEST(RefHost, RefusesAsManyCallsAsAsked) {
    const uint64_t before = refhost::calls("DSNewHandle");
    refhost::refuse("DSNewHandle", 2);
    EXPECT_EQ(DSNewHandle(1), nullptr);
    EXPECT_EQ(DSNewHandle(1), nullptr);
    ZqHandle handle = DSNewHandle(1);
    ASSERT_NE(handle, nullptr);
    EXPECT_EQ(refhost::calls("DSNewHandle") - before, 3U);
    refhost::refuse("DSSetHandleSize", -1);
    for (int i = 0; i < 3; ++i) EXPECT_EQ(DSSetHandleSize(handle, 2), 2);
    refhost::refuse("DSSetHandleSize", 0);
    EXPECT_EQ(DSSetHandleSize(handle, 2), 0);
    DSDisposeHandle(handle);
    EXPECT_THROW(refhost::refuse("DSNewhandle"), std::invalid_argument);
}

TEST(RefHost, KnowsSessionsByTypePointerAndCookie) {
    int image = 0;
    refhost::String name("lens");
    const ZqImageValue value = {name.get(), reinterpret_cast<ZqImageHandle>(&image)};
    uint32_t cookie = 0;
    ASSERT_EQ(UDRegisterSesn("Kind", &value, &cookie), 0);
    ASSERT_NE(cookie, 0U);
    EXPECT_EQ(refhost::session(cookie)->name, "lens");

    refhost::String found_name;
    void* pointer = nullptr;
    EXPECT_EQ(UDCookieToName("Other", cookie, found_name.out(), &pointer), 1);
    ASSERT_EQ(UDCookieToName("Kind", cookie, found_name.out(), &pointer), 0);
    EXPECT_EQ(found_name.text(), "lens");
    EXPECT_EQ(pointer, &image);

    const ZqImageValue stranger = {name.get(), reinterpret_cast<ZqImageHandle>(&cookie)};
    EXPECT_EQ(TSCookieToSesn("Kind", &stranger, &pointer), 0);
    EXPECT_EQ(pointer, nullptr);
    EXPECT_EQ(TSCookieToSesn("Kind", &value, &pointer), 0);
    EXPECT_EQ(pointer, &image);
    EXPECT_EQ(UDUnregisterSesn("Kind", &value), 0);
    EXPECT_EQ(UDUnregisterSesn("Kind", &value), 1);
    EXPECT_FALSE(refhost::session(cookie));

    (*name.get())->length = 5;  // one more than the block holds
    EXPECT_EQ(UDRegisterSesn("Kind", &value, &cookie), 1);
}

TEST(RefHost, RunsEachCleanupProcedureOnceNewestFirst) {
    static std::string order;
    struct Procedures {
        static void a(void*) { order += "a"; }
        static void b(void*) { order += "b"; }
        static void c(void*) {
            order += "c";
            RTSetCleanupProc(b, nullptr, 0);
        }
    };
    order.clear();
    for (ZqCleanupProc procedure : {Procedures::a, Procedures::a, Procedures::b, Procedures::c})
        EXPECT_EQ(RTSetCleanupProc(procedure, nullptr, 2), 0);
    EXPECT_EQ(refhost::cleanup_procs(), 3U);
    refhost::run_cleanup();
    EXPECT_EQ(order, "ca");
    refhost::run_cleanup();
    EXPECT_EQ(order, "ca");
}

TEST(RefHost, CutsCountedStringsAndJoinsPaths) {
    std::array<uint8_t, 256> counted = {};
    EXPECT_EQ(CToPStr(std::string(300, 'x').c_str(), counted.data()), 0);
    EXPECT_EQ(counted[0], 255);
    EXPECT_EQ(counted[255], 'x');

    ZqPath base = nullptr;
    ZqPath relative = nullptr;
    FTextToPath("/pictures", 9, &base);
    FTextToPath("one.png", 7, &relative);
    EXPECT_EQ(FAddPath(base, relative, base), 0);
    EXPECT_EQ(refhost::path_text(base), "/pictures/one.png");
    EXPECT_TRUE(refhost::dispose_path(base));
    EXPECT_TRUE(refhost::dispose_path(relative));
    EXPECT_EQ(FAddPath(base, base, base), 1);
}

TEST(RefHost, ThreadsShareTheHeap) {
    const auto work = [] {
        for (int i = 0; i < 200; ++i) {
            ZqHandle handle = DSNewHandle(i);
            DSSetHandleSize(handle, 2 * i);
            DSDisposeHandle(handle);
        }
    };
    std::array<std::thread, 4> threads;
    for (std::thread& thread : threads) thread = std::thread(work);
    for (std::thread& thread : threads) thread.join();
    EXPECT_TRUE(refhost::finish().clean());
}

}  // namespace
