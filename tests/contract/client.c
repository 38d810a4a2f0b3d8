/* A client that knows the binary contract alone: C, another tool chain, own declarations. It loads
 * the library, is its host (or finds one in the dfrt.dll that its only argument names), and uses
 * images, errors and files as the toolkit's libraries do. Exit status: the number of failed checks,
 * at most 255. */
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <windows.h>

#include "abi.h"

static int failures;
static const HostState*(__cdecl* host_state)(void);
static void(__cdecl* run_cleanup)(void);
static Handle(__cdecl* new_handle)(int32_t size);
static int32_t(__cdecl* dispose_handle)(Handle handle);

#define CHECK(condition) check((condition) != 0, #condition, __LINE__)

static void check(int holds, const char* condition, int line) {
    if (holds) return;
    printf("client.c:%d: %s\n", line, condition);
    ++failures;
}

/* ---- Host strings: a length and that many bytes */

static Handle new_string(const char* text) {
    const int32_t length = (int32_t)strlen(text);
    const Handle string = new_handle(4 + length);
    memcpy(*string, &length, 4);
    memcpy(*string + 4, text, (size_t)length);
    return string;
}

static int has_text(Handle string, const char* text) {
    const size_t length = strlen(text);
    return string != NULL && int_at(*string, 0) == (int32_t)length &&
           memcmp(*string + 4, text, length) == 0;
}

static void dispose(Handle string) {
    if (string != NULL) dispose_handle(string);
}

/* ---- Images */

/* The record of a 16-bit image of 10 x 4 with a border of 3: 16 pixels are 32 bytes. */
static void check_record(Image image) {
    const Byte* buffer = pointer_at(image, kBuffer);
    const Byte* first = pointer_at(image, kFirstPixel);
    CHECK(int_at(image, kUnit) == 0);
    CHECK(float_at(image, kXStep) == 1.0F && float_at(image, kYStep) == 1.0F);
    CHECK(int_at(image, kType) == 1);
    CHECK(int_at(image, kWidth) == 10 && int_at(image, kHeight) == 4);
    CHECK(int_at(image, 24) == 0 && int_at(image, 28) == 0);
    CHECK(int_at(image, kBorder) == 3);
    CHECK(int_at(image, kRowPixels) == 16);
    CHECK((uintptr_t)first % 32 == 0);
    CHECK(first - buffer >= 3 * 32 + 3 * 2 && first - buffer < 3 * 32 + 64);
    CHECK(pointer_at(image, kExtraInfo) == NULL);
    CHECK(strcmp((const char*)pointer_at(image, kName), "contract") == 0);
    CHECK(int_at(image, kGreedySize) == -1);
    CHECK(pointer_at(image, kCustomData) != NULL);
    CHECK(int_at(image, kHostCookie) != 0);
    CHECK(pointer_at(image, kMemoryInfo)[kPhysical] == 0);
}

static void test_host_image(void) {
    static const Byte class_id[16] = {1, 2, 3};
    static const int32_t coordinates[][2] = {{0, 0}, {9, 3}, {-3, -3}, {12, 6}};
    Value value = {NULL, NULL};
    Image found = NULL;
    Handle name = new_string("contract");
    void* address = NULL;
    int i;
    CHECK(DF_Create(name, 1, 3, 10, 4, 0, &value, NULL) == 0);
    CHECK(value.image != NULL && has_text(value.name, "contract"));
    if (value.image == NULL) return;
    check_record(value.image);
    CHECK(host_state()->sessions == 1);
    for (i = 0; i < 4; ++i) {
        const int32_t x = coordinates[i][0];
        const int32_t y = coordinates[i][1];
        CHECK(GetPixelAddress(value.image, x, y, &address) == 0);
        CHECK((Byte*)address == pointer_at(value.image, kFirstPixel) + (y * 16 + x) * 2);
    }
    CHECK(GetPixelAddress(value.image, 13, 0, &address) == -1074395261);

    CHECK(FindImage("contract", &found) == 0 && found == value.image);
    CHECK(DF_SetImageSize(&value, 33, 5, NULL) == 0);
    CHECK(int_at(found, kWidth) == 33 && int_at(found, kRowPixels) == 48);
    CHECK(LockImages(&found, 1) == 0 && UnlockImages(&found, 1) == 0);
    CHECK(SetAttachment(found, class_id, malloc(1), free) == 0);

    CHECK(DF_Dispose(&value, 0, NULL) == 0);
    CHECK(host_state()->sessions == 0);
    CHECK(FindImage("contract", &found) == 0 && found == NULL);
    CHECK(DF_SetImageSize(&value, 1, 1, NULL) == -1074396120);
    dispose(value.name);
    dispose(name);
}

/* The host's tear-down disposes unnamed images. */
static void test_unnamed_image(void) {
    Value value = {NULL, NULL};
    CHECK(DF_Create(NULL, 4, 0, 2, 2, 1, &value, NULL) == 0);
    CHECK(value.image != NULL && pointer_at(value.image, kName) == NULL);
    CHECK(value.image != NULL && int_at(value.image, kGreedySize) != -1);
    CHECK(host_state()->cleanups == 1);
    run_cleanup();
    CHECK(host_state()->cleanups == 0 && host_state()->sessions == 0);
    CHECK(DF_SetImageSize(&value, 1, 1, NULL) == -1074396120);
    dispose(value.name);
}

/* ---- Errors */

static void test_error_cluster(void) {
    Byte cluster[kClusterBytes];
    Byte pixels[64];
    Value value = {NULL, NULL};
    Handle source;
    Handle text = NULL;
    memset(cluster, 0, sizeof cluster);
    CHECK(DF_CreateFromExternalBuffer(NULL, 0, 1, 2, 2, 0, pixels, 16, &value, cluster) ==
          -1074396063);
    CHECK(cluster[kStatus] == 1 && int_at(cluster, kCode) == -1074396063);
    source = (Handle)(void*)pointer_at(cluster, kSource);
    CHECK(has_text(source,
                   "KEMO Create From External Buffer\n"
                   "The external buffer must be aligned on a 4-byte boundary. The line width and "
                   "border pixels must be 4-byte aligned, as well."));
    /* An error that is there stops what comes behind it, and stays. */
    CHECK(DF_SetImageSize(&value, 1, 1, cluster) == -1074396063);
    CHECK(DF_CreateErrorCluster(-1074396120, "other", cluster) == -1074396063);
    CHECK(int_at(cluster, kCode) == -1074396063);
    memset(cluster, 0, 5);
    CHECK(DF_CreateErrorCluster(-1074396120, "contract client", cluster) == -1074396120);
    source = (Handle)(void*)pointer_at(cluster, kSource);
    CHECK(cluster[kStatus] == 1 && has_text(source, "contract client\nNot an image."));
    CHECK(GetErrorText(-1074396080, &text) == 0);
    CHECK(text != NULL && memcmp(*text, "\24\0\0\0Invalid image type.", 4 + 20) == 0);
    dispose(text);
    dispose(source);
}

static int boxes;
static void __cdecl count_box(const char* caption, const char* text) {
    CHECK(strcmp(caption, "Fatal Error") == 0);
    CHECK(strcmp(text, "DATAFLUX.LIB could not locate \"CToPStr\".") == 0);
    ++boxes;
}

static void test_slots(void) {
    Handle from = new_string("copied");
    Handle to = NULL;
    Byte counted[8];
    const int32_t shown = host_state()->dialogs_shown;
    CHECK((*StrLen_EX)("four") == 4);
    CHECK((*DF_StringCopy)(&to, from) == 0 && has_text(to, "copied"));
    SetMessageBoxProcedure(count_box);
    CHECK((*CToPStr_EX)("x", counted) != 0);
    SetMessageBoxProcedure(NULL);
    CHECK(boxes == 1);
    CHECK(host_state()->dialogs_shown == shown + 1 && host_state()->dialogs == 0);
    dispose(from);
    dispose(to);
}

/* ---- Files, and a thread that the library has not made */

static DWORD WINAPI write_and_read(void* path) {
    static const int32_t no_options[4] = {0, 0, 0, 0};
    const Byte* record = ThreadRecord();
    Image image = NULL;
    Image copy = NULL;
    void* pixel = NULL;
    CHECK(record != NULL && int_at(record, 0) == 2 && int_at(record, 12) == 1);
    CHECK(record != NULL && int_at(record, 20) == -1);
    CHECK(NewImage(4, 3, 2, 0, &image) == 0);
    CHECK(GetPixelAddress(image, 2, 1, &pixel) == 0);
    memcpy(pixel, "\1\2\3\4", 4);
    copy = kemoCreateImage(0, 2);
    CHECK(WriteFileByName(path, image, no_options, "AIPD", NULL) == 0);
    CHECK(ReadFileInto(copy, path, NULL, NULL, NULL, NULL) == 0);
    CHECK(int_at(copy, kType) == 4 && int_at(copy, kWidth) == 3 && int_at(copy, kBorder) == 2);
    CHECK(GetPixelAddress(copy, 2, 1, &pixel) == 0 && memcmp(pixel, "\1\2\3\4", 4) == 0);
    CHECK(ResizeImage(copy, 1, 1, 1, 7, 0) == -1074396080);
    CHECK(DisposeImage(copy) == 0 && DisposeImage(image) == 0);
    return 0;
}

static void test_files_in_a_thread(void) {
    char folder[MAX_PATH];
    char path[MAX_PATH];
    HANDLE thread;
    GetTempPathA(MAX_PATH, folder);
    GetTempFileNameA(folder, "zqc", 0, path);
    thread = CreateThread(NULL, 0, write_and_read, path, 0, NULL);
    CHECK(thread != NULL);
    WaitForSingleObject(thread, INFINITE);
    CloseHandle(thread);
    CHECK(DeleteFileA(path));
    CHECK(strcmp(Gen_ImageTypeToText(6), "RGB (U64)") == 0);
}

static void take(void* function, HMODULE host, const char* name) {
    const FARPROC found = GetProcAddress(host, name);
    CHECK(found != NULL);
    memcpy(function, &found, sizeof found);
}

int main(int count, char** arguments) {
    HMODULE host = count == 2 ? LoadLibraryA(arguments[1]) : GetModuleHandleA(NULL);
    HMODULE library = LoadLibraryA("ZqVisSvc.dll");
    if (library == NULL || host == NULL || !bind_library(library)) {
        printf("cannot begin: %p %p\n", (void*)library, (void*)host);
        return 255;
    }
    take(&host_state, host, "ContractHostState");
    take(&run_cleanup, host, "ContractHostRunCleanup");
    take(&new_handle, host, "DSNewHandle");
    take(&dispose_handle, host, "DSDisposeHandle");
    if (failures != 0) return failures;
    test_host_image();
    test_unnamed_image();
    test_error_cluster();
    test_slots();
    test_files_in_a_thread();
    CHECK(host_state()->blocks == 0);
    CHECK(host_state()->misuses == 0);
    CHECK(FreeLibrary(library));
    printf("%d checks failed\n", failures);
    return failures > 255 ? 255 : failures;
}
