pells_sources(serial
    HEADERS
    SOURCES)
