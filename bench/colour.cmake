pells_add_bench(bench_colour SOURCES colour.cpp MODULES Qt5Gui)
target_compile_options(bench_colour PRIVATE -fPIC)  # as Qt's own objects are compiled
