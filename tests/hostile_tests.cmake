# Each replaces operator new.
pells_add_test(allocation_failure_test
    SOURCES allocation_failure_test.cpp support/allocations.cpp support/everything.cpp
    LIBRARIES Boost::filesystem)
pells_add_test(proportion_test
    SOURCES proportion_test.cpp support/allocations.cpp support/everything.cpp)
pells_add_test(world_faults_test SOURCES world_faults_test.cpp LIBRARIES Boost::filesystem)
pells_add_test(damaged_document_test SOURCES damaged_document_test.cpp support/everything.cpp)
