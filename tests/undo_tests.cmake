pells_add_test(undo_test SOURCES undo_test.cpp)
pells_add_test(material_test SOURCES material_test.cpp)
