# What both ARM toolchains share; target_triplet is set.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR arm)
set(CMAKE_LIBRARY_ARCHITECTURE ${target_triplet})
if(NOT CMAKE_CXX_COMPILER)
  set(CMAKE_CXX_COMPILER ${target_triplet}-g++)
endif()

set(CMAKE_FIND_ROOT_PATH /usr/${target_triplet})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)

set(CMAKE_CROSSCOMPILING_EMULATOR qemu-arm -L /usr/${target_triplet})
