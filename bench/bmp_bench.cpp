#include "bench/bmp_bench.h"

#include <benchmark/benchmark.h>

#include <cstring>
#include <string>

#include "PelmHost.h"
#include "bench/bmp_pictures.h"
#include "bench/output.h"
#include "bench/stb_peer.h"

namespace bench {
namespace {

constexpr int32_t width = 4000;
constexpr int32_t height = 3000;

// Each file is made when its first benchmark runs, and kept.
const std::vector<uint8_t> &file_of_depth(int32_t bits_per_pixel) {
    static std::vector<uint8_t> files[33];
    std::vector<uint8_t> &file = files[bits_per_pixel];
    if (file.empty()) file = photo_bmp(width, height, bits_per_pixel);
    return file;
}

void decode(benchmark::State &state, int32_t bits_per_pixel, Format format, Box box, uint32_t flags) {
    std::vector<uint8_t> file = file_of_depth(bits_per_pixel);
    std::vector<uint8_t> &output = output_for(format, box);
    for (auto _ : state) {
        InputSource source{};
        PelmHost_OpenMemory(&source, PELM_SOURCE_MEMORY, file.data(), static_cast<int32_t>(file.size()));
        ImageDecodeInfo info{};
        info.input = &source;
        info.outputFormat = format.code;
        info.flags = flags;
        if (ZOTARPELMI_DecodeBMP(&info, output.data(), box.width, box.height) != PELM_RESULT_DONE)
            state.SkipWithError("decode failed");
        PelmHost_Close(&source);
        benchmark::ClobberMemory();
    }
}

void copy(benchmark::State &state, Format format) {
    std::vector<uint8_t> &output = output_for(format, {width, height});
    const std::vector<uint8_t> pixels(output.size(), 1);
    for (auto _ : state) {
        std::memcpy(output.data(), pixels.data(), output.size());
        benchmark::ClobberMemory();
    }
}

void decode_with_stb(benchmark::State &state, int32_t bits_per_pixel) {
    const std::vector<uint8_t> &file = file_of_depth(bits_per_pixel);
    for (auto _ : state)
        if (!stb_decode_rgba(file)) state.SkipWithError("decode failed");
}

template <class... Arguments>
void add(const std::string &name, Arguments... arguments) {
    benchmark::RegisterBenchmark(name.c_str(), arguments...)->Unit(benchmark::kMillisecond);
}

void add_depth(int32_t bits_per_pixel) {
    const std::string depth = "bmp" + std::to_string(bits_per_pixel);
    for (const Format &format : {rgba, rgb565}) {
        const std::string work = depth + "/12MP/" + format.name;
        add(work + "/pelm", decode, bits_per_pixel, format, Box{width, height}, PELM_PLACE_FIT);
        add(work + "/memcpy", copy, format);
        // stb_image has no 16-bit output: its RGBA time stands for both.
        add(work + "/stb", decode_with_stb, bits_per_pixel);
    }
    add(depth + "/to 320x240/rgb565/pelm", decode, bits_per_pixel, rgb565, Box{320, 240}, PELM_PLACE_FIT);
    add(depth + "/to 320x240/rgb565/stb whole", decode_with_stb, bits_per_pixel);
    add(depth + "/turned by 90/rgba/pelm", decode, bits_per_pixel, rgba, Box{height, width}, PELM_ROTATE_90);
}

} // namespace

void add_bmp_benchmarks() {
    for (const int32_t bits_per_pixel : {1, 4, 8, 16, 24, 32})
        add_depth(bits_per_pixel);
}

} // namespace bench
