# What goes where, in four components: runtime, development, tools, standin. The folders are those of GNUInstallDirs.
include(CMakePackageConfigHelpers)

# Programs look for the libraries relative to themselves, so that an installation may be moved; in the system's own
# folders that is not needed.
set(system_libdirs /lib /usr/lib /usr/lib/${CMAKE_LIBRARY_ARCHITECTURE})
if(NOT CMAKE_INSTALL_FULL_LIBDIR IN_LIST system_libdirs)
  set_target_properties(iscsieptool PROPERTIES INSTALL_RPATH "$ORIGIN")
  if(IS_ABSOLUTE ${CMAKE_INSTALL_BINDIR} OR IS_ABSOLUTE ${CMAKE_INSTALL_LIBDIR})
    set(programs_rpath ${CMAKE_INSTALL_FULL_LIBDIR})
  else()
    file(RELATIVE_PATH from_bin_to_lib /${CMAKE_INSTALL_BINDIR} /${CMAKE_INSTALL_LIBDIR})
    set(programs_rpath "$ORIGIN/${from_bin_to_lib}")
  endif()
endif()

install(TARGETS iscsieptool EXPORT iscsieptool
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT runtime NAMELINK_COMPONENT development)
install(DIRECTORY include/ DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/iscsieptool COMPONENT development)

# A consumer needs the platform's library when it runs. The machine where it is linked seldom has that library, so its
# symbols may stay unresolved there. The package config and the .pc take the option from here.
set(consumer_link_option --allow-shlib-undefined)
target_link_options(iscsieptool INTERFACE $<INSTALL_INTERFACE:LINKER:${consumer_link_option}>)

set(package_dir ${CMAKE_INSTALL_LIBDIR}/cmake/iscsieptool)
install(EXPORT iscsieptool NAMESPACE iscsieptool:: FILE iscsieptoolConfig.cmake
  DESTINATION ${package_dir} COMPONENT development)
write_basic_package_version_file(iscsieptoolConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/iscsieptoolConfigVersion.cmake DESTINATION ${package_dir} COMPONENT development)

# The paths in the .pc start at its own folder, so that it may be moved with the rest; an absolute folder stays put.
set(pc_prefix ${CMAKE_INSTALL_PREFIX})
if(NOT IS_ABSOLUTE ${CMAKE_INSTALL_LIBDIR})
  file(RELATIVE_PATH from_pc_to_prefix /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
  string(REGEX REPLACE "/$" "" pc_prefix "\${pcfiledir}/${from_pc_to_prefix}")
endif()
foreach(folder LIBDIR INCLUDEDIR)
  set(pc_${folder} ${CMAKE_INSTALL_${folder}})
  if(NOT IS_ABSOLUTE ${pc_${folder}})
    set(pc_${folder} "\${prefix}/${pc_${folder}}")
  endif()
endforeach()
configure_file(cmake/iscsieptool.pc.in iscsieptool.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/iscsieptool.pc
  DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)

if(NOT KELPISCSIEP_LIBRARY)
  install(TARGETS kelpiscsiep
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT standin NAMELINK_SKIP)
endif()

if(ISCSIEPTOOL_BUILD_TOOLS)
  if(DEFINED programs_rpath)
    set_target_properties(epinspect PROPERTIES INSTALL_RPATH "${programs_rpath}")
  endif()
  install(TARGETS epinspect epsample RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT tools)
  install(DIRECTORY man/ DESTINATION ${CMAKE_INSTALL_MANDIR}/man1 COMPONENT tools FILES_MATCHING PATTERN ep*.1)
  install(FILES tools/epinspect/completion.bash RENAME epinspect
    DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions COMPONENT tools)
  install(FILES docs/broken-store.md docs/ep-files.md docs/epinspect-json.md docs/findings.md
    DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/epinspect COMPONENT tools)
endif()

# In nbdkit's folder for plugins, wherever that lies below this prefix.
if(ISCSIEPTOOL_BUILD_NBDKIT)
  pkg_get_variable(nbdkit_prefix nbdkit prefix)
  pkg_get_variable(nbdkit_plugindir nbdkit plugindir)
  file(RELATIVE_PATH plugin_dir ${nbdkit_prefix} ${nbdkit_plugindir})
  if(DEFINED programs_rpath AND NOT IS_ABSOLUTE ${CMAKE_INSTALL_LIBDIR})
    file(RELATIVE_PATH from_plugin_to_lib /${plugin_dir} /${CMAKE_INSTALL_LIBDIR})
    set_target_properties(nbdkit_ep_plugin PROPERTIES INSTALL_RPATH "$ORIGIN/${from_plugin_to_lib}")
  elseif(DEFINED programs_rpath)
    set_target_properties(nbdkit_ep_plugin PROPERTIES INSTALL_RPATH ${CMAKE_INSTALL_FULL_LIBDIR})
  endif()
  install(TARGETS nbdkit_ep_plugin LIBRARY DESTINATION ${plugin_dir} COMPONENT nbdkit)
  install(FILES man/nbdkit-ep-plugin.1 DESTINATION ${CMAKE_INSTALL_MANDIR}/man1 COMPONENT nbdkit)
endif()
