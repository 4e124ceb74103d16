# Installs the libraries with what find_package(pells) and pkg-config need to find them.
include(CMakePackageConfigHelpers)

install(TARGETS pells pells_kit EXPORT pellsTargets FILE_SET HEADERS)

set(package_directory ${CMAKE_INSTALL_LIBDIR}/cmake/pells)
install(EXPORT pellsTargets NAMESPACE pells:: DESTINATION ${package_directory})
configure_package_config_file(cmake/pellsConfig.cmake.in ${PROJECT_BINARY_DIR}/pellsConfig.cmake
    INSTALL_DESTINATION ${package_directory})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/pellsConfigVersion.cmake
    COMPATIBILITY SameMinorVersion)
install(FILES ${PROJECT_BINARY_DIR}/pellsConfig.cmake ${PROJECT_BINARY_DIR}/pellsConfigVersion.cmake
    DESTINATION ${package_directory})

set(PC_CFLAGS "")
set(PC_LIBS_PRIVATE "-lboost_filesystem")
if(BUILD_SHARED_LIBS)
    set(PC_LIBS "-lpells")
    set(PC_KIT_LIBS "")
else()
    string(APPEND PC_CFLAGS "-DPELLS_STATIC")
    set(PC_LIBS "-lpells -lboost_filesystem")
    set(PC_KIT_LIBS "-lboost_filesystem")
endif()
# Relative to the file's own folder, so that an installed tree can be moved.
file(RELATIVE_PATH PC_PREFIX ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
configure_file(cmake/pells.pc.in ${PROJECT_BINARY_DIR}/pells.pc @ONLY)
configure_file(cmake/pells-kit.pc.in ${PROJECT_BINARY_DIR}/pells-kit.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/pells.pc ${PROJECT_BINARY_DIR}/pells-kit.pc
    DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
