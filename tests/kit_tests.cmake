pells_add_test(kit_test SOURCES kit_test.cpp LIBRARIES pells::kit)
