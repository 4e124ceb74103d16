pells_sources(platform
    HEADERS counter.h debugger.h
    SOURCES counter.cpp debugger.cpp detail/regular_file.cpp)
