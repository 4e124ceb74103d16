pells_add_bench(bench_images SOURCES images.cpp MODULES SDL2_image stb LIBRARIES freeimage)
