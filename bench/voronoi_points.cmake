zt_bench(bench_voronoi_points LIBS voronoi NEEDS BOOST)
