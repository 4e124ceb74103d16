pells_sources(material
    HEADERS color.h
    SOURCES color.cpp)
