# Cross-compiles for a Debian architecture: TELIX_MACHINE says which one, TELIX_SYSROOT where its sysroot is. Tests run
# under qemu, if it is installed; those for i386 without it, if this machine runs them.
set(CMAKE_TRY_COMPILE_PLATFORM_VARIABLES TELIX_MACHINE TELIX_SYSROOT)

# The machines: Debian's name, the compiler's prefix, the folder of libraries, the processor, the emulator.
set(telix_machine_armhf arm-linux-gnueabihf arm-linux-gnueabihf armv7l qemu-arm-static)
set(telix_machine_arm64 aarch64-linux-gnu aarch64-linux-gnu aarch64 qemu-aarch64-static)
set(telix_machine_i386 i686-linux-gnu i386-linux-gnu i686 qemu-i386-static)
set(telix_machine_mipsel mipsel-linux-gnu mipsel-linux-gnu mips qemu-mipsel-static)

if(NOT DEFINED telix_machine_${TELIX_MACHINE})
  message(FATAL_ERROR "TELIX_MACHINE: ${TELIX_MACHINE}: expected armhf, arm64, i386 or mipsel")
endif()
list(GET telix_machine_${TELIX_MACHINE} 0 telix_prefix)
list(GET telix_machine_${TELIX_MACHINE} 1 telix_multiarch)
list(GET telix_machine_${TELIX_MACHINE} 2 CMAKE_SYSTEM_PROCESSOR)
list(GET telix_machine_${TELIX_MACHINE} 3 telix_emulator)
if(NOT EXISTS "${TELIX_SYSROOT}/.complete")
  message(FATAL_ERROR "TELIX_SYSROOT: ${TELIX_SYSROOT}: no complete sysroot, make it with "
    "tools/make-sysroot.sh ${TELIX_MACHINE} ${TELIX_SYSROOT}")
endif()

set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSROOT ${TELIX_SYSROOT})
set(CMAKE_LIBRARY_ARCHITECTURE ${telix_multiarch})
set(CMAKE_C_COMPILER ${telix_prefix}-gcc)
set(CMAKE_CXX_COMPILER ${telix_prefix}-g++)
# Strings as in the C++ run time before g++ 5, which sets have. No C++ type crosses the border of the plug-in, so notes on how
# compilers once passed them help nobody.
set(CMAKE_CXX_FLAGS_INIT "-D_GLIBCXX_USE_CXX11_ABI=0 -Wno-psabi")
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)

set(ENV{PKG_CONFIG_SYSROOT_DIR} ${TELIX_SYSROOT})
set(ENV{PKG_CONFIG_LIBDIR} ${TELIX_SYSROOT}/usr/lib/${telix_multiarch}/pkgconfig:${TELIX_SYSROOT}/usr/share/pkgconfig)
set(ENV{PKG_CONFIG_PATH} "")

# TELIX_RUNNER: the command before each program of the machine. A 64-bit x86 processor and kernel run those for i386 with the
# sysroot's own dynamic linker.
set(loader ${TELIX_SYSROOT}/lib/ld-linux.so.2)
set(folders ${TELIX_SYSROOT}/lib/${telix_multiarch}:${TELIX_SYSROOT}/usr/lib/${telix_multiarch})
find_program(TELIX_EMULATOR ${telix_emulator})
set(result 1)
if(TELIX_MACHINE STREQUAL i386)
  execute_process(COMMAND ${loader} --version RESULT_VARIABLE result OUTPUT_QUIET ERROR_QUIET)
endif()
if(result EQUAL 0)
  set(TELIX_RUNNER ${loader} --library-path ${folders} CACHE STRING "The command that runs programs of the machine")
elseif(TELIX_EMULATOR)
  set(TELIX_RUNNER ${TELIX_EMULATOR} -L ${TELIX_SYSROOT} CACHE STRING "The command that runs programs of the machine")
endif()
set(CMAKE_CROSSCOMPILING_EMULATOR ${TELIX_RUNNER})
