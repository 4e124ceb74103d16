pells_sources(material
    HEADERS color.h material.h
    SOURCES color.cpp material.cpp)
