# 32-bit ARM with hardware floating point: Debian's cross compiler, tests run under the user-mode emulator.
set(target_triplet arm-linux-gnueabihf)
include(${CMAKE_CURRENT_LIST_DIR}/arm.cmake)
