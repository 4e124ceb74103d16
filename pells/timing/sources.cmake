pells_sources(timing
    HEADERS performance.h
    SOURCES performance.cpp)
