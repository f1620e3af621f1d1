zt_bench(bench_boolean LIBS regions NEEDS CLIPPER)
