pells_sources(xml
    HEADERS
    SOURCES)
