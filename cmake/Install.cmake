# What is installed: the libraries, the public headers, and what lets others find them, by
# find_package(coresystem) and by pkg-config.
include(${CMAKE_CURRENT_LIST_DIR}/InstallPackage.cmake)

set_target_properties(platform PROPERTIES EXPORT_NAME port)
target_include_directories(coresystem PUBLIC
                           $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}/coresystem-platform>)

install(TARGETS coresystem platform coreutil EXPORT coresystem)

install(FILES ${PROJECT_SOURCE_DIR}/include/CoreSystem.h
              ${PROJECT_SOURCE_DIR}/include/IConnectionStateListener.h
              ${PROJECT_SOURCE_DIR}/port/include/coresystem_port.h
              ${PROJECT_SOURCE_DIR}/port/include/coresystem_testing.h TYPE INCLUDE)
# The platform's own headers that the public ones include; an SDK has them, an ordinary machine has not.
set(platform_headers_dir ${CMAKE_INSTALL_INCLUDEDIR}/coresystem-platform)
foreach(header TelCall TelNetwork TelSim telephony telephony_common telephony_modem telephony_network
    telephony_sim tizen tizen_error tizen_type wifi)
  install(FILES ${PROJECT_SOURCE_DIR}/port/api/${header}.h DESTINATION ${platform_headers_dir})
endforeach()
install(DIRECTORY ${PROJECT_SOURCE_DIR}/port/coreutil/include/
        DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/coreutil FILES_MATCHING PATTERN "*.h")

foreach(page coresystem.1 CoreSystem.3 coresystem-device.5 coresystem.7)
  string(REGEX MATCH "[0-9]$" section ${page})
  install(FILES ${PROJECT_SOURCE_DIR}/docs/man/${page}
          DESTINATION ${CMAKE_INSTALL_MANDIR}/man${section})
endforeach()

# What editors check device files by.
install(FILES ${PROJECT_SOURCE_DIR}/docs/device-file.schema.json
        DESTINATION ${CMAKE_INSTALL_DATADIR}/coresystem)
# The forms of the command's --json.
install(DIRECTORY ${PROJECT_SOURCE_DIR}/docs/schema DESTINATION ${CMAKE_INSTALL_DATADIR}/coresystem)

# Simulated devices that --device and CORESYSTEM_DEVICE know by name.
install(DIRECTORY ${PROJECT_SOURCE_DIR}/samples/ DESTINATION ${CMAKE_INSTALL_DATADIR}/coresystem/devices
        FILES_MATCHING PATTERN "*.toml")

# What plays the other services of a machine for `coresystem device run`.
install(TARGETS played_program DESTINATION ${CMAKE_INSTALL_LIBEXECDIR})

# The service that tells the serial number, its rights on the system bus, and who starts it.
install(TARGETS deviced DESTINATION ${CMAKE_INSTALL_LIBEXECDIR})
set(deviced_dir ${PROJECT_SOURCE_DIR}/port/deviced)
set(deviced_build_dir ${PROJECT_BINARY_DIR}/port/deviced)
install(FILES ${deviced_dir}/org.tizen.system.deviced.conf
        DESTINATION ${CMAKE_INSTALL_DATADIR}/dbus-1/system.d)
install(FILES ${deviced_build_dir}/org.tizen.system.deviced.service
        DESTINATION ${CMAKE_INSTALL_DATADIR}/dbus-1/system-services)
install(FILES ${deviced_build_dir}/coresystem-deviced.service DESTINATION lib/systemd/system)
install(FILES ${deviced_dir}/coresystem-deviced.sysusers RENAME coresystem-deviced.conf DESTINATION lib/sysusers.d)

install(EXPORT coresystem NAMESPACE coresystem:: FILE coresystemConfig.cmake
        DESTINATION ${package_dir})

coresystem_install_pkg_config(coresystem coresystem "${PROJECT_DESCRIPTION}"
  CFLAGS "-I\${includedir}/coresystem-platform")
coresystem_install_pkg_config(coresystem-port coresystem-port
  "Which backend answers on this machine, and where answers come from")
coresystem_install_pkg_config(coreutil coreutil "Logger state, log cipher and named mutexes")
