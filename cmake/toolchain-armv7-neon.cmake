# The ARMv7-A soft-float build with NEON allowed, for cores that have it: the same calling
# convention and the same results, with the compiler free to vectorise the pixel loops in NEON.
# (NEON's single-precision arithmetic is not IEEE-exact, which is why the compiler only uses it
# for integer loops here; the library's few floating-point steps stay in VFP.)
set(PHOTOFX_ARM_FPU neon-vfpv3)
include(${CMAKE_CURRENT_LIST_DIR}/toolchain-armv7-softfp.cmake)
