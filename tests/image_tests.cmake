pells_add_test(image_base_test SOURCES image_base_test.cpp)
pells_add_test(tga_test SOURCES tga_test.cpp)
pells_add_test(image_loaders_test SOURCES image_loaders_test.cpp LIBRARIES ZLIB::ZLIB)
