pells_sources(log
    HEADERS log.h stream_buffers.h stream_buffers.inl
    SOURCES log.cpp stream_buffers.cpp detail/log_file.cpp detail/number_format.cpp)
