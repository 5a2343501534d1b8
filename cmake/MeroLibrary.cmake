# Packed relocations take a fraction of the room, and are understood by the C libraries of the last years. A linker that
# does not know them for its processor goes without, and says so in a warning.
include(CheckCXXCompilerFlag)
include(CheckLinkerFlag)
set(CMAKE_REQUIRED_LINK_OPTIONS -Wl,--fatal-warnings)
check_linker_flag(C -Wl,-z,pack-relative-relocs MERO_HAS_PACKED_RELOCATIONS)
unset(CMAKE_REQUIRED_LINK_OPTIONS)

check_cxx_compiler_flag(-Oz MERO_HAS_OZ)
if(MERO_HAS_OZ)
  set(MERO_SMALL -Oz)
else()
  set(MERO_SMALL -Os)
endif()

# What makes code small on one processor and large on another. A call through the table of addresses itself is one
# instruction of x86, which needs no other table then; of 64-bit ARM it is three, where a call is one. The tiny model is
# that of a library that lies within a mebibyte: each of its addresses is one instruction there, not two. And there every
# function would keep a frame for debuggers, as none does elsewhere.
if(CMAKE_SYSTEM_PROCESSOR STREQUAL aarch64 AND CMAKE_SIZEOF_VOID_P EQUAL 8)
  set(MERO_PROCESSOR_OPTIONS -mcmodel=tiny -fomit-frame-pointer)
else()
  set(MERO_PROCESSOR_OPTIONS -fno-plt)
endif()

# What gcc does to loops and values for speed makes code larger, even where it is asked for the smallest.
set(MERO_SMALLER $<$<CXX_COMPILER_ID:GNU>:-fno-move-loop-invariants$<SEMICOLON>-fno-expensive-optimizations>)

set(MERO_LIBRARY_OPTIONS "" CACHE STRING "Options that the shared libraries are compiled with, after all others")

# How the parts of the shared libraries are compiled: to be small, except in debug builds. Nothing unwinds through them
# at run time, and what debuggers unwind by goes with the debugging information.
function(mero_compile_part name)
  cmake_path(GET CMAKE_CURRENT_FUNCTION_LIST_DIR PARENT_PATH top)
  target_include_directories(${name} PUBLIC $<BUILD_INTERFACE:${top}/include> PRIVATE ${top})
  target_compile_options(${name} PRIVATE -fno-exceptions -fno-rtti -fvisibility=hidden -fvisibility-inlines-hidden
                                         -ffunction-sections -fdata-sections
                                         $<$<NOT:$<CONFIG:Debug>>:${MERO_SMALL};${MERO_SMALLER};-fno-ident>
                                         $<$<NOT:$<CONFIG:Debug>>:${MERO_PROCESSOR_OPTIONS}>
                                         $<$<NOT:$<CONFIG:Debug>>:-fno-asynchronous-unwind-tables;-fno-unwind-tables>
                                         ${MERO_WATCH_BRANCHES} ${MERO_LIBRARY_OPTIONS})
  set_target_properties(${name} PROPERTIES POSITION_INDEPENDENT_CODE ON)
  if(CMAKE_SIZEOF_VOID_P EQUAL 4)
    # Files beyond 2 GiB and times beyond 2038. Machines with 64-bit longs have them anyway.
    target_compile_definitions(${name} PRIVATE _FILE_OFFSET_BITS=64 _TIME_BITS=64)
  endif()
endfunction()

# mero_internal(NAME SOURCES ...): code that several shared libraries contain.
function(mero_internal name)
  cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "SOURCES")
  add_library(${name} STATIC ${arg_SOURCES})
  mero_compile_part(${name})
endfunction()

# mero_library(NAME EXPORTS FILE SOURCES ... [LIBRARIES ...])
#
# A shared library with C++ inside and C at its boundary: it exports the names in its version script and nothing else,
# and the C driver links it with no C++ library at hand, so that a stray need for one is a link error.
function(mero_library name)
  cmake_parse_arguments(PARSE_ARGV 1 arg "" "EXPORTS" "SOURCES;LIBRARIES")

  add_library(${name} SHARED ${arg_SOURCES})
  mero_compile_part(${name})
  target_link_options(${name} PRIVATE -Wl,-z,now -Wl,--gc-sections -Wl,--as-needed
                                      -Wl,--version-script=${arg_EXPORTS})
  if(NOT MERO_SANITIZE)
    # Without global constructors there is nothing for start files to do, and without pages of their own for code, each
    # library is up to three pages smaller.
    target_link_options(${name} PRIVATE -nostartfiles -Wl,-z,noseparate-code)
    if(MERO_HAS_PACKED_RELOCATIONS)
      target_link_options(${name} PRIVATE -Wl,-z,pack-relative-relocs)
    endif()
  endif()
  if(NOT (MERO_SANITIZE AND CMAKE_CXX_COMPILER_ID STREQUAL Clang))  # whose sanitizers are in the program alone
    target_link_options(${name} PRIVATE -Wl,-z,defs)
  endif()
  target_link_libraries(${name} PRIVATE ${arg_LIBRARIES})
  set_target_properties(${name} PROPERTIES
    LINKER_LANGUAGE C
    LINK_DEPENDS ${arg_EXPORTS}
    SOVERSION 1
    VERSION ${PROJECT_VERSION})
  mero_install_library(${name})
endfunction()

set(CMAKE_CXX_IMPLICIT_LINK_LIBRARIES "")
