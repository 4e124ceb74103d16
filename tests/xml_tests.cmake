pells_add_test(tokenizer_test SOURCES tokenizer_test.cpp)
