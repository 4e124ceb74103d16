pells_add_test(asset_test
    SOURCES zlib_wrapper_test.cpp pell_archive_test.cpp
            asset_manager_test.cpp aliases_test.cpp
    LIBRARIES Boost::filesystem)
