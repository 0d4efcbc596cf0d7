// pelm-bench: all benchmarks in one process; Google Benchmark's options apply.
#include <benchmark/benchmark.h>

#include "bench/bmp_bench.h"
#include "bench/gif_bench.h"
#include "bench/png_bench.h"
#include "bench/png_rows_bench.h"
#include "bench/reduced_bench.h"
#include "bench/reporter.h"
#include "bench/stream_bench.h"
#include "bench/wbmp_bench.h"

int main(int count, char **arguments) {
    bench::add_png_row_benchmarks();
    bench::add_png_benchmarks();
    bench::add_gif_benchmarks();
    bench::add_bmp_benchmarks();
    bench::add_wbmp_benchmarks();
    bench::add_reduced_benchmarks();
    bench::add_stream_benchmarks();
    benchmark::Initialize(&count, arguments);
    if (benchmark::ReportUnrecognizedArguments(count, arguments)) return 1;
    bench::Reporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    bench::print_ratio_table(reporter.best());
    return reporter.has_failures() ? 1 : 0;
}
