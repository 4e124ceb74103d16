pells_sources(timing HEADERS performance.h timer.h timestamp.h SOURCES
                  performance.cpp timer.cpp timestamp.cpp)
