# What is installed for a device: the library, and for those who build against it the public headers;
# an SDK has the platform's own, which these include.
include(${CMAKE_CURRENT_LIST_DIR}/InstallPkgConfig.cmake)

install(TARGETS coresystem)
install(FILES ${PROJECT_SOURCE_DIR}/include/CoreSystem.h
              ${PROJECT_SOURCE_DIR}/include/IConnectionStateListener.h TYPE INCLUDE)
coresystem_install_pkg_config(coresystem coresystem "${PROJECT_DESCRIPTION}"
  REQUIRES "capi-network-wifi capi-telephony tapi")
