# The contents of an installation, in components that a packager can take one by one:
#   runtime      the library, the small one that it loads itself, and what keeps /tmp's cleaner away from its lock files
#   development  headers, and what pkg-config and find_package need
#   tavoctl      the command-line program with its man page and completion
#   appliance    the discovery daemon and the partitioning tool, which only an appliance runs
#   documentation, python   the reference and the Python module, where they are built (python/CMakeLists.txt)
# The archive of the same objects is for the tests: a program that linked it would have to bring the C++ runtime and every
# dependency along, and would keep the faults that an update of the library mends.
include(CMakePackageConfigHelpers)

install(TARGETS tavosdk EXPORT tavosdkTargets
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT runtime NAMELINK_COMPONENT development)
# Private to the library, which loads it on first use; programs do not link it.
install(TARGETS tavosdk_extras LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}/tavosdk COMPONENT runtime)
# Keeps the cleaner of /tmp away from the lock files.
install(FILES ${PROJECT_SOURCE_DIR}/cmake/tavosdk-tmpfiles.conf
    DESTINATION lib/tmpfiles.d RENAME tavosdk.conf COMPONENT runtime)

install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/
    DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} COMPONENT development FILES_MATCHING PATTERN "*.h")
set(package_folder ${CMAKE_INSTALL_LIBDIR}/cmake/tavosdk)
install(EXPORT tavosdkTargets NAMESPACE tavosdk:: DESTINATION ${package_folder} COMPONENT development)
configure_package_config_file(${PROJECT_SOURCE_DIR}/cmake/tavosdkConfig.cmake.in
    ${PROJECT_BINARY_DIR}/tavosdkConfig.cmake
    INSTALL_DESTINATION ${package_folder}
    NO_SET_AND_CHECK_MACRO)
write_basic_package_version_file(${PROJECT_BINARY_DIR}/tavosdkConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/tavosdkConfig.cmake ${PROJECT_BINARY_DIR}/tavosdkConfigVersion.cmake
    DESTINATION ${package_folder} COMPONENT development)

# The file finds the prefix from its own place, so an installation may be moved.
set(TAVO_PC_FOLDER ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
cmake_path(RELATIVE_PATH CMAKE_INSTALL_PREFIX BASE_DIRECTORY ${CMAKE_INSTALL_PREFIX}/${TAVO_PC_FOLDER}
    OUTPUT_VARIABLE TAVO_PC_PREFIX)
configure_file(${PROJECT_SOURCE_DIR}/cmake/tavosdk.pc.in ${PROJECT_BINARY_DIR}/tavosdk.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/tavosdk.pc DESTINATION ${TAVO_PC_FOLDER} COMPONENT development)

set(pages ${PROJECT_SOURCE_DIR}/docs/man)
install(FILES ${pages}/findhostd.8 ${pages}/tavo-sfdisk.8 DESTINATION ${CMAKE_INSTALL_MANDIR}/man8 COMPONENT appliance)
install(FILES ${pages}/tavoinfo.conf.5 DESTINATION ${CMAKE_INSTALL_MANDIR}/man5 COMPONENT tavoctl)
