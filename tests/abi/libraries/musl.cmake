# Debian's musl: its C compiler is gcc with other search paths, and there is no C++ library for it. The three libraries
# need none, only headers, and those of LLVM's know musl.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR ${CMAKE_HOST_SYSTEM_PROCESSOR})
set(CMAKE_C_COMPILER musl-gcc)
set(CMAKE_CXX_COMPILER clang++)
set(CMAKE_TRY_COMPILE_TARGET_TYPE STATIC_LIBRARY)  # clang++ would look for libraries of C++

execute_process(COMMAND clang++ -print-resource-dir OUTPUT_VARIABLE clang OUTPUT_STRIP_TRAILING_WHITESPACE)
file(REAL_PATH ${clang}/../../.. llvm)
set(triple ${CMAKE_SYSTEM_PROCESSOR}-linux)

# The kernel's headers stand among libc's own.
set(kernel ${CMAKE_BINARY_DIR}/kernel)
file(MAKE_DIRECTORY ${kernel})
file(CREATE_LINK /usr/include/linux ${kernel}/linux SYMBOLIC)
file(CREATE_LINK /usr/include/asm-generic ${kernel}/asm-generic SYMBOLIC)
file(CREATE_LINK /usr/include/${triple}-gnu/asm ${kernel}/asm SYMBOLIC)

# Packed relocations are understood since musl 1.2.4.
set(MERO_HAS_PACKED_RELOCATIONS OFF CACHE BOOL "")

string(JOIN " " CMAKE_CXX_FLAGS_INIT --target=${triple}-musl -nostdinc -D_LIBCPP_HAS_MUSL_LIBC
  -isystem ${llvm}/include/c++/v1 -isystem /usr/include/${triple}-musl -isystem ${clang}/include -isystem ${kernel})
