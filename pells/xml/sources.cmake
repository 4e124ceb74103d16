pells_sources(xml
    HEADERS tokenizer.h
    SOURCES char_class.h plain_token.cpp plain_token.h scan.h stream_window.cpp stream_window.h tokenizer.cpp)
