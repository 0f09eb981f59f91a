set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)
set(CMAKE_RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/bin)
set(CMAKE_LIBRARY_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/lib)
set(CMAKE_ARCHIVE_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/lib)
if(NOT CMAKE_BUILD_TYPE)
  set(CMAKE_BUILD_TYPE Release)
endif()

# Debian keeps libraries in a directory for each architecture, below any prefix.
if(CMAKE_LIBRARY_ARCHITECTURE AND EXISTS /etc/debian_version)
  set(CMAKE_INSTALL_LIBDIR lib/${CMAKE_LIBRARY_ARCHITECTURE} CACHE PATH "Where libraries are installed to")
endif()
include(GNUInstallDirs)

# Warnings and sanitizers are for our own targets only, never for who links us. Warnings are errors in the presets for
# development: another compiler, or another level of optimisation, has warnings of its own.
add_library(marlet_options INTERFACE)
target_compile_options(marlet_options INTERFACE -Wall -Wextra -Wpedantic -Wshadow -Wnon-virtual-dtor)
# g++ 12 takes string concatenation for overlapping copies when it optimises.
target_compile_options(marlet_options INTERFACE $<$<CXX_COMPILER_ID:GNU>:-Wno-restrict>)
if(MARLET_SANITIZE)
  target_compile_options(marlet_options INTERFACE -fsanitize=${MARLET_SANITIZE} -fno-omit-frame-pointer
                                                  -fno-sanitize-recover=all)
  target_link_options(marlet_options INTERFACE -fsanitize=${MARLET_SANITIZE})
endif()
