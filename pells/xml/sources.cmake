pells_sources(xml
    HEADERS tokenizer.h
    SOURCES char_class.h stream_window.cpp stream_window.h tokenizer.cpp)
