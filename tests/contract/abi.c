/* Binds the library's functions by name and ordinal. */
#include "abi.h"

#include <stdio.h>
#include <string.h>
#include <windows.h>

int32_t(__cdecl* DF_Create)(Handle, int32_t, int32_t, int32_t, int32_t, Byte, Value*, Byte*);
int32_t(__cdecl* DF_CreateFromExternalBuffer)(Handle, int32_t, int32_t, int32_t, int32_t, Byte,
                                              void*, int32_t, Value*, Byte*);
int32_t(__cdecl* DF_Dispose)(const Value*, Byte, Byte*);
int32_t(__cdecl* DF_SetImageSize)(const Value*, int32_t, int32_t, Byte*);
int32_t(__cdecl* DF_CreateErrorCluster)(int32_t, const char*, Byte*);
int32_t(__cdecl* GetErrorText)(int32_t, Handle*);
const char*(__cdecl* Gen_ImageTypeToText)(int32_t);
Image(__cdecl* kemoCreateImage)(int32_t, int32_t);

int32_t(__cdecl** StrLen_EX)(const char*);
int32_t(__cdecl** CToPStr_EX)(const char*, Byte*);
int32_t(__cdecl** DF_StringCopy)(Handle*, Handle);

int32_t(__cdecl* NewImage)(int32_t, int32_t, int32_t, int32_t, Image*);
int32_t(__cdecl* DisposeImage)(Image);
int32_t(__cdecl* FindImage)(const char*, Image*);
int32_t(__cdecl* LockImages)(const Image*, int32_t);
int32_t(__cdecl* UnlockImages)(const Image*, int32_t);
int32_t(__cdecl* ResizeImage)(Image, int32_t, int32_t, Byte, int32_t, int32_t);
int32_t(__cdecl* GetPixelAddress)(Image, int32_t, int32_t, void**);
int32_t(__cdecl* SetAttachment)(Image, const Byte*, void*, void(__cdecl*)(void*));
Byte*(__cdecl* ThreadRecord)(void);
int32_t(__cdecl* WriteFileByName)(const char*, Image, const int32_t*, const char*, Handle*);
int32_t(__cdecl* ReadFileInto)(Image, const char*, const int32_t*, Handle*, int32_t*, Handle*);
void*(__cdecl* SetMessageBoxProcedure)(void(__cdecl*)(const char*, const char*));

static const struct {
    void* variable;
    const char* name;
    WORD ordinal; /* 0: exported by name */
} kImports[] = {
    {&DF_Create, "DF_Create", 0},
    {&DF_CreateFromExternalBuffer, "DF_CreateFromExternalBuffer", 0},
    {&DF_Dispose, "DF_Dispose", 0},
    {&DF_SetImageSize, "DF_SetImageSize", 0},
    {&DF_CreateErrorCluster, "DF_CreateErrorCluster", 0},
    {&GetErrorText, "GetErrorText", 0},
    {&Gen_ImageTypeToText, "Gen_ImageTypeToText", 0},
    {&kemoCreateImage, "kemoCreateImage", 0},
    {&StrLen_EX, "StrLen_EX", 0},
    {&CToPStr_EX, "CToPStr_EX", 0},
    {&DF_StringCopy, "DF_StringCopy", 0},
    {&NewImage, "NewImage", 1},
    {&DisposeImage, "ZqDisposeImage", 6},
    {&FindImage, "ZqFindImage", 7},
    {&LockImages, "ZqLockImages", 8},
    {&UnlockImages, "ZqUnlockImages", 9},
    {&ResizeImage, "ZqResizeImage", 10},
    {&GetPixelAddress, "ZqGetPixelAddress", 12},
    {&ThreadRecord, "ZqThreadRecord", 20},
    {&SetMessageBoxProcedure, "ZqSetMessageBoxProcedure", 24},
    {&SetAttachment, "ZqSetAttachment", 40},
    {&WriteFileByName, "ZqWriteFileByName", 60},
    {&ReadFileInto, "ZqReadFile", 62},
};

int bind_library(void* module) {
    int complete = 1;
    size_t i;
    for (i = 0; i < sizeof kImports / sizeof kImports[0]; ++i) {
        const FARPROC named = GetProcAddress(module, kImports[i].name);
        const WORD ordinal = kImports[i].ordinal;
        const FARPROC found =
            ordinal == 0 ? named : GetProcAddress(module, MAKEINTRESOURCEA(ordinal));
        if (found == NULL || (ordinal != 0 && named != NULL)) {
            printf("%s @%d: %s\n", kImports[i].name, ordinal,
                   found == NULL ? "missing" : "exported by name too");
            complete = 0;
        }
        memcpy(kImports[i].variable, &found, sizeof found);
    }
    return complete;
}

int32_t int_at(const Byte* record, int offset) {
    int32_t value;
    memcpy(&value, record + offset, sizeof value);
    return value;
}

float float_at(const Byte* record, int offset) {
    float value;
    memcpy(&value, record + offset, sizeof value);
    return value;
}

Byte* pointer_at(const Byte* record, int offset) {
    Byte* value;
    memcpy(&value, record + offset, sizeof value);
    return value;
}
