if(NOT PELLS_BUILD_TOOLS)
    return()
endif()

pells_add_test(archive_writer_test SOURCES archive_writer_test.cpp LIBRARIES pells_archive_writer)

# Tests that run the tool.
function(pells_add_tool_test name)
    pells_add_test(${name} ${ARGN})
    find_package(PNG REQUIRED)
    target_link_libraries(${name} PRIVATE PNG::PNG Boost::filesystem)
    target_compile_definitions(${name} PRIVATE
        PELLS_TOOL="$<TARGET_FILE:pells_tool>" PELLS_SAMPLES="${PROJECT_SOURCE_DIR}/samples"
        PELLS_SUPPRESSIONS="${CMAKE_CURRENT_SOURCE_DIR}/support/leaks_of_others.supp")
    add_dependencies(${name} pells_tool)
endfunction()

pells_add_tool_test(tool_test SOURCES tool_test.cpp LIBRARIES ZLIB::ZLIB)
pells_add_tool_test(swatch_test
    SOURCES swatch_test.cpp ../tools/sphere.cpp ../tools/thumbnail.cpp
    LIBRARIES pells_archive_writer)
