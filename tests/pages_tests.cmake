# The samples of the pages in docs/.
include(${PROJECT_SOURCE_DIR}/docs/samples.cmake)
set(samples ${CMAKE_CURRENT_BINARY_DIR}/samples)
foreach(page IN ITEMS assets core editing logging xml)
    pells_extract_samples(${page} cpp ${samples})
endforeach()
foreach(page IN ITEMS editing images xml)
    pells_extract_samples(${page} xml ${samples})
endforeach()

pells_add_test(pages_test SOURCES pages_test.cpp)
target_include_directories(pages_test PRIVATE ${CMAKE_CURRENT_BINARY_DIR})
target_compile_definitions(pages_test PRIVATE PELLS_SAMPLES="${samples}")
