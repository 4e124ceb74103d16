pells_sources(image
    HEADERS image_base.h image_loaders.h
    SOURCES channel_order.cpp image_base.cpp tga_reader.cpp)
