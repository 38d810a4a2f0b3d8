# Language level, warnings, code generation and output folders, the same for every target.
set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_C_STANDARD 11)
set(CMAKE_C_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_C_VISIBILITY_PRESET hidden)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)

set(CMAKE_RUNTIME_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/bin)
set(CMAKE_LIBRARY_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/lib)
set(CMAKE_ARCHIVE_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/lib)
# Also for libraries that are loaded by name while the program runs.
set(CMAKE_BUILD_RPATH $ORIGIN/../lib)

if(NOT CMAKE_BUILD_TYPE)
  set(CMAKE_BUILD_TYPE Release CACHE STRING "Build type" FORCE)
endif()
set(CMAKE_C_FLAGS_RELEASE "-O2 -DNDEBUG")
set(CMAKE_CXX_FLAGS_RELEASE "-O2 -DNDEBUG")
# Used by the sanitizer trees: quick enough, readable stacks, asserts on.
set(CMAKE_C_FLAGS_RELWITHDEBINFO "-O1 -g -fno-omit-frame-pointer")
set(CMAKE_CXX_FLAGS_RELWITHDEBINFO "-O1 -g -fno-omit-frame-pointer")

add_compile_options(-Wall -Wextra -Wconversion -Wshadow -Werror)
# One rounding per operation on every target, so that all of them give the same bytes.
add_compile_options(-ffp-contract=off)

if(WIN32)
  # Only the resource compiler must not see these as its own options.
  add_compile_definitions($<$<NOT:$<COMPILE_LANGUAGE:RC>>:NOMINMAX>
                          $<$<NOT:$<COMPILE_LANGUAGE:RC>>:WIN32_LEAN_AND_MEAN>)
endif()
if(ZQVISSVC_SANITIZE)
  add_compile_options(-fsanitize=${ZQVISSVC_SANITIZE} -fno-sanitize-recover=all)
  add_link_options(-fsanitize=${ZQVISSVC_SANITIZE})
endif()
# What tests are run with. A refused allocation must come back as a null pointer, as it does
# without a sanitizer.
set(ZQVISSVC_SANITIZER_OPTIONS
  ASAN_OPTIONS=allocator_may_return_null=1
  UBSAN_OPTIONS=print_stacktrace=1
  TSAN_OPTIONS=second_deadlock_stack=1,allocator_may_return_null=1)
