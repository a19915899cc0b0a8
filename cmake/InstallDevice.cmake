# What is installed for a device: the library, and for those who build against it the public headers;
# an SDK has the platform's own, which these include.
include(${CMAKE_CURRENT_LIST_DIR}/InstallPackage.cmake)

set(platform_modules "capi-network-wifi capi-telephony tapi")
install(TARGETS coresystem EXPORT coresystem)
install(FILES ${PROJECT_SOURCE_DIR}/include/CoreSystem.h
              ${PROJECT_SOURCE_DIR}/include/IConnectionStateListener.h TYPE INCLUDE)
coresystem_install_pkg_config(coresystem coresystem "${PROJECT_DESCRIPTION}"
  REQUIRES "${platform_modules}")

install(EXPORT coresystem NAMESPACE coresystem:: FILE coresystemTargets.cmake
        DESTINATION ${package_dir})
configure_file(${CMAKE_CURRENT_LIST_DIR}/deviceConfig.cmake.in
               ${PROJECT_BINARY_DIR}/coresystemConfig.cmake @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/coresystemConfig.cmake DESTINATION ${package_dir})
