pells_sources(asset
    HEADERS
    SOURCES)
