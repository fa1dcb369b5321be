# What goes where, in four components: runtime, development, tools, standin.
include(CMakePackageConfigHelpers)

# Found next to each other wherever the folder is moved; below /usr the system's own search path does.
if(NOT CMAKE_INSTALL_PREFIX STREQUAL "/usr")
  file(RELATIVE_PATH from_bin_to_lib /${CMAKE_INSTALL_BINDIR} /${CMAKE_INSTALL_LIBDIR})
  set_target_properties(iscsieptool PROPERTIES INSTALL_RPATH "$ORIGIN")
endif()

install(TARGETS iscsieptool EXPORT iscsieptool
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT runtime NAMELINK_COMPONENT development)
install(DIRECTORY include/ DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/iscsieptool COMPONENT development)

# A program that uses the library need not see the platform's library when it is linked, only when it runs.
target_link_options(iscsieptool INTERFACE $<INSTALL_INTERFACE:LINKER:--allow-shlib-undefined>)

set(package_dir ${CMAKE_INSTALL_LIBDIR}/cmake/iscsieptool)
install(EXPORT iscsieptool NAMESPACE iscsieptool:: FILE iscsieptoolConfig.cmake
  DESTINATION ${package_dir} COMPONENT development)
write_basic_package_version_file(iscsieptoolConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/iscsieptoolConfigVersion.cmake DESTINATION ${package_dir} COMPONENT development)

# The paths in the module start at its own folder, so that it may be moved with the rest.
file(RELATIVE_PATH from_module_to_prefix /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
string(REGEX REPLACE "/$" "" from_module_to_prefix ${from_module_to_prefix})
configure_file(cmake/iscsieptool.pc.in iscsieptool.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/iscsieptool.pc
  DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)

if(NOT KELPISCSIEP_LIBRARY)
  install(TARGETS kelpiscsiep
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT standin NAMELINK_SKIP)
endif()

if(ISCSIEPTOOL_BUILD_TOOLS)
  if(DEFINED from_bin_to_lib)
    set_target_properties(epinspect PROPERTIES INSTALL_RPATH "$ORIGIN/${from_bin_to_lib}")
  endif()
  install(TARGETS epinspect epsample RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT tools)
  install(FILES man/epinspect.1 DESTINATION ${CMAKE_INSTALL_MANDIR}/man1 COMPONENT tools)
  install(FILES tools/epinspect/completion.bash RENAME epinspect
    DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions COMPONENT tools)
  install(FILES docs/ep-files.md docs/epinspect-json.md
    DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/epinspect COMPONENT tools)
endif()
