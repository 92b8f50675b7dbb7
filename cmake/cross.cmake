# A toolchain of Debian's cross compilers, against the libraries of a root of its own.
# Usage: cmake --toolchain cmake/cross.cmake -DZR_CROSS_ARCHITECTURE=armhf -DZR_CROSS_ROOT=directory
# ZR_CROSS_ARCHITECTURE: armhf, arm64, ppc64el, riscv64 or s390x, as Debian names them.
# ZR_CROSS_ROOT: where Debian packages of that architecture are unpacked, the C library
# among them. scripts/everywhere makes both.
set(CMAKE_SYSTEM_NAME Linux)
if(ZR_CROSS_ARCHITECTURE STREQUAL "armhf")
    set(CMAKE_SYSTEM_PROCESSOR armv7l)
    set(ZR_CROSS_TRIPLET arm-linux-gnueabihf)
    # Of the way in which g++ hands over arguments, it tells what was different in its version 6.
    set(CMAKE_CXX_FLAGS_INIT -Wno-psabi)
    set(ZR_CROSS_EMULATOR qemu-arm-static)
elseif(ZR_CROSS_ARCHITECTURE STREQUAL "arm64")
    set(CMAKE_SYSTEM_PROCESSOR aarch64)
    set(ZR_CROSS_TRIPLET aarch64-linux-gnu)
    set(ZR_CROSS_EMULATOR qemu-aarch64-static)
elseif(ZR_CROSS_ARCHITECTURE STREQUAL "ppc64el")
    set(CMAKE_SYSTEM_PROCESSOR ppc64le)
    set(ZR_CROSS_TRIPLET powerpc64le-linux-gnu)
    set(ZR_CROSS_EMULATOR qemu-ppc64le-static)
elseif(ZR_CROSS_ARCHITECTURE STREQUAL "riscv64")
    set(CMAKE_SYSTEM_PROCESSOR riscv64)
    set(ZR_CROSS_TRIPLET riscv64-linux-gnu)
    set(ZR_CROSS_EMULATOR qemu-riscv64-static)
elseif(ZR_CROSS_ARCHITECTURE STREQUAL "s390x")
    set(CMAKE_SYSTEM_PROCESSOR s390x)
    set(ZR_CROSS_TRIPLET s390x-linux-gnu)
    set(ZR_CROSS_EMULATOR qemu-s390x-static)
else()
    message(FATAL_ERROR "ZR_CROSS_ARCHITECTURE is one of armhf, arm64, ppc64el, riscv64, s390x")
endif()
# CMake's own trial builds read this file, too.
list(APPEND CMAKE_TRY_COMPILE_PLATFORM_VARIABLES ZR_CROSS_ARCHITECTURE ZR_CROSS_ROOT)

set(CMAKE_C_COMPILER ${ZR_CROSS_TRIPLET}-gcc)
set(CMAKE_CXX_COMPILER ${ZR_CROSS_TRIPLET}-g++)
set(CMAKE_LIBRARY_ARCHITECTURE ${ZR_CROSS_TRIPLET})
set(CMAKE_SYSROOT ${ZR_CROSS_ROOT})
set(CMAKE_CROSSCOMPILING_EMULATOR ${ZR_CROSS_EMULATOR} -L ${ZR_CROSS_ROOT})

# Programs are this machine's; all else is the target's.
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)
set(ENV{PKG_CONFIG_SYSROOT_DIR} ${ZR_CROSS_ROOT})
set(ENV{PKG_CONFIG_LIBDIR}
    ${ZR_CROSS_ROOT}/usr/lib/${ZR_CROSS_TRIPLET}/pkgconfig:${ZR_CROSS_ROOT}/usr/share/pkgconfig)
