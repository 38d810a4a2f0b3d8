/* The binary contract in the client's own words: addresses by name and ordinal, and where each
 * field lies. Nothing here comes from the library's headers. */
#ifndef CONTRACT_ABI_H
#define CONTRACT_ABI_H

#include <stdint.h>

#include "host.h"

enum { kPointerBytes = sizeof(void*) };

/* Byte offsets in the image record, which a handle points at. */
#if defined(_WIN64)
enum {
    kBuffer = 40,
    kExtraInfo = 48,
    kFirstPixel = 56,
    kName = 64,
    kGreedySize = 76,
    kCustomData = 88,
    kHostCookie = 96,
    kMemoryInfo = 104
};
#else
enum {
    kBuffer = 40,
    kExtraInfo = 44,
    kFirstPixel = 48,
    kName = 52,
    kGreedySize = 60,
    kCustomData = 72,
    kHostCookie = 76,
    kMemoryInfo = 80
};
#endif
enum {
    kUnit = 0,
    kXStep = 4,
    kYStep = 8,
    kType = 12,
    kWidth = 16,
    kHeight = 20,
    kBorder = 32,
    kRowPixels = 36,
    kPhysical = 12 /* in the memory record */
};

/* Byte offsets in the error cluster, which is packed, and in the thread's record. */
enum { kStatus = 0, kCode = 1, kSource = 5, kClusterBytes = 5 + sizeof(void*) };

typedef Byte* Image;
typedef struct {
    Handle name;
    Image image;
} Value;

/* Exported by name. */
extern int32_t(__cdecl* DF_Create)(Handle name, int32_t type, int32_t border, int32_t width,
                                   int32_t height, Byte greedy, Value* out, Byte* cluster);
extern int32_t(__cdecl* DF_CreateFromExternalBuffer)(Handle name, int32_t type, int32_t border,
                                                     int32_t width, int32_t height, Byte greedy,
                                                     void* buffer, int32_t line_width, Value* out,
                                                     Byte* cluster);
extern int32_t(__cdecl* DF_Dispose)(const Value* value, Byte all, Byte* cluster);
extern int32_t(__cdecl* DF_SetImageSize)(const Value* value, int32_t width, int32_t height,
                                         Byte* cluster);
extern int32_t(__cdecl* DF_CreateErrorCluster)(int32_t code, const char* caller, Byte* cluster);
extern int32_t(__cdecl* GetErrorText)(int32_t code, Handle* text);
extern const char*(__cdecl* Gen_ImageTypeToText)(int32_t type);
extern Image(__cdecl* kemoCreateImage)(int32_t type, int32_t border);

/* Exported variables: where a function pointer lies. */
extern int32_t(__cdecl** StrLen_EX)(const char* text);
extern int32_t(__cdecl** CToPStr_EX)(const char* text, Byte* counted);
extern int32_t(__cdecl** DF_StringCopy)(Handle* to, Handle from);

/* Exported by ordinal only. */
extern int32_t(__cdecl* NewImage)(int32_t type, int32_t width, int32_t height, int32_t border,
                                  Image* out);
extern int32_t(__cdecl* DisposeImage)(Image image);
extern int32_t(__cdecl* FindImage)(const char* name, Image* out);
extern int32_t(__cdecl* LockImages)(const Image* images, int32_t count);
extern int32_t(__cdecl* UnlockImages)(const Image* images, int32_t count);
extern int32_t(__cdecl* ResizeImage)(Image image, int32_t width, int32_t height, Byte change_type,
                                     int32_t type, int32_t mode);
extern int32_t(__cdecl* GetPixelAddress)(Image image, int32_t x, int32_t y, void** address);
extern int32_t(__cdecl* SetAttachment)(Image image, const Byte* class_id, void* object,
                                       void(__cdecl* destroy)(void* object));
extern Byte*(__cdecl* ThreadRecord)(void);
extern int32_t(__cdecl* WriteFileByName)(const char* path, Image image, const int32_t* options,
                                         const char* type, Handle* table);
extern int32_t(__cdecl* ReadFileInto)(Image image, const char* path, const int32_t* raw,
                                      Handle* type, int32_t* format, Handle* table);
extern void*(__cdecl* SetMessageBoxProcedure)(void(__cdecl* show)(const char* caption,
                                                                  const char* text));

/* Finds everything above. False, with a line printed for each one missing, if anything is missing
 * or a core function is exported by name as well. */
int bind_library(void* module);

/* A field of a record. */
int32_t int_at(const Byte* record, int offset);
float float_at(const Byte* record, int offset);
Byte* pointer_at(const Byte* record, int offset);

#endif
