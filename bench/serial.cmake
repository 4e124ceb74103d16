find_package(Boost REQUIRED COMPONENTS serialization)

pells_add_bench(bench_serial
    SOURCES serial.cpp serial/tables.cpp serial/pells.cpp serial/cereal.cpp serial/boost.cpp
            serial/pugixml.cpp ${PROJECT_SOURCE_DIR}/tests/support/allocations.cpp
    MODULES pugixml
    LIBRARIES Boost::serialization)
target_include_directories(bench_serial PRIVATE ${PROJECT_SOURCE_DIR}/tests)
