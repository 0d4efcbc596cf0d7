// pelm-bench: all benchmarks in one process; Google Benchmark's options apply.
#include <benchmark/benchmark.h>

#include "bench/bmp_bench.h"
#include "bench/gif_bench.h"
#include "bench/png_bench.h"
#include "bench/png_rows_bench.h"
#include "bench/ratio_reporter.h"
#include "bench/wbmp_bench.h"

int main(int count, char **arguments) {
    bench::add_png_row_benchmarks();
    bench::add_png_benchmarks();
    bench::add_gif_benchmarks();
    bench::add_bmp_benchmarks();
    bench::add_wbmp_benchmarks();
    benchmark::Initialize(&count, arguments);
    if (benchmark::ReportUnrecognizedArguments(count, arguments)) return 1;
    bench::RatioReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    return reporter.has_failures() ? 1 : 0;
}
