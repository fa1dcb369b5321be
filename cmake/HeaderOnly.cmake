# iscsieptool_header_only(TARGET FOLDER): an interface target for a header-only library that lies in FOLDER of an
# include path. A cross compiler must not see the host's include path as a whole, or it picks up the host's C headers:
# it gets a folder with a link to the library alone.
function(iscsieptool_header_only target folder)
  find_path(${target}_INCLUDE_DIR NAMES ${folder} PATHS /usr/include REQUIRED NO_CMAKE_FIND_ROOT_PATH)
  set(include_dir ${${target}_INCLUDE_DIR})
  if(CMAKE_CROSSCOMPILING)
    set(link_dir ${PROJECT_BINARY_DIR}/header-only/${folder})
    file(MAKE_DIRECTORY ${link_dir})
    file(CREATE_LINK ${include_dir}/${folder} ${link_dir}/${folder} SYMBOLIC)
    set(include_dir ${link_dir})
  endif()
  add_library(${target} INTERFACE)
  target_include_directories(${target} SYSTEM INTERFACE ${include_dir})
endfunction()
