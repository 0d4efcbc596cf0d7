#include "bench/png_rows_bench.h"

#include <benchmark/benchmark.h>

#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include "png/crc32.h"
#include "png/unfilter.h"
#include "png/unfilter_two_rows.h"

namespace bench {
namespace {

constexpr uint32_t pixels = 4000; // two rows of them lie in the first-level cache

std::vector<uint8_t> noise(size_t size, uint32_t seed) {
    std::minstd_rand random(seed);
    std::vector<uint8_t> bytes(size);
    for (uint8_t &byte : bytes)
        byte = static_cast<uint8_t>(random() >> 16);
    return bytes;
}

void count_pixels(benchmark::State &state, uint32_t count) {
    state.counters["ns/pixel"] =
        benchmark::Counter(count / 1e9, benchmark::Counter::kIsIterationInvariantRate | benchmark::Counter::kInvert);
}

// In place: what one iteration leaves is what the next one begins with.
void undo(benchmark::State &state, uint8_t filter, std::vector<uint8_t> row, const std::vector<uint8_t> &above,
          uint8_t unit) {
    row[0] = filter;
    PngDecodeState decode{};
    decode.bytesPerPixel = unit;
    for (auto _ : state) {
        __PELMI_PngReadFilterRow(&decode, row.data() + 1, above.data(), pixels * unit);
        benchmark::ClobberMemory();
    }
    count_pixels(state, pixels);
}

void undo_filter(benchmark::State &state, uint8_t filter, uint8_t unit) {
    undo(state, filter, noise(size_t{pixels} * unit + 1, 1), noise(size_t{pixels} * unit, 2), unit);
}

// All of it one colour.
void undo_paeth_of_flat_row(benchmark::State &state, uint8_t unit) {
    undo(state, 4, std::vector<uint8_t>(size_t{pixels} * unit + 1), std::vector<uint8_t>(size_t{pixels} * unit), unit);
}

void undo_two_filters(benchmark::State &state, uint8_t first_filter, uint8_t second_filter, uint8_t unit) {
    std::vector<uint8_t> first = noise(size_t{pixels} * unit, 1), second = noise(size_t{pixels} * unit, 2);
    const std::vector<uint8_t> above = noise(size_t{pixels} * unit, 3);
    const pelm::TwoRows rows = {.first = first.data(),
                                .second = second.data(),
                                .above = above.data(),
                                .length = pixels * unit,
                                .distance = unit,
                                .first_filter = first_filter,
                                .second_filter = second_filter};
    for (auto _ : state) {
        pelm::unfilter_two_rows(rows);
        benchmark::ClobberMemory();
    }
    count_pixels(state, 2 * pixels);
}

void checksum(benchmark::State &state, uint32_t length) {
    const std::vector<uint8_t> bytes = noise(length, 3);
    uint32_t crc = pelm::crc32_start;
    for (auto _ : state)
        benchmark::DoNotOptimize(crc = pelm::crc32_go_on(crc, bytes.data(), bytes.size()));
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * length);
}

} // namespace

void add_png_row_benchmarks() {
    static constexpr const char *names[] = {"none", "sub", "up", "average", "paeth"};
    for (uint8_t filter = 1; filter <= 4; ++filter)
        for (const int unit : {1, 2, 3, 4, 6, 8}) {
            const std::string name = std::string("unfilter/") + names[filter] + "/" + std::to_string(unit);
            benchmark::RegisterBenchmark(name.c_str(), undo_filter, filter, static_cast<uint8_t>(unit));
        }
    for (const int unit : {1, 2, 3, 4, 6, 8}) {
        const std::string name = "unfilter/paeth of a flat row/" + std::to_string(unit);
        benchmark::RegisterBenchmark(name.c_str(), undo_paeth_of_flat_row, static_cast<uint8_t>(unit));
    }
    for (uint8_t first = 3; first <= 4; ++first)
        for (uint8_t second = 3; second <= 4; ++second)
            for (const int unit : {3, 4, 6, 8}) {
                const std::string filters = std::string(names[first]) + "+" + names[second];
                const std::string name = "two rows/" + filters + "/" + std::to_string(unit);
                benchmark::RegisterBenchmark(name.c_str(), undo_two_filters, first, second, static_cast<uint8_t>(unit));
            }
    for (const uint32_t length : {17u, 64u, 1000u, 8192u, 65536u})
        benchmark::RegisterBenchmark(("crc32/" + std::to_string(length)).c_str(), checksum, length);
}

} // namespace bench
