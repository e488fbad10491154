# Options for everything built here. Nothing of this reaches those who link an installed library.
find_package(Threads REQUIRED)

add_library(tessel_compile_options INTERFACE)
# Reports name source files relative to the repository, also where the compiler is given them relative to the build.
file(RELATIVE_PATH TESSEL_SOURCE_FROM_BUILD ${PROJECT_BINARY_DIR} ${PROJECT_SOURCE_DIR})
target_compile_options(tessel_compile_options INTERFACE
  -Wall -Wextra -Wpedantic -Wshadow -Wundef -Werror
  $<$<COMPILE_LANGUAGE:CXX>:-Wnon-virtual-dtor -Woverloaded-virtual>
  -fno-omit-frame-pointer -fno-optimize-sibling-calls -fno-strict-aliasing
  "-ffile-prefix-map=${PROJECT_SOURCE_DIR}/=" "-ffile-prefix-map=${TESSEL_SOURCE_FROM_BUILD}=")
target_compile_definitions(tessel_compile_options INTERFACE _FILE_OFFSET_BITS=64 _TIME_BITS=64)
if(CMAKE_CXX_COMPILER_ID STREQUAL "Clang")
  # x87 constants and long double in C++ headers are fine; clang is stricter about what it calls an extension.
  # It also proves who holds which of the locks that are annotated, and their order.
  target_compile_options(tessel_compile_options INTERFACE -Wno-gnu-zero-variadic-macro-arguments
    $<$<COMPILE_LANGUAGE:CXX>:-Wthread-safety;-Wthread-safety-beta>)
endif()

if(CMAKE_SIZEOF_VOID_P EQUAL 4 AND CMAKE_SYSTEM_PROCESSOR MATCHES "^(x86_64|amd64|AMD64|i[3-6]86)$")
  # A float or double operation rounds to its own type, as on 64-bit hosts, and not to the x87 registers' 64 bits.
  target_compile_options(tessel_compile_options INTERFACE -msse2 -mfpmath=sse)
endif()

if(TESSEL_SANITIZE)
  # The checks put into the code mislead GCC's own flow analysis; the plain builds keep those warnings.
  if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    target_compile_options(tessel_compile_options INTERFACE -Wno-array-bounds -Wno-stringop-overflow
      -Wno-maybe-uninitialized)
  endif()
  target_compile_options(tessel_compile_options INTERFACE -fsanitize=${TESSEL_SANITIZE} -fno-sanitize-recover=all)
  target_link_options(tessel_compile_options INTERFACE -fsanitize=${TESSEL_SANITIZE})
endif()

find_program(TESSEL_CCACHE ccache)
if(TESSEL_CCACHE)
  set(CMAKE_C_COMPILER_LAUNCHER ${TESSEL_CCACHE})
  set(CMAKE_CXX_COMPILER_LAUNCHER ${TESSEL_CCACHE})
endif()
