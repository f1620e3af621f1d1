zt_bench(bench_offset LIBS zone voronoi NEEDS CLIPPER)
