# Cross-building for 64-bit ARM Linux on a Debian x86-64 machine with the distribution's cross
# toolchain (crossbuild-essential-arm64) and the arm64 development packages installed through
# multiarch. Programs the build or the tests must run (test discovery, generators) go through
# qemu-user, so nothing here needs an ARM machine. "make test-arm64" uses this file.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR aarch64)

set(QUILLANE_CROSS_TRIPLET aarch64-linux-gnu)
set(CMAKE_C_COMPILER ${QUILLANE_CROSS_TRIPLET}-gcc)
set(CMAKE_CXX_COMPILER ${QUILLANE_CROSS_TRIPLET}-g++)

# Multiarch keeps the arm64 libraries in /usr/lib/aarch64-linux-gnu beside the host's, and the
# headers mostly shared in /usr/include, so the "sysroot" is the host itself; the cross compiler
# already searches the right library folder, CMake only has to look there for config files.
set(CMAKE_LIBRARY_ARCHITECTURE ${QUILLANE_CROSS_TRIPLET})
set(CMAKE_FIND_ROOT_PATH /usr/${QUILLANE_CROSS_TRIPLET})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY BOTH)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE BOTH)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE BOTH)
set(CMAKE_PREFIX_PATH /usr/lib/${QUILLANE_CROSS_TRIPLET}/cmake)

# pkg-config must read the arm64 .pc files, never the host's. QUILLANE_CROSS_PKG_CONFIG_PATH adds
# folders searched first (make test-arm64 puts a .pc there for a -dev package that multiarch
# cannot install beside the host's).
set(ENV{PKG_CONFIG_LIBDIR} "/usr/lib/${QUILLANE_CROSS_TRIPLET}/pkgconfig:/usr/share/pkgconfig")
if(QUILLANE_CROSS_PKG_CONFIG_PATH)
  set(ENV{PKG_CONFIG_PATH} "${QUILLANE_CROSS_PKG_CONFIG_PATH}")
endif()
list(APPEND CMAKE_TRY_COMPILE_PLATFORM_VARIABLES QUILLANE_CROSS_PKG_CONFIG_PATH)

# Qt's build tools (moc, rcc, uic) are the host's: Debian's qt6-base-dev-tools is one package
# for every architecture.
set(QT_HOST_PATH /usr)

# ARM programs built here (gtest discovery, ctest, build-time generators) run under qemu-user.
# libc6:arm64 puts the arm64 loader at /lib/ld-linux-aarch64.so.1, so no -L prefix is given:
# with -L /usr/aarch64-linux-gnu the cross toolchain's own libc copy is mixed in, and the effect
# tests then ran for many minutes instead of a second.
set(CMAKE_CROSSCOMPILING_EMULATOR qemu-aarch64)
