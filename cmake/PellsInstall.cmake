# Installs the libraries with what find_package(pells) and pkg-config need to find them, and the
# documents. The components are Runtime, Development, Documentation and Tools.
include(CMakePackageConfigHelpers)

set(package_directory ${CMAKE_INSTALL_LIBDIR}/cmake/pells)
if(IS_ABSOLUTE ${package_directory})
    pells_set_plugin_specs(INSTALL_INTERFACE ${package_directory})
else()
    pells_set_plugin_specs(INSTALL_INTERFACE $<INSTALL_PREFIX>/${package_directory})
endif()

set(headers ${CMAKE_INSTALL_INCLUDEDIR})
if(IS_ABSOLUTE ${headers})
    # CMake 3.25 puts the prefix even before an absolute folder when it exports a file set.
    file(RELATIVE_PATH headers ${CMAKE_INSTALL_PREFIX} ${headers})
endif()
install(TARGETS pells pells_kit pells_plugin EXPORT pellsTargets
    RUNTIME COMPONENT Runtime
    LIBRARY COMPONENT Runtime NAMELINK_COMPONENT Development
    ARCHIVE COMPONENT Development
    # CMake before 3.23 finds the headers by this; it knows no file sets.
    INCLUDES DESTINATION ${headers}
    FILE_SET HEADERS DESTINATION ${headers} COMPONENT Development)

install(EXPORT pellsTargets NAMESPACE pells:: DESTINATION ${package_directory} COMPONENT Development)
configure_package_config_file(cmake/pellsConfig.cmake.in ${PROJECT_BINARY_DIR}/pellsConfig.cmake
    INSTALL_DESTINATION ${package_directory})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/pellsConfigVersion.cmake
    COMPATIBILITY SameMinorVersion)
install(FILES ${PROJECT_BINARY_DIR}/pellsConfig.cmake ${PROJECT_BINARY_DIR}/pellsConfigVersion.cmake
    cmake/plugin.specs
    DESTINATION ${package_directory} COMPONENT Development)

set(PC_CFLAGS "")
set(PC_LIBS_PRIVATE "-lboost_filesystem")
# The names have the postfix of the build type, if it has one.
set(PC_LIBS "-l$<TARGET_FILE_BASE_NAME:pells>")
set(PC_KIT_LIBS "-l$<TARGET_FILE_BASE_NAME:pells_kit>")
if(NOT BUILD_SHARED_LIBS)
    string(APPEND PC_CFLAGS "-DPELLS_STATIC")
    string(APPEND PC_LIBS " -lboost_filesystem")
    string(APPEND PC_KIT_LIBS " -lboost_filesystem")
endif()
foreach(folder IN ITEMS LIBDIR INCLUDEDIR)
    if(IS_ABSOLUTE ${CMAKE_INSTALL_${folder}})
        set(PC_${folder} ${CMAKE_INSTALL_${folder}})
    else()
        set(PC_${folder} "\${prefix}/${CMAKE_INSTALL_${folder}}")
    endif()
endforeach()
# Relative to the file's own folder, so that an installed tree can be moved. In /usr the path has to
# be plain, else pkg-config does not see that the compiler searches there anyway.
if(IS_ABSOLUTE ${CMAKE_INSTALL_LIBDIR})
    set(prefix_movable ${CMAKE_INSTALL_PREFIX})
    set(package_place ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
else()
    file(RELATIVE_PATH way_up ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
    string(REGEX REPLACE "/$" "" way_up ${way_up})
    set(prefix_movable "\${pcfiledir}/${way_up}")
    set(package_place "\${CMAKE_INSTALL_PREFIX}/${CMAKE_INSTALL_LIBDIR}/pkgconfig")
endif()
set(prefix_usr /usr)
set(generated ${PROJECT_BINARY_DIR}/pkgconfig)
foreach(kind IN ITEMS movable usr)
    set(PC_PREFIX ${prefix_${kind}})
    foreach(package IN ITEMS pells pells-kit)
        configure_file(cmake/${package}.pc.in ${generated}/${kind}/${package}.pc.in @ONLY)
        file(GENERATE OUTPUT ${generated}/${kind}/$<CONFIG>/${package}.pc
            INPUT ${generated}/${kind}/${package}.pc.in)
    endforeach()
endforeach()
# Chosen when the prefix is known for good, which `cmake --install --prefix` may change.
install(CODE "
    set(kind movable)
    if(CMAKE_INSTALL_PREFIX MATCHES \"^/usr/*$\")
        set(kind usr)
    endif()
    file(INSTALL \"${generated}/\${kind}/$<CONFIG>/pells.pc\" \"${generated}/\${kind}/$<CONFIG>/pells-kit.pc\"
         DESTINATION \"${package_place}\")"
    COMPONENT Development)

if(PROJECT_IS_TOP_LEVEL)
    set(documents ${CMAKE_INSTALL_DOCDIR})
else()
    set(documents ${CMAKE_INSTALL_DATAROOTDIR}/doc/pells)
endif()
install(FILES LICENSE README.md SECURITY.md DESTINATION ${documents} COMPONENT Documentation)
install(DIRECTORY docs examples DESTINATION ${documents} COMPONENT Documentation USE_SOURCE_PERMISSIONS)
