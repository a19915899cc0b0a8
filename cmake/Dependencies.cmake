# What the build takes from others: asked for with the least version that it is known to work with, and
# with the Debian package that holds it. docs/dependencies.md says what each is for.
set(CMAKE_FIND_PACKAGE_TARGETS_GLOBAL ON)
find_package(PkgConfig QUIET)
if(NOT PKG_CONFIG_FOUND)
  message(FATAL_ERROR "pkg-config is needed to find libraries. Debian: apt install pkg-config")
endif()

function(coresystem_say_missing what version package found)
  if(NOT found STREQUAL "")
    set(found " (what is here: ${found})")
  endif()
  message(FATAL_ERROR "${what} ${version} or newer is needed${found}. Debian: apt install ${package}")
endfunction()

# A module of pkg-config, as PkgConfig::PREFIX.
macro(coresystem_require_module prefix module version package)
  pkg_check_modules(${prefix} QUIET IMPORTED_TARGET GLOBAL ${module}>=${version})
  if(NOT ${prefix}_FOUND)
    execute_process(COMMAND ${PKG_CONFIG_EXECUTABLE} --modversion ${module}
      OUTPUT_VARIABLE ${prefix}_HERE OUTPUT_STRIP_TRAILING_WHITESPACE ERROR_QUIET)
    coresystem_say_missing(${module} ${version} ${package} "${${prefix}_HERE}")
  endif()
endmacro()

# A package of find_package(), which gets the further arguments.
macro(coresystem_require_package name version package)
  find_package(${name} ${version} QUIET ${ARGN})
  if(NOT ${name}_FOUND)
    coresystem_say_missing(${name} ${version} ${package} "${${name}_VERSION}")
  endif()
endmacro()
