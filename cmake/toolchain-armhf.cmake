# Cross-compiles for the appliance: 32-bit ARM, hard float, against Debian's own libraries for it.

set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR armv7l)
set(CMAKE_LIBRARY_ARCHITECTURE arm-linux-gnueabihf)

set(CMAKE_C_COMPILER arm-linux-gnueabihf-gcc)
set(CMAKE_CXX_COMPILER arm-linux-gnueabihf-g++)

# CMake reads this file once more for every compiler check: those inherit the directory.
if(NOT TAVO_SYSROOT)
    execute_process(COMMAND ${CMAKE_CURRENT_LIST_DIR}/../tools/appliance/arm/sysroot
        OUTPUT_VARIABLE TAVO_SYSROOT OUTPUT_STRIP_TRAILING_WHITESPACE RESULT_VARIABLE failed)
    if(failed)
        message(FATAL_ERROR "There is no sysroot for 32-bit ARM")
    endif()
endif()
list(APPEND CMAKE_TRY_COMPILE_PLATFORM_VARIABLES TAVO_SYSROOT)
set(CMAKE_SYSROOT ${TAVO_SYSROOT})
set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS
    ${CMAKE_CURRENT_LIST_DIR}/../tools/appliance/arm/packages/sysroot.list)

# Libraries and headers come from the sysroot alone; programs that run during the build from this machine.
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)
set(ENV{PKG_CONFIG_DIR} "")
set(ENV{PKG_CONFIG_SYSROOT_DIR} ${TAVO_SYSROOT})
set(ENV{PKG_CONFIG_LIBDIR} ${TAVO_SYSROOT}/usr/lib/arm-linux-gnueabihf/pkgconfig:${TAVO_SYSROOT}/usr/share/pkgconfig)

# 32-bit ARM has 32-bit time_t and off_t by default; this changes it for all code, not only for the library.
set(CMAKE_C_FLAGS_INIT "-D_FILE_OFFSET_BITS=64 -D_TIME_BITS=64")
set(CMAKE_CXX_FLAGS_INIT "-D_FILE_OFFSET_BITS=64 -D_TIME_BITS=64")

# What the build itself runs (listing the cases of a test) runs in the emulator of a single program.
set(CMAKE_CROSSCOMPILING_EMULATOR qemu-arm-static;-L;${TAVO_SYSROOT})
