pells_add_test(tag_test SOURCES tag_test.cpp)
pells_add_test(serial_test SOURCES serial_test.cpp support/everything.cpp)
pells_add_test(pooled_test SOURCES pooled_test.cpp)
