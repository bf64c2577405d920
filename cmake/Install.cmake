# What an installation holds: the engine, the foundation, their headers, and packages for CMake and pkg-config.
include(CMakePackageConfigHelpers)

set(config_folder ${CMAKE_INSTALL_LIBDIR}/cmake/Vantrel)

# Headers keep the paths by which the project itself includes them.
install(DIRECTORY Include/Vantrel DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/vantrel)
foreach(library IN ITEMS Halden Ostrand Vellum Marl Brae Tarn)
    install(DIRECTORY Foundation/${library} DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/vantrel FILES_MATCHING PATTERN "*.h")
endforeach()
# Of Kiln only what its public headers are: the backends' ways are its own.
install(FILES
    Foundation/Kiln/BlendMode.h
    Foundation/Kiln/Device.h
    Foundation/Kiln/DeviceCommands.h
    Foundation/Kiln/FrameCache.h
    Foundation/Kiln/FrameOperations.h
    Foundation/Kiln/Frames.h
    Foundation/Kiln/MemoryManager.h
    Foundation/Kiln/Modules.h
    DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/vantrel/Kiln)

install(EXPORT VantrelTargets NAMESPACE Vantrel:: DESTINATION ${config_folder})
configure_package_config_file(cmake/VantrelConfig.cmake.in ${PROJECT_BINARY_DIR}/VantrelConfig.cmake
    INSTALL_DESTINATION ${config_folder})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/VantrelConfigVersion.cmake COMPATIBILITY SameMinorVersion)
install(FILES ${PROJECT_BINARY_DIR}/VantrelConfig.cmake ${PROJECT_BINARY_DIR}/VantrelConfigVersion.cmake
    DESTINATION ${config_folder})

configure_file(cmake/vantrel.pc.in ${PROJECT_BINARY_DIR}/vantrel.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/vantrel.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
