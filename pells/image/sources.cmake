pells_sources(image
    HEADERS image_base.h image_fallback_manager.h image_loaders.h
    SOURCES image_base.cpp image_fallback_manager.cpp image_loaders.cpp packed_pixels.cpp
            tga_reader.cpp detail/channel_order.cpp)
