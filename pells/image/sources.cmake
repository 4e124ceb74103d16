pells_sources(image
    HEADERS
    SOURCES)
