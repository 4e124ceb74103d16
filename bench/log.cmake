pells_add_bench(bench_log SOURCES log.cpp MODULES spdlog)
