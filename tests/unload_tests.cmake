# Loading and unloading concern the shared library only. The host links neither the library nor the
# support code that uses it.
if(BUILD_SHARED_LIBS)
    foreach(plugin IN ITEMS unload_plugin_a unload_plugin_b)
        add_library(${plugin} MODULE unload/plugin.cpp)
        target_include_directories(${plugin} PRIVATE ${CMAKE_CURRENT_SOURCE_DIR})
        target_link_libraries(${plugin} PRIVATE pells::plugin)
        pells_set_up(${plugin})
    endforeach()
    add_executable(unload_test unload/unload_test.cpp)
    target_include_directories(unload_test PRIVATE ${CMAKE_CURRENT_SOURCE_DIR})
    target_compile_definitions(unload_test PRIVATE
        PLUGIN_A="$<TARGET_FILE:unload_plugin_a>" PLUGIN_B="$<TARGET_FILE:unload_plugin_b>")
    target_link_libraries(unload_test PRIVATE GTest::gtest_main ${CMAKE_DL_LIBS})
    add_dependencies(unload_test unload_plugin_a unload_plugin_b)
    pells_set_up(unload_test)
    # A log that is alive when the library goes is left to the process, so there is nothing to learn
    # from the leak check here.
    gtest_discover_tests(unload_test NO_PRETTY_VALUES
        PROPERTIES TIMEOUT 120 ENVIRONMENT "ASAN_OPTIONS=detect_leaks=0")
endif()
