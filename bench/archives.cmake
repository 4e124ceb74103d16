# minizip as a bare library: the include folder of its module has a zip.h that hides libzip's.
pells_add_bench(bench_archives
    SOURCES archives.cpp archive_files.cpp archive_sources.cpp
    MODULES libzip physfs
    LIBRARIES minizip)
