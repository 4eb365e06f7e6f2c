# Cross build for 32-bit ARM Linux: ARMv7-A, glibc, soft-float calling convention (floating
# point arguments travel in integer registers) with the VFPv3-D16 unit every ARMv7-A core with
# floating point has. No NEON: the base build must run on any such core.
#
# Debian's g++-arm-linux-gnueabi provides the compiler and sysroot; qemu-user runs the results,
# so ctest works unchanged on the build machine.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR armv7-a)

set(PHOTOFX_ARM_TRIPLE arm-linux-gnueabi)
set(PHOTOFX_ARM_SYSROOT /usr/${PHOTOFX_ARM_TRIPLE})

set(CMAKE_C_COMPILER ${PHOTOFX_ARM_TRIPLE}-gcc)
set(CMAKE_CXX_COMPILER ${PHOTOFX_ARM_TRIPLE}-g++)
if(NOT DEFINED PHOTOFX_ARM_FPU)
  set(PHOTOFX_ARM_FPU vfpv3-d16)
endif()
set(PHOTOFX_ARM_FLAGS "-march=armv7-a -mfpu=${PHOTOFX_ARM_FPU} -mfloat-abi=softfp")
set(CMAKE_C_FLAGS_INIT "${PHOTOFX_ARM_FLAGS}")
set(CMAKE_CXX_FLAGS_INIT "${PHOTOFX_ARM_FLAGS}")

set(CMAKE_FIND_ROOT_PATH ${PHOTOFX_ARM_SYSROOT})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)

find_program(PHOTOFX_QEMU_ARM qemu-arm REQUIRED)
set(CMAKE_CROSSCOMPILING_EMULATOR ${PHOTOFX_QEMU_ARM} -L ${PHOTOFX_ARM_SYSROOT})
