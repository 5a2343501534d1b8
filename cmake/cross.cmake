# For another processor, by the compilers of Debian's package crossbuild-essential-*: the one whose GNU type
# DEB_HOST_GNU_TYPE in the environment names, as dpkg-architecture(1) does, such as aarch64-linux-gnu. CMake finds this
# file by CMAKE_TOOLCHAIN_FILE there.
set(triplet $ENV{DEB_HOST_GNU_TYPE})
string(REGEX REPLACE "-.*" "" CMAKE_SYSTEM_PROCESSOR "${triplet}")
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_C_COMPILER ${triplet}-gcc)
set(CMAKE_CXX_COMPILER ${triplet}-g++)
set(PKG_CONFIG_EXECUTABLE /usr/bin/${triplet}-pkg-config CACHE FILEPATH "")
# The programs of tests are run by an emulator that the kernel knows (tests/everywhere/emulated).
set(CMAKE_CROSSCOMPILING_EMULATOR ${CMAKE_CURRENT_LIST_DIR}/../tests/everywhere/possible)
