pells_add_test(color_test SOURCES color_test.cpp)
