find_package(EXPAT REQUIRED)

pells_add_bench(bench_xml
    SOURCES xml.cpp xml/documents.cpp xml/peers.cpp
            ${PROJECT_SOURCE_DIR}/tests/support/allocations.cpp
            ${PROJECT_SOURCE_DIR}/tests/support/reference_tokenizer.cpp
    MODULES pugixml tinyxml2
    LIBRARIES EXPAT::EXPAT pells_archive_writer Boost::headers)
target_include_directories(bench_xml PRIVATE ${PROJECT_SOURCE_DIR}/tests)
