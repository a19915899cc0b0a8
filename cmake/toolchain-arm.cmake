# What the ARM toolchains share; the programs run here under qemu.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR ${arm_processor})

list(APPEND CMAKE_TRY_COMPILE_PLATFORM_VARIABLES CORESYSTEM_SYSROOT)
if(CORESYSTEM_SYSROOT)
  get_filename_component(CMAKE_SYSROOT ${CORESYSTEM_SYSROOT} ABSOLUTE)
  set(ENV{PKG_CONFIG_SYSROOT_DIR} ${CMAKE_SYSROOT})
else() # whose modules tell paths inside
  get_filename_component(CMAKE_SYSROOT
    ${CMAKE_CURRENT_LIST_DIR}/../build/sysroot-${arm_debian_architecture} ABSOLUTE)
endif()
if(NOT EXISTS ${CMAKE_SYSROOT})
  message(FATAL_ERROR "${CMAKE_SYSROOT} is not there: tools/arm-sysroot ${arm_debian_architecture}")
endif()

set(CMAKE_C_COMPILER ${arm_triplet}-gcc)
set(CMAKE_CXX_COMPILER ${arm_triplet}-g++)
set(CMAKE_C_FLAGS_INIT ${arm_flags})
set(CMAKE_CXX_FLAGS_INIT ${arm_flags})
set(CMAKE_LIBRARY_ARCHITECTURE ${arm_triplet})

set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(pkgconfig_dirs)
foreach(dir lib/${arm_triplet} lib share)
  list(APPEND pkgconfig_dirs ${CMAKE_SYSROOT}/usr/${dir}/pkgconfig)
endforeach()
list(JOIN pkgconfig_dirs ":" pkgconfig_dirs)
set(ENV{PKG_CONFIG_LIBDIR} ${pkgconfig_dirs})

set(CMAKE_CROSSCOMPILING_EMULATOR ${arm_emulator} -L ${CMAKE_SYSROOT})
