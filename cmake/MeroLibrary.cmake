# mero_library(NAME EXPORTS FILE SOURCES ... [LIBRARIES ...])
#
# A shared library with C++ inside and C at its boundary: it exports the names in its version script and nothing else,
# and the C driver links it with no C++ library at hand, so that a stray need for one is a link error.
function(mero_library name)
  cmake_parse_arguments(PARSE_ARGV 1 arg "" "EXPORTS" "SOURCES;LIBRARIES")

  add_library(${name} SHARED ${arg_SOURCES})
  target_include_directories(${name} PUBLIC ${CMAKE_SOURCE_DIR}/include PRIVATE ${CMAKE_SOURCE_DIR})
  target_compile_options(${name} PRIVATE -fno-exceptions -fno-rtti -fvisibility=hidden -fvisibility-inlines-hidden
                                         -ffunction-sections)
  # Files beyond 2 GiB and times beyond 2038, also where longs have 32 bits.
  target_compile_definitions(${name} PRIVATE _FILE_OFFSET_BITS=64 _TIME_BITS=64)
  target_link_options(${name} PRIVATE -Wl,-z,defs -Wl,-z,now -Wl,--gc-sections -Wl,--as-needed
                                      -Wl,--version-script=${arg_EXPORTS})
  target_link_libraries(${name} PRIVATE ${arg_LIBRARIES})
  set_target_properties(${name} PROPERTIES
    LINKER_LANGUAGE C
    LINK_DEPENDS ${arg_EXPORTS}
    SOVERSION 1
    VERSION ${PROJECT_VERSION})
endfunction()

set(CMAKE_CXX_IMPLICIT_LINK_LIBRARIES "")
