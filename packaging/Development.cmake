# What others build with: find_package(QuorixControlStream) and pkg-config.

# Shared by host, plug-in and whoever else has the data store.
set(sharedLibraries DebugServices DPI Variant)

set(exportedTargets
    ControlStreamClient
    ControlStreamDiscovery
    ControlSystemContracts
    QuorixDataStore
    QuorixDataStoreTypes
    QuorixPluginInterface
    QuorixPreferences
    UtilsFileSystem
    UtilsRapidXml
    io
    io_schema
    notification
    utils
)
set_target_properties(quorix_options PROPERTIES EXPORT_NAME options)
add_dependencies(quorix_packaged ${sharedLibraries} ${exportedTargets})

install(TARGETS ${sharedLibraries} EXPORT QuorixControlStreamTargets
    LIBRARY DESTINATION ${libraryFolder} COMPONENT libraries)
install(TARGETS ${exportedTargets} quorix_options EXPORT QuorixControlStreamTargets
    ARCHIVE DESTINATION ${libraryFolder} COMPONENT development)

# Headers lie below their folders, as they are included.
foreach(folder DebugServices DPI Variant utils UtilsFileSystem notification io UtilsRapidXml
        QuorixPluginInterface QuorixDataStore QuorixDataStoreTypes QuorixPreferences)
    install(DIRECTORY ${PROJECT_SOURCE_DIR}/src/${folder}
        DESTINATION ${headerFolder} COMPONENT development FILES_MATCHING PATTERN "*.h")
endforeach()
install(DIRECTORY ${PROJECT_SOURCE_DIR}/src/QuorixPluginControlStreamServer/ControlSystem
    DESTINATION ${headerFolder}/QuorixPluginControlStreamServer COMPONENT development
    FILES_MATCHING PATTERN "I[A-Z]*.h")

# Of the client only what a device's maker needs; the rest may change at any time.
foreach(header AsyncClient AsyncOptions Authorization BackOff Client Discovery Error EventHandlers Lint
        Outcome Records Requests)
    install(FILES ${PROJECT_SOURCE_DIR}/device/ControlStreamClient/${header}.h
        DESTINATION ${headerFolder}/ControlStreamClient COMPONENT development)
endforeach()

install(EXPORT QuorixControlStreamTargets NAMESPACE Quorix::
    DESTINATION ${configFolder} COMPONENT development)
configure_package_config_file(cmake/QuorixControlStreamConfig.cmake.in
    ${CMAKE_CURRENT_BINARY_DIR}/QuorixControlStreamConfig.cmake
    INSTALL_DESTINATION ${configFolder})
# Below 1.0 each minor version may break what was.
write_basic_package_version_file(${CMAKE_CURRENT_BINARY_DIR}/QuorixControlStreamConfigVersion.cmake
    COMPATIBILITY SameMinorVersion)
install(FILES
    ${CMAKE_CURRENT_BINARY_DIR}/QuorixControlStreamConfig.cmake
    ${CMAKE_CURRENT_BINARY_DIR}/QuorixControlStreamConfigVersion.cmake
    DESTINATION ${configFolder} COMPONENT development)

# The file finds the rest from where it lies, so that it holds under any prefix.
file(RELATIVE_PATH fromPkgConfig ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
configure_file(cmake/quorix-control-stream-client.pc.in quorix-control-stream-client.pc @ONLY)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/quorix-control-stream-client.pc
    DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)
