find_package(Boost REQUIRED COMPONENTS serialization)

pells_add_bench(bench_serial
    SOURCES serial.cpp serial/tables.cpp serial/pells.cpp serial/cereal.cpp serial/boost.cpp
            serial/pugixml.cpp support/allocations.cpp
    MODULES pugixml
    LIBRARIES Boost::serialization)
