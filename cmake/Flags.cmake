# Every target of the project links iscsieptool_flags, which stays out of what is installed.
add_library(iscsieptool_flags INTERFACE)
target_compile_features(iscsieptool_flags INTERFACE cxx_std_17)
target_compile_options(iscsieptool_flags INTERFACE
  -Wall -Wextra -Wpedantic -Wconversion -Wsign-conversion -Wshadow -Wold-style-cast -Wformat=2)
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
  target_compile_options(iscsieptool_flags INTERFACE -Wno-psabi)  # remarks on how old compilers passed parameters on ARM
endif()
target_compile_options(iscsieptool_flags INTERFACE -fstack-protector-strong)
target_link_options(iscsieptool_flags INTERFACE LINKER:-z,relro,-z,now)
# File positions are 64 bits wide on 32-bit machines too.
target_compile_definitions(iscsieptool_flags INTERFACE _FILE_OFFSET_BITS=64)

set(CMAKE_CXX_STANDARD 17)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
# The same bytes in whatever folder they are built: programs look for the libraries relative to themselves.
set(CMAKE_BUILD_RPATH_USE_ORIGIN ON)
