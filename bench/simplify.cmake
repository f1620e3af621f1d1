zt_bench(bench_simplify LIBS zone)
