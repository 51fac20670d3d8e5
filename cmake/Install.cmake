# cmake --install: the two libraries, their public headers, the tool, and the
# package that find_package(ZonCloud CONFIG) reads (ZonCloud::ImportExport,
# ZonCloud::Host).
include(CMakePackageConfigHelpers)

add_library(ZonCloud::Host ALIAS ZonHost)
add_library(ZonCloud::ImportExport ALIAS ZonCloudImportExport)
set_target_properties(ZonHost PROPERTIES EXPORT_NAME Host VERSION ${PROJECT_VERSION}
                                         SOVERSION ${PROJECT_VERSION_MAJOR})
set_target_properties(ZonCloudImportExport PROPERTIES EXPORT_NAME ImportExport VERSION ${PROJECT_VERSION}
                                                      SOVERSION ${PROJECT_VERSION_MAJOR})
# The installed tool finds the installed libraries wherever the prefix is.
set_target_properties(zoncloud PROPERTIES INSTALL_RPATH "$ORIGIN/../${CMAKE_INSTALL_LIBDIR}")

install(TARGETS ZonHost ZonCloudImportExport EXPORT ZonCloudTargets
        LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}
        INCLUDES DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/ZonCloud)
install(TARGETS zoncloud RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})

# The host's headers, the module's reader, writer and factory interfaces, and
# the import entry with what it names.
file(GLOB ZON_PUBLIC_HEADERS CONFIGURE_DEPENDS ZonHost/include/*.h ZonCloudImportExport/PublicInterfaces/*.h)
set(ZON_SPINE ZonCloudImportExport/ZonCldImportExport.m/src)
list(APPEND ZON_PUBLIC_HEADERS ${ZON_SPINE}/ZonCldImportServices.h ${ZON_SPINE}/ZonCldImporter.h)
install(FILES ${ZON_PUBLIC_HEADERS} DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/ZonCloud)

set(ZON_PACKAGE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/ZonCloud)
install(EXPORT ZonCloudTargets NAMESPACE ZonCloud:: DESTINATION ${ZON_PACKAGE_DIR})
configure_package_config_file(cmake/ZonCloudConfig.cmake.in ${CMAKE_BINARY_DIR}/ZonCloudConfig.cmake
                              INSTALL_DESTINATION ${ZON_PACKAGE_DIR})
write_basic_package_version_file(${CMAKE_BINARY_DIR}/ZonCloudConfigVersion.cmake
                                 COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_BINARY_DIR}/ZonCloudConfig.cmake ${CMAKE_BINARY_DIR}/ZonCloudConfigVersion.cmake
        DESTINATION ${ZON_PACKAGE_DIR})
