pells_sources(log
    HEADERS log.h stream_buffers.h stream_buffers.inl
    SOURCES log.cpp log_file.cpp number_format.cpp stream_buffers.cpp)
