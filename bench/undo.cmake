pells_add_bench(bench_undo SOURCES undo.cpp MODULES Qt5Widgets)
target_compile_options(bench_undo PRIVATE -fPIC)  # as Qt's own objects are compiled
