# What a client gets: headers, library, zeltConfig.cmake and zelt.pc. Hosts install themselves.

include(CMakePackageConfigHelpers)

install(TARGETS zelt EXPORT zeltTargets
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT library NAMELINK_COMPONENT development)
install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/zelt DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} COMPONENT development
    FILES_MATCHING PATTERN "*.h")

set(package_folder ${CMAKE_INSTALL_LIBDIR}/cmake/zelt)
install(EXPORT zeltTargets NAMESPACE zelt:: DESTINATION ${package_folder} COMPONENT development)
configure_package_config_file(${PROJECT_SOURCE_DIR}/cmake/zeltConfig.cmake.in ${PROJECT_BINARY_DIR}/zeltConfig.cmake
    INSTALL_DESTINATION ${package_folder})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/zeltConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/zeltConfig.cmake ${PROJECT_BINARY_DIR}/zeltConfigVersion.cmake
    DESTINATION ${package_folder} COMPONENT development)

# pkg-config finds its prefix from the place of the file, so that an installed tree can be moved.
file(RELATIVE_PATH zelt_pc_prefix /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
string(REGEX REPLACE "/$" "" zelt_pc_prefix "${zelt_pc_prefix}")
configure_file(${PROJECT_SOURCE_DIR}/cmake/zelt.pc.in ${PROJECT_BINARY_DIR}/zelt.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/zelt.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)
