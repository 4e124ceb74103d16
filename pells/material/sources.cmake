pells_sources(material
    HEADERS color.h material.h
    SOURCES color.cpp color_handler.cpp material.cpp)
