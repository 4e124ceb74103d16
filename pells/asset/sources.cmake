pells_sources(asset
    HEADERS asset_manager.h pell_archive.h stream_container.h zlib_wrapper.h
    SOURCES asset_manager.cpp pell_archive.cpp stream_container.cpp zlib_wrapper.cpp
            detail/alias_tree.cpp detail/archive_file.cpp detail/asset_index.cpp
            detail/asset_listing.cpp detail/asset_path.cpp detail/folder_walk.cpp
            detail/known_archive.cpp detail/pell_directory.cpp detail/regular_file.cpp)
