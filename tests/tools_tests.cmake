if(NOT PELLS_BUILD_TOOLS)
    return()
endif()

pells_add_test(archive_writer_test SOURCES archive_writer_test.cpp LIBRARIES pells_archive_writer)

pells_add_test(pack_test SOURCES pack_test.cpp LIBRARIES pells_archive_writer pells::kit Boost::filesystem)
target_compile_definitions(pack_test PRIVATE PELLS_TOOL="$<TARGET_FILE:pells_tool>")
add_dependencies(pack_test pells_tool)

pells_add_test(sphere_test SOURCES sphere_test.cpp ../tools/sphere.cpp ../tools/thumbnail.cpp)

# Runs the tool.
pells_add_test(tool_test SOURCES tool_test.cpp LIBRARIES ZLIB::ZLIB)
find_package(PNG REQUIRED)
target_link_libraries(tool_test PRIVATE PNG::PNG Boost::filesystem)
target_compile_definitions(tool_test PRIVATE
    PELLS_TOOL="$<TARGET_FILE:pells_tool>" PELLS_SAMPLES="${PROJECT_SOURCE_DIR}/samples"
    PELLS_SUPPRESSIONS="${CMAKE_CURRENT_SOURCE_DIR}/support/leaks_of_others.supp")
add_dependencies(tool_test pells_tool)
