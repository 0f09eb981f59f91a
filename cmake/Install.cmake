include(CMakePackageConfigHelpers)

set(MARLET_RESOURCES_INSTALL_DIR ${CMAKE_INSTALL_DATADIR}/marlet-foundation)
set(MARLET_CMAKE_INSTALL_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/MarletFoundation)

set_target_properties(marlet PROPERTIES INSTALL_RPATH "$ORIGIN/../${CMAKE_INSTALL_LIBDIR}")
install(TARGETS MarletFoundation EXPORT MarletFoundationTargets LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(TARGETS marlet RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})
install(DIRECTORY MarletFoundation MarletDiff DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} FILES_MATCHING PATTERN "*.h")
install(FILES ArcCopier/ArcCopier.h DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/ArcCopier)
install(DIRECTORY Resources/ DESTINATION ${MARLET_RESOURCES_INSTALL_DIR})

install(EXPORT MarletFoundationTargets NAMESPACE MarletFoundation:: DESTINATION ${MARLET_CMAKE_INSTALL_DIR})
configure_package_config_file(cmake/MarletFoundationConfig.cmake.in MarletFoundationConfig.cmake
                              INSTALL_DESTINATION ${MARLET_CMAKE_INSTALL_DIR})
write_basic_package_version_file(MarletFoundationConfigVersion.cmake COMPATIBILITY SameMinorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/MarletFoundationConfig.cmake
              ${CMAKE_CURRENT_BINARY_DIR}/MarletFoundationConfigVersion.cmake
        DESTINATION ${MARLET_CMAKE_INSTALL_DIR})

# From where the file lies, so that the installed tree can be moved.
file(RELATIVE_PATH MARLET_PC_PREFIX /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
configure_file(cmake/MarletFoundation.pc.in MarletFoundation.pc @ONLY)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/MarletFoundation.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
