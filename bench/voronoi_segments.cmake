zt_bench(bench_voronoi_segments LIBS voronoi NEEDS BOOST)
