pells_add_bench(bench_growth
    SOURCES growth.cpp ${PROJECT_SOURCE_DIR}/tests/support/everything.cpp
    LIBRARIES Boost::filesystem ZLIB::ZLIB)
target_include_directories(bench_growth PRIVATE ${PROJECT_SOURCE_DIR}/tests)
