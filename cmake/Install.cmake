include(CMakePackageConfigHelpers)
include(cmake/PublicHeaders.cmake)

set(MARLET_RESOURCES_INSTALL_DIR ${CMAKE_INSTALL_DATADIR}/marlet-foundation)
set(MARLET_CMAKE_INSTALL_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/MarletFoundation)

# Three components, a package each: what a program needs to run, what a build needs, and the command.
install(TARGETS MarletFoundation EXPORT MarletFoundationTargets
        LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT runtime NAMELINK_COMPONENT development)
install(DIRECTORY Resources/ DESTINATION ${MARLET_RESOURCES_INSTALL_DIR} COMPONENT runtime)

install(TARGETS MarletFoundationStatic EXPORT MarletFoundationStaticTargets
        ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT development)
foreach(header IN LISTS MARLET_PUBLIC_HEADERS)
  cmake_path(GET header PARENT_PATH directory)
  install(FILES ${header} DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/${directory} COMPONENT development)
endforeach()
foreach(targets IN ITEMS MarletFoundationTargets MarletFoundationStaticTargets)
  install(EXPORT ${targets} NAMESPACE MarletFoundation:: DESTINATION ${MARLET_CMAKE_INSTALL_DIR} COMPONENT development)
endforeach()
configure_package_config_file(cmake/MarletFoundationConfig.cmake.in MarletFoundationConfig.cmake
                              INSTALL_DESTINATION ${MARLET_CMAKE_INSTALL_DIR} PATH_VARS MARLET_RESOURCES_INSTALL_DIR)
write_basic_package_version_file(MarletFoundationConfigVersion.cmake COMPATIBILITY SameMinorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/MarletFoundationConfig.cmake
              ${CMAKE_CURRENT_BINARY_DIR}/MarletFoundationConfigVersion.cmake
        DESTINATION ${MARLET_CMAKE_INSTALL_DIR} COMPONENT development)

# From where the file lies, so that the installed tree can be moved.
file(RELATIVE_PATH MARLET_PC_PREFIX /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
configure_file(cmake/MarletFoundation.pc.in MarletFoundation.pc @ONLY)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/MarletFoundation.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig
        COMPONENT development)

file(RELATIVE_PATH MARLET_LIBDIR_FROM_BINDIR /${CMAKE_INSTALL_BINDIR} /${CMAKE_INSTALL_LIBDIR})
set_target_properties(marlet PROPERTIES INSTALL_RPATH "$ORIGIN/${MARLET_LIBDIR_FROM_BINDIR}")
install(TARGETS marlet RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT tool)
install(FILES ${MARLET_REFERENCE_DIR}/marlet.1.gz DESTINATION ${CMAKE_INSTALL_MANDIR}/man1 COMPONENT tool)
install(FILES ${MARLET_REFERENCE_DIR}/marlet DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions COMPONENT tool)
install(FILES ${MARLET_REFERENCE_DIR}/_marlet DESTINATION ${CMAKE_INSTALL_DATADIR}/zsh/vendor-completions COMPONENT tool)
install(FILES ${MARLET_REFERENCE_DIR}/marlet.fish DESTINATION ${CMAKE_INSTALL_DATADIR}/fish/vendor_completions.d
        COMPONENT tool)
