# What every target shares.
option(CORESYSTEM_WARNINGS_AS_ERRORS "Stop at the first warning" OFF)
option(CORESYSTEM_COVERAGE "Count executed lines" OFF)
set(CORESYSTEM_SANITIZE "" CACHE STRING "Sanitizers to build with, as -fsanitize takes them")
set(CORESYSTEM_STRINGS "new" CACHE STRING "Layout of std::string in the interface: new or old")
set_property(CACHE CORESYSTEM_STRINGS PROPERTY STRINGS new old)

if(NOT CMAKE_BUILD_TYPE)
  set(CMAKE_BUILD_TYPE RelWithDebInfo CACHE STRING "Debug, Release, RelWithDebInfo or MinSizeRel" FORCE)
endif()
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)
set(CMAKE_BUILD_RPATH_USE_ORIGIN ON)
if(CORESYSTEM_PLATFORM STREQUAL "device") # has all libraries in one place
  set(CMAKE_SKIP_RPATH ON)
endif()
# All binaries of a build stand together, so that each finds the others by its own place.
set(CMAKE_LIBRARY_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/lib)
set(CMAKE_RUNTIME_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/bin)

add_compile_options(-Wall -Wextra -Wpedantic -Wshadow -Wconversion
                    "-fmacro-prefix-map=${PROJECT_SOURCE_DIR}/=")
if(CORESYSTEM_WARNINGS_AS_ERRORS)
  add_compile_options(-Werror)
endif()
if(CORESYSTEM_STRINGS STREQUAL "old") # that of g++ before 5
  add_compile_definitions(_GLIBCXX_USE_CXX11_ABI=0)
elseif(NOT CORESYSTEM_STRINGS STREQUAL "new")
  message(FATAL_ERROR "CORESYSTEM_STRINGS=${CORESYSTEM_STRINGS}: it is new or old")
endif()
if(CORESYSTEM_SANITIZE)
  add_compile_options(-fsanitize=${CORESYSTEM_SANITIZE} -fno-sanitize-recover=all
                      -fno-omit-frame-pointer)
  if(CORESYSTEM_SANITIZE MATCHES "undefined")
    # The other sanitizer finds these too; of the compiler's time they take the most.
    add_compile_options(-fno-sanitize=null,object-size)
  endif()
  add_link_options(-fsanitize=${CORESYSTEM_SANITIZE})
endif()
if(CORESYSTEM_COVERAGE)
  add_compile_options(--coverage)
  add_link_options(--coverage)
endif()

# Exports exactly what a map file lists.
function(coresystem_export_only target map)
  target_link_options(${target} PRIVATE "-Wl,--version-script,${map}")
  if(NOT CORESYSTEM_SANITIZE) # the sanitizers' own functions come with the program
    target_link_options(${target} PRIVATE -Wl,-z,defs)
  endif()
  set_property(TARGET ${target} APPEND PROPERTY LINK_DEPENDS ${map})
endfunction()
