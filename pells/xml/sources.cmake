pells_sources(xml
    HEADERS attr_map.h tag.h tokenizer.h
    SOURCES attr_map.cpp tag.cpp tokenizer.cpp detail/stream_window.cpp)
