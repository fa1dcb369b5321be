# Debian packages: cmake -DCMAKE_INSTALL_PREFIX=/usr, then cpack. The stand-in is not packaged: on the target the
# platform's own library is there.
set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME iscsieptool)
set(CPACK_PACKAGE_CONTACT "EP tools maintainers <ep-tools@localhost>")
set(CPACK_PACKAGE_VENDOR "EP tools")
set(CPACK_PACKAGING_INSTALL_PREFIX ${CMAKE_INSTALL_PREFIX})
set(CPACK_STRIP_FILES ON)

set(CPACK_COMPONENTS_ALL runtime development tools)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS OFF)  # the platform's library belongs to no package
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
if(CMAKE_CROSSCOMPILING)
  if(CMAKE_LIBRARY_ARCHITECTURE STREQUAL "arm-linux-gnueabihf")
    set(CPACK_DEBIAN_PACKAGE_ARCHITECTURE armhf)
  else()
    set(CPACK_DEBIAN_PACKAGE_ARCHITECTURE armel)
  endif()
endif()

set(system_libraries "libc6 (>= 2.36), libgcc-s1 (>= 3.5), libstdc++6 (>= 12)")

set(CPACK_DEBIAN_RUNTIME_PACKAGE_NAME libiscsieptool1)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_DEPENDS "${system_libraries}")
set(CPACK_COMPONENT_RUNTIME_DESCRIPTION "Decodes the header blocks, map entries and extents of the EP files in which an
iSCSI target keeps its LUNs. Needs the platform's libkelpiscsiep.so.6.")

set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_NAME libiscsieptool-dev)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS "libiscsieptool1 (= ${PROJECT_VERSION})")
set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION "What is needed to build programs with libiscsieptool.")

set(CPACK_DEBIAN_TOOLS_PACKAGE_NAME epinspect)
set(CPACK_DEBIAN_TOOLS_PACKAGE_SECTION admin)
set(CPACK_DEBIAN_TOOLS_PACKAGE_DEPENDS "libiscsieptool1 (= ${PROJECT_VERSION}), ${system_libraries}")
set(CPACK_COMPONENT_TOOLS_DESCRIPTION "epinspect shows what the EP files of an iSCSI LUN store hold; epsample makes a
sample store to try it on.")

include(CPack)
