#include "bench/png_bench.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <memory>
#include <string>

#include "PelmHost.h"
#include "bench/png_peers.h"
#include "bench/png_pictures.h"
#include "bench/stb_peer.h"
#include "bench/work.h"

namespace bench {
namespace {

namespace fs = std::filesystem;

uint32_t word_at(const Bytes &file, size_t at) {
    return uint32_t{file[at]} << 24 | uint32_t{file[at + 1]} << 16 | uint32_t{file[at + 2]} << 8 | file[at + 3];
}

uint32_t width_of(const Bytes &png) {
    return word_at(png, 16);
}

uint32_t height_of(const Bytes &png) {
    return word_at(png, 20);
}

Bytes &output_for(const Bytes &png) {
    static Bytes output;
    output.resize(std::max(output.size(), size_t{width_of(png)} * height_of(png) * 4));
    return output;
}

// The decoder joins image data in the file's memory: every decode gets a fresh copy, as a host would make it.
bool decode_with_pelm(const Bytes &png, Target target, uint8_t *output) {
    static Bytes copy;
    copy.assign(png.begin(), png.end());
    InputSource source{};
    if (PelmHost_OpenMemory(&source, PELM_SOURCE_MEMORY, copy.data(), static_cast<int32_t>(copy.size())) != 0)
        return false;
    ImageDecodeInfo info{};
    info.input = &source;
    info.outputFormat = target == Target::rgba ? PELM_FORMAT_RGBA8888 : PELM_FORMAT_RGB565;
    const int32_t result =
        ZOTARPELMI_DecodePNG(&info, output, static_cast<int32_t>(width_of(png)), static_cast<int32_t>(height_of(png)));
    PelmHost_Close(&source);
    return result == PELM_RESULT_DONE;
}

// stb_image has no 16-bit output: its RGBA time stands for both.
bool decode_with_stb(const Bytes &png, Target, uint8_t *) {
    return stb_decode_rgba(png);
}

using Decode = bool (*)(const Bytes &png, Target target, uint8_t *output);

// Narrow grey is widened differently on purpose.
bool has_same_colours_elsewhere(const Bytes &png) {
    const uint8_t depth = png[24];
    return depth != 2 && depth != 4;
}

bool equals_libpng(const Bytes &png) {
    if (!has_same_colours_elsewhere(png)) return true;
    const size_t size = size_t{width_of(png)} * height_of(png) * 4;
    Bytes expected(size, 1), got(size, 2);
    return libpng_decode(png, Target::rgba, expected.data()) && decode_with_pelm(png, Target::rgba, got.data()) &&
           expected == got;
}

void run(benchmark::State &state, const std::shared_ptr<Work> &work, Decode decode, Target target) {
    const std::vector<Bytes> &files = work->files();
    if (files.empty()) state.SkipWithError("there is nothing to decode");
    const bool is_own = decode == decode_with_pelm && target == Target::rgba;
    if (is_own && !std::all_of(files.begin(), files.end(), equals_libpng)) state.SkipWithError("the picture is wrong");
    double pixels = 0;
    for (const Bytes &png : files)
        pixels += static_cast<double>(width_of(png)) * height_of(png);
    for (auto _ : state) {
        for (const Bytes &png : files)
            if (!decode(png, target, output_for(png).data())) state.SkipWithError("decode failed");
        benchmark::ClobberMemory();
    }
    state.counters["MP/s"] = benchmark::Counter(pixels / 1e6, benchmark::Counter::kIsIterationInvariantRate);
}

void add(const std::string &name, const std::shared_ptr<Work> &work) {
    static constexpr struct {
        const char *name;
        Decode decode;
    } decoders[] = {
        {"pelm", decode_with_pelm}, {"libpng", libpng_decode}, {"libspng", spng_decode}, {"stb", decode_with_stb}};
    for (const Target target : {Target::rgba, Target::rgb565}) {
        const std::string prefix = "png/" + name + (target == Target::rgba ? "/rgba/" : "/rgb565/");
        for (const auto &[who, decode] : decoders)
            benchmark::RegisterBenchmark((prefix + who).c_str(), run, work, decode, target)
                ->Unit(benchmark::kMillisecond);
    }
}

void add_picture(const std::string &name, Motif motif, Stored stored, uint32_t width, uint32_t height) {
    add(name, std::make_shared<Work>([=]() -> std::vector<Bytes> {
            Bytes png = png_picture(motif, stored, width, height);
            if (png.empty()) return {};
            return {std::move(png)};
        }));
}

bool is_interlaced(const Bytes &png) {
    constexpr size_t interlace_at = 28;
    return png.size() <= interlace_at || png[interlace_at] != 0;
}

void add_photos() {
    for (const fs::path &path : files_with_suffix(image_folder(), ".png")) {
        const Bytes png = read_file(path);
        if (is_interlaced(png)) continue;
        add(path.stem().string(), std::make_shared<Work>([=] { return std::vector<Bytes>{png}; }));
    }
}

// All the small pictures in one iteration: what counts is how a decode begins and ends. Names with an x are broken
// files.
void add_icons() {
    std::vector<Bytes> icons;
    for (const fs::path &path : files_with_suffix(image_folder() / "pngsuite", ".png")) {
        Bytes png = read_file(path);
        const bool is_icon = path.filename().string()[0] != 'x' && !is_interlaced(png) && width_of(png) <= 64;
        if (is_icon) icons.push_back(std::move(png));
    }
    if (icons.empty()) return;
    add(std::to_string(icons.size()) + " icons", std::make_shared<Work>([=] { return icons; }));
}

} // namespace

void add_png_benchmarks() {
    add_picture("photo RGB 8MP", Motif::photo, Stored::rgb, 3264, 2448);
    add_picture("photo RGBA 4MP", Motif::photo, Stored::rgba, 2304, 1728);
    add_picture("photo grey 4MP", Motif::photo, Stored::grey, 2304, 1728);
    add_picture("photo RGB16 4MP", Motif::photo, Stored::rgb16, 2304, 1728);
    add_picture("screenshot RGB 8MP", Motif::screenshot, Stored::rgb, 3840, 2160);
    add_picture("screenshot palette 4MP", Motif::screenshot, Stored::palette, 2560, 1600);
    add_picture("illustration RGBA 6MP", Motif::illustration, Stored::rgba, 2800, 2100);
    add_picture("illustration palette 4MP", Motif::illustration, Stored::palette, 2304, 1728);
    add_picture("text grey 4MP", Motif::text, Stored::grey, 1700, 2400);
    add_picture("text grey1 8MP", Motif::text, Stored::grey1, 2400, 3400);
    add_photos();
    add_icons();
}

} // namespace bench
