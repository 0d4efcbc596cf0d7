#include "bench/wbmp_bench.h"

#include <benchmark/benchmark.h>

#include <cstring>
#include <string>
#include <vector>

#include "PelmHost.h"
#include "bench/output.h"

namespace bench {
namespace {

constexpr int32_t width = 4000;
constexpr int32_t height = 3000;

constexpr Format formats[] = {rgba, rgb, rgb565};

// A page: white with dithered patches, and runs of black.
const std::vector<uint8_t> &page() {
    static std::vector<uint8_t> file;
    if (!file.empty()) return file;
    file = {0, 0, 0x80 | width >> 7, width & 0x7F, 0x80 | height >> 7, height & 0x7F};
    uint32_t noise = 1;
    for (int32_t i = 0; i < width / 8 * height; ++i) {
        noise = noise * 1664525 + 1013904223;
        const int32_t patch = i / 23 % 4;
        file.push_back(patch == 0 ? static_cast<uint8_t>(noise >> 24) : patch == 1 ? uint8_t{0} : uint8_t{0xFF});
    }
    return file;
}

void decode(benchmark::State &state, Format format, Box box) {
    std::vector<uint8_t> file = page();
    std::vector<uint8_t> &output = output_for(format, box);
    for (auto _ : state) {
        InputSource source{};
        PelmHost_OpenMemory(&source, PELM_SOURCE_MEMORY, file.data(), static_cast<int32_t>(file.size()));
        ImageDecodeInfo info{};
        info.input = &source;
        info.outputFormat = format.code;
        if (ZOTARPELMI_DecodeWBMP(&info, output.data(), box.width, box.height) != PELM_RESULT_DONE)
            state.SkipWithError("decode failed");
        PelmHost_Close(&source);
        benchmark::ClobberMemory();
    }
}

void copy(benchmark::State &state, Format format, Box box) {
    std::vector<uint8_t> &output = output_for(format, box);
    const std::vector<uint8_t> pixels(output.size(), 1);
    for (auto _ : state) {
        std::memcpy(output.data(), pixels.data(), output.size());
        benchmark::ClobberMemory();
    }
}

template <class... Arguments>
void add(const std::string &name, Arguments... arguments) {
    benchmark::RegisterBenchmark(name.c_str(), arguments...)->Unit(benchmark::kMillisecond);
}

} // namespace

void add_wbmp_benchmarks() {
    for (const Format &format : formats) {
        const std::string work = std::string("wbmp/12MP/") + format.name;
        add(work + "/pelm", decode, format, Box{width, height});
        add(work + "/memcpy", copy, format, Box{width, height});
    }
    add("wbmp/to 320x240/rgb565/pelm", decode, formats[2], Box{320, 240});
    add("wbmp/to 3200x2400/rgba/pelm", decode, formats[0], Box{3200, 2400});
    add("wbmp/to 3200x2400/rgba/memcpy", copy, formats[0], Box{3200, 2400});
}

} // namespace bench
