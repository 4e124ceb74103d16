pells_sources(material
    HEADERS
    SOURCES)
