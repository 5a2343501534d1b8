# Warnings and sanitizers, the same for every target.
# Not -Wpedantic: messages use syslog's %m. The public headers are compiled with it by their own test. What is optimized as
# a whole is warned of when it is linked.
add_compile_options(-Wall -Wextra -Wconversion -Wshadow)
if(MERO_WERROR)
  add_compile_options(-Werror)
  add_link_options(-Werror)
endif()

if(MERO_SANITIZE)
  # The vptr check needs run-time type information, which the libraries do without.
  set(sanitizers -fsanitize=address,undefined -fno-sanitize=vptr -fno-sanitize-recover=all -fno-omit-frame-pointer)
  add_compile_options(${sanitizers})
  add_compile_definitions(MERO_SANITIZE)
  add_link_options(${sanitizers})
  # Clang's code tells fuzz targets which way it goes. That is asked of what is shipped, and not of tests.
  if(CMAKE_CXX_COMPILER_ID STREQUAL Clang)
    set(MERO_WATCH_BRANCHES -fsanitize=fuzzer-no-link)
  endif()
endif()

# Several processes add to the counts of one file, and threads too.
if(MERO_COVERAGE)
  add_compile_options(--coverage -fprofile-update=atomic -fprofile-abs-path)
  add_link_options(--coverage)
endif()
