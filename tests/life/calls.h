// The entry points that the tests of loading use, found in the loaded library.
#pragma once

#include <zqvissvc/files.h>
#include <zqvissvc/image.h>

#include "process.h"

namespace zqtest {

struct Calls {
    explicit Calls(const LoadedLibrary& library)
        : create(library.find<decltype(DF_Create)>("DF_Create")),
          dispose(library.find<decltype(DF_Dispose)>("DF_Dispose")),
          set_size(library.find<decltype(DF_SetImageSize)>("DF_SetImageSize")),
          new_named(library.find<decltype(NewNamedImage)>("NewNamedImage", 3)),
          dispose_image(library.find<decltype(ZqDisposeImage)>("ZqDisposeImage", 6)),
          lock(library.find<decltype(ZqLockImages)>("ZqLockImages", 8)),
          unlock(library.find<decltype(ZqUnlockImages)>("ZqUnlockImages", 9)),
          set_memory_mode(library.find<decltype(ZqSetMemoryMode)>("ZqSetMemoryMode", 18)),
          write(library.find<decltype(ZqWriteFileByName)>("ZqWriteFileByName", 60)),
          read(library.find<decltype(ZqReadFile)>("ZqReadFile", 62)) {}

    decltype(DF_Create)* create;
    decltype(DF_Dispose)* dispose;
    decltype(DF_SetImageSize)* set_size;
    decltype(NewNamedImage)* new_named;
    decltype(ZqDisposeImage)* dispose_image;
    decltype(ZqLockImages)* lock;
    decltype(ZqUnlockImages)* unlock;
    decltype(ZqSetMemoryMode)* set_memory_mode;
    decltype(ZqWriteFileByName)* write;
    decltype(ZqReadFile)* read;
};

}  // namespace zqtest
