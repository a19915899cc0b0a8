# What lets others find the libraries: by find_package(coresystem), whose version this is, and by pkg-config.
include(CMakePackageConfigHelpers)
set(package_dir ${CMAKE_INSTALL_LIBDIR}/cmake/coresystem)
write_basic_package_version_file(${PROJECT_BINARY_DIR}/coresystemConfigVersion.cmake
                                 COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/coresystemConfigVersion.cmake DESTINATION ${package_dir})

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
