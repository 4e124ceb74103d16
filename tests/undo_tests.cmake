pells_add_test(undo_test SOURCES undo_test.cpp)
