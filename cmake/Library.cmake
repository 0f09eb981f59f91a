# One shared library. Its rooms are folders; each is listed by what it holds.
file(GLOB MARLET_SOURCES CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/MarletFoundation/*/*.cpp
     ${CMAKE_SOURCE_DIR}/MarletFoundation/*.cpp)
file(GLOB MARLET_DIFF_SOURCES CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/MarletDiff/*.cpp)

# The diff engine is compiled by itself, so that nothing of books can creep into it.
add_library(MarletDiff OBJECT ${MARLET_DIFF_SOURCES})
target_include_directories(MarletDiff PRIVATE ${CMAKE_SOURCE_DIR})
target_link_libraries(MarletDiff PRIVATE marlet_options ICU::uc)

# So is the telemetry client, which stands on the platform and the value layer.
file(GLOB TELVANE_REPORTING_SOURCES CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/TelvaneReporting/*.cpp)
add_library(TelvaneReporting OBJECT ${TELVANE_REPORTING_SOURCES})
target_include_directories(TelvaneReporting PRIVATE ${CMAKE_SOURCE_DIR})
target_link_libraries(TelvaneReporting PRIVATE marlet_options)

# So is the archive copier, and only it sees libarchive.
file(GLOB ARC_COPIER_SOURCES CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/ArcCopier/*.cpp)
add_library(ArcCopier OBJECT ${ARC_COPIER_SOURCES})
target_include_directories(ArcCopier PRIVATE ${CMAKE_SOURCE_DIR})
target_link_libraries(ArcCopier PRIVATE marlet_options LibArchive::LibArchive)

add_library(MarletFoundation SHARED ${MARLET_SOURCES})
add_library(MarletFoundation::MarletFoundation ALIAS MarletFoundation)
# Before 1.0 the interface may change with each minor version.
set(MARLET_SOVERSION ${PROJECT_VERSION_MAJOR}.${PROJECT_VERSION_MINOR})
set_target_properties(MarletFoundation PROPERTIES VERSION ${PROJECT_VERSION} SOVERSION ${MARLET_SOVERSION})
target_include_directories(MarletFoundation PUBLIC $<BUILD_INTERFACE:${CMAKE_SOURCE_DIR}>
                                                   $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
target_compile_features(MarletFoundation PUBLIC cxx_std_20)
target_compile_definitions(MarletFoundation PRIVATE MARLET_VERSION_STRING="${PROJECT_VERSION}")
# A build is laid out as what is installed, so that the library finds its resources in the same way.
file(MAKE_DIRECTORY ${CMAKE_BINARY_DIR}/share)
file(CREATE_LINK ${CMAKE_SOURCE_DIR}/Resources ${CMAKE_BINARY_DIR}/share/marlet-foundation SYMBOLIC)
# The library's own calls of what it exports go straight there.
target_compile_options(MarletFoundation PRIVATE -fno-semantic-interposition)
target_link_options(MarletFoundation PRIVATE -Wl,-Bsymbolic-functions
                                             -Wl,--version-script=${CMAKE_SOURCE_DIR}/cmake/exports.map)
set_target_properties(MarletFoundation PROPERTIES LINK_DEPENDS ${CMAKE_SOURCE_DIR}/cmake/exports.map)
target_link_libraries(MarletFoundation PRIVATE $<BUILD_INTERFACE:marlet_options> $<BUILD_INTERFACE:MarletDiff>
                                               $<BUILD_INTERFACE:ArcCopier> $<BUILD_INTERFACE:TelvaneReporting>
                                               $<BUILD_INTERFACE:nlohmann_json::nlohmann_json> LibArchive::LibArchive ICU::i18n ICU::uc
                                               LibXml2::LibXml2 OpenSSL::Crypto uriparser::uriparser Threads::Threads)
# Where tests are built, so that the builds of a check, which are many, take less time. Others compile each file by itself,
# which shows includes that are missing.
if(MARLET_BUILD_TESTS)
  target_precompile_headers(MarletFoundation PRIVATE <algorithm> <functional> <map> <memory> <optional>
                            <string> <variant> <vector>)
endif()

# The same objects for who links statically, and then brings the libraries that they stand on.
add_library(MarletFoundationStatic STATIC $<TARGET_OBJECTS:MarletFoundation> $<TARGET_OBJECTS:MarletDiff>
                                          $<TARGET_OBJECTS:ArcCopier> $<TARGET_OBJECTS:TelvaneReporting>)
add_library(MarletFoundation::Static ALIAS MarletFoundationStatic)
set_target_properties(MarletFoundationStatic PROPERTIES OUTPUT_NAME MarletFoundation EXPORT_NAME Static LINKER_LANGUAGE CXX)
target_include_directories(MarletFoundationStatic INTERFACE $<BUILD_INTERFACE:${CMAKE_SOURCE_DIR}>
                                                            $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
target_compile_features(MarletFoundationStatic INTERFACE cxx_std_20)
target_link_libraries(MarletFoundationStatic PRIVATE LibArchive::LibArchive ICU::i18n ICU::uc LibXml2::LibXml2 OpenSSL::Crypto
                                                     uriparser::uriparser Threads::Threads ${CMAKE_DL_LIBS})
