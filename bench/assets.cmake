# minizip as a bare library, as for bench_archives.
pells_add_bench(bench_assets
    SOURCES assets.cpp archive_files.cpp archive_sources.cpp
    MODULES libzip physfs
    LIBRARIES minizip Boost::filesystem)
