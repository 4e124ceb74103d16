pells_add_test(tokenizer_test SOURCES tokenizer_test.cpp)
pells_add_test(tokenizer_reference_test
               SOURCES tokenizer_reference_test.cpp support/reference_tokenizer.cpp
               LIBRARIES Boost::headers)
