pells_sources(asset
    HEADERS asset_manager.h pell_archive.h stream_container.h zlib_wrapper.h
    SOURCES aliases.cpp archive_file.cpp asset_manager.cpp known_archive.cpp pell_archive.cpp pell_directory.cpp regular_file.cpp
            stream_container.cpp zlib_wrapper.cpp)
