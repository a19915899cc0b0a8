# Writes and installs NAME.pc; it holds no absolute path, so an installed tree can be moved.
#
#   coresystem_install_pkg_config(NAME LIBRARY DESCRIPTION [CFLAGS FLAGS] [REQUIRES MODULES])
function(coresystem_install_pkg_config name library description)
  cmake_parse_arguments(arg "" "CFLAGS;REQUIRES" "" ${ARGN})
  set(pkg_config_dir ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
  file(RELATIVE_PATH up /${pkg_config_dir} /)
  string(REGEX REPLACE "/$" "" up "${up}")
  configure_file(${PROJECT_SOURCE_DIR}/cmake/package.pc.in ${PROJECT_BINARY_DIR}/${name}.pc @ONLY)
  install(FILES ${PROJECT_BINARY_DIR}/${name}.pc DESTINATION ${pkg_config_dir})
endfunction()
