# Builds for another architecture with Debian's cross compiler and packages of that architecture from a separate root,
# and runs programs under qemu. See makeroot; `./run test --arch` uses both.
#
# ORV_FOREIGN   arm64 or armhf
# ORV_ROOT      folder that makeroot has filled
list(APPEND CMAKE_TRY_COMPILE_PLATFORM_VARIABLES ORV_FOREIGN ORV_ROOT)
set(CMAKE_SYSTEM_NAME Linux)
if(ORV_FOREIGN STREQUAL "arm64")
    set(CMAKE_SYSTEM_PROCESSOR aarch64)
    set(triplet aarch64-linux-gnu)
    set(qemu qemu-aarch64-static)
elseif(ORV_FOREIGN STREQUAL "armhf")
    set(CMAKE_SYSTEM_PROCESSOR arm)
    set(triplet arm-linux-gnueabihf)
    set(qemu qemu-arm-static)
else()
    message(FATAL_ERROR "ORV_FOREIGN is arm64 or armhf, not \"${ORV_FOREIGN}\"")
endif()
set(CMAKE_C_COMPILER ${triplet}-gcc)
set(CMAKE_CXX_COMPILER ${triplet}-g++)
set(CMAKE_SYSROOT ${ORV_ROOT})
set(CMAKE_CROSSCOMPILING_EMULATOR ${qemu} -L ${ORV_ROOT})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)
