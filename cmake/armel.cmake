# 32-bit ARM with software floating point: Debian's cross compiler, tests run under the user-mode emulator.
set(target_triplet arm-linux-gnueabi)
include(${CMAKE_CURRENT_LIST_DIR}/arm.cmake)
