pells_add_bench(bench_timing SOURCES timing.cpp)
