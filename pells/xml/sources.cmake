pells_sources(xml
    HEADERS attr_map.h tag.h tokenizer.h
    SOURCES attr_map.cpp char_class.h plain_token.h scan.h stream_window.cpp
            stream_window.h tag.cpp tokenizer.cpp)
