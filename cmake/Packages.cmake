# Debian packages, one a component: `cmake --build BUILD --target package` writes them into the build directory.
set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME marlet-foundation)
set(CPACK_PACKAGE_CONTACT "MarletFoundation maintainers <maintainers@marlet.example>" CACHE STRING
                          "Who answers for the packages")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_COMPONENTS_ALL runtime development tool)
set(CPACK_STRIP_FILES ON)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ
                                                WORLD_EXECUTE)

set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_ENABLE_COMPONENT_DEPENDS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${CMAKE_LIBRARY_OUTPUT_DIRECTORY})

set(about "MarletFoundation opens, checks, edits, diffs, merges and writes
directory-shaped books of interactive lessons, and the classic documents that
came before them.")

# CPack itself only calls ldconfig, where Debian has a trigger for it.
file(WRITE ${CMAKE_BINARY_DIR}/debian/triggers "activate-noawait ldconfig\n")
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS_POLICY ">=")
set(CPACK_DEBIAN_RUNTIME_PACKAGE_CONTROL_EXTRA ${CMAKE_BINARY_DIR}/debian/triggers)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_NAME libmarletfoundation${MARLET_SOVERSION})
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SHLIBDEPS ON)
set(CPACK_COMPONENT_RUNTIME_DESCRIPTION "library for interactive lesson documents
${about}

This package holds the shared library and the targets that it knows.")

set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_NAME libmarletfoundation-dev)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
set(CPACK_COMPONENT_DEVELOPMENT_DEPENDS runtime)
# For who links statically.
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_RECOMMENDS "libarchive-dev, libicu-dev, libxml2-dev, libssl-dev, liburiparser-dev")
set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION "library for interactive lesson documents (development files)
${about}

This package holds the headers, the static library, and what CMake and
pkg-config need to find them.")

set(CPACK_DEBIAN_TOOL_PACKAGE_NAME marlet)
set(CPACK_DEBIAN_TOOL_PACKAGE_SECTION text)
set(CPACK_DEBIAN_TOOL_PACKAGE_SHLIBDEPS ON)
set(CPACK_COMPONENT_TOOL_DEPENDS runtime)
set(CPACK_COMPONENT_TOOL_DESCRIPTION "create, check and ship books of interactive lessons
${about}

This package holds the command, with its manual page and completions for bash,
zsh and fish.")

include(CPack)
