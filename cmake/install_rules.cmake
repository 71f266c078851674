# What an installation holds: the library, its headers, and how pkg-config and find_package find them.
include(CMakePackageConfigHelpers)

install(TARGETS tavosdk tavosdk_static EXPORT tavosdkTargets
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}
    ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/ DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} FILES_MATCHING PATTERN "*.h")

install(EXPORT tavosdkTargets NAMESPACE tavosdk:: DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/tavosdk)
configure_package_config_file(${PROJECT_SOURCE_DIR}/cmake/tavosdkConfig.cmake.in
    ${PROJECT_BINARY_DIR}/tavosdkConfig.cmake
    INSTALL_DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/tavosdk)
write_basic_package_version_file(${PROJECT_BINARY_DIR}/tavosdkConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/tavosdkConfig.cmake ${PROJECT_BINARY_DIR}/tavosdkConfigVersion.cmake
    DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/tavosdk)

configure_file(${PROJECT_SOURCE_DIR}/cmake/tavosdk.pc.in ${PROJECT_BINARY_DIR}/tavosdk.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/tavosdk.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)

# Keeps the cleaner of /tmp away from the lock files.
install(FILES ${PROJECT_SOURCE_DIR}/cmake/tavosdk-tmpfiles.conf DESTINATION lib/tmpfiles.d RENAME tavosdk.conf)
