# CMake toolchain: from Linux to Windows with Debian's mingw-w64 (posix threads).
#   -DMINGW_ARCH=x86_64|i686  -DMINGW_DEPS=<prefix filled by build-mingw-deps.sh>
set(CMAKE_SYSTEM_NAME Windows)

set(MINGW_ARCH "x86_64" CACHE STRING "Windows target: x86_64 or i686")
set(MINGW_DEPS "" CACHE PATH "Prefix filled by build-mingw-deps.sh for that target")
# The configure checks are projects of their own and must see both.
set(CMAKE_TRY_COMPILE_PLATFORM_VARIABLES MINGW_ARCH MINGW_DEPS)
if(NOT MINGW_ARCH MATCHES "^(x86_64|i686)$")
  message(FATAL_ERROR "MINGW_ARCH must be x86_64 or i686, not '${MINGW_ARCH}'")
endif()

set(CMAKE_SYSTEM_PROCESSOR ${MINGW_ARCH})
set(_triple ${MINGW_ARCH}-w64-mingw32)
set(CMAKE_C_COMPILER ${_triple}-gcc-posix)
set(CMAKE_CXX_COMPILER ${_triple}-g++-posix)
set(CMAKE_RC_COMPILER ${_triple}-windres)

if(MINGW_ARCH STREQUAL "i686")
  # SSE2 is the floor, and the x87 unit would round differently from every other target.
  # A caller may hand over a stack that is aligned to 4 bytes only, so realign it.
  set(_flags "-march=i686 -msse2 -mfpmath=sse -mstackrealign")
else()
  # GCC bug 54412: Windows aligns the stack to 16 bytes, yet GCC spills AVX vectors with aligned
  # moves, which crash. Debian patches its compiler; this guards against the patch going away.
  set(_flags "-Wa,-muse-unaligned-vector-move")
endif()
set(CMAKE_C_FLAGS_INIT "${_flags}")
set(CMAKE_CXX_FLAGS_INIT "${_flags}")

# libgcc, libstdc++ and winpthreads go inside: only system DLLs stay as imports.
foreach(_kind EXE SHARED MODULE)
  set(CMAKE_${_kind}_LINKER_FLAGS_INIT "-static -static-libgcc -static-libstdc++")
endforeach()

# Libraries come from our prefix first, then from the mingw sysroot, never from the build machine.
set(CMAKE_FIND_ROOT_PATH ${MINGW_DEPS} /usr/${_triple})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)
set(ENV{PKG_CONFIG_LIBDIR} "${MINGW_DEPS}/lib/pkgconfig")
