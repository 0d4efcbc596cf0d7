#include "bench/gif_bench.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <memory>
#include <string>

#include "PelmAnimation.h"
#include "PelmHost.h"
#include "bench/gif_pictures.h"
#include "bench/giflib_peer.h"
#include "bench/stb_peer.h"
#include "bench/work.h"

namespace bench {
namespace {

namespace fs = std::filesystem;

uint32_t word_at(const Bytes &file, size_t at) {
    return file[at] | uint32_t{file[at + 1]} << 8;
}

uint32_t width_of(const Bytes &gif) {
    return word_at(gif, 6);
}

uint32_t height_of(const Bytes &gif) {
    return word_at(gif, 8);
}

size_t pixels_of(const Bytes &gif) {
    return size_t{width_of(gif)} * height_of(gif);
}

Bytes &output_for(const Bytes &gif) {
    static Bytes output;
    output.resize(std::max(output.size(), 4 * pixels_of(gif)));
    return output;
}

InputSource source_of(const Bytes &gif) {
    InputSource source = {};
    source.kind = PELM_SOURCE_MEMORY;
    source.data = const_cast<uint8_t *>(gif.data());
    source.size = static_cast<int32_t>(gif.size());
    return source;
}

ImageDecodeInfo request_for(InputSource &source, Target target) {
    ImageDecodeInfo info = {};
    info.input = &source;
    info.outputFormat = target == Target::rgba ? PELM_FORMAT_RGBA8888 : PELM_FORMAT_RGB565;
    return info;
}

bool decode_with_pelm(const Bytes &gif, Target target, uint8_t *output) {
    InputSource source = source_of(gif);
    ImageDecodeInfo info = request_for(source, target);
    return ZOTARPELMI_DecodeGIF(&info, output, static_cast<int32_t>(width_of(gif)),
                                static_cast<int32_t>(height_of(gif))) == PELM_RESULT_DONE;
}

bool play_with_pelm(const Bytes &gif, Target target, uint8_t *output) {
    InputSource source = source_of(gif);
    ImageDecodeInfo info = request_for(source, target);
    int32_t result = PELM_RESULT_DONE;
    while (result == PELM_RESULT_DONE)
        result = ZOTARPELMI_DecodeAGIF(&info, output, static_cast<int32_t>(width_of(gif)),
                                       static_cast<int32_t>(height_of(gif)));
    PelmAnimation_Restart(&info, ZOTARPELMI_AborAGIF);
    return result == PELM_RESULT_LAST_FRAME;
}

// stb_image has no 16-bit output: its RGBA time stands for both.
bool decode_with_stb(const Bytes &gif, Target, uint8_t *) {
    return stb_decode_rgba(gif);
}

bool play_with_stb(const Bytes &gif, Target, uint8_t *) {
    return stb_decode_frames(gif);
}

using Decode = bool (*)(const Bytes &gif, Target target, uint8_t *output);

// The decoders of one kind of work: the first image, or all frames.
struct Decoders {
    Decode pelm, giflib, stb;
};

constexpr Decoders of_stills = {decode_with_pelm, giflib_decode, decode_with_stb};
constexpr Decoders of_animations = {play_with_pelm, giflib_decode_frames, play_with_stb};

// The picture, or the last frame.
bool equals_giflib(const Bytes &gif, const Decoders &decoders) {
    Bytes expected(4 * pixels_of(gif), 1), got(4 * pixels_of(gif), 2);
    return decoders.giflib(gif, Target::rgba, expected.data()) && decoders.pelm(gif, Target::rgba, got.data()) &&
           expected == got;
}

uint32_t frames_of(const Bytes &gif) {
    InputSource source = source_of(gif);
    PelmAnimation animation;
    return PelmAnimation_Describe(&source, &animation, nullptr, 0) == 0 ? animation.frameCount : 0;
}

void run(benchmark::State &state, const std::shared_ptr<Work> &work, const Decoders &decoders, Decode decode,
         Target target) {
    const std::vector<Bytes> &files = work->files();
    if (files.empty()) state.SkipWithError("there is nothing to decode");
    const bool is_own = decode == decoders.pelm && target == Target::rgba;
    const auto is_right = [&](const Bytes &gif) { return equals_giflib(gif, decoders); };
    if (is_own && !std::all_of(files.begin(), files.end(), is_right)) state.SkipWithError("the picture is wrong");
    const bool is_still = decoders.pelm == of_stills.pelm;
    double pixels = 0;
    for (const Bytes &gif : files)
        pixels += static_cast<double>(pixels_of(gif)) * (is_still ? 1 : frames_of(gif));
    for (auto _ : state) {
        for (const Bytes &gif : files)
            if (!decode(gif, target, output_for(gif).data())) state.SkipWithError("decode failed");
        benchmark::ClobberMemory();
    }
    state.counters["MP/s"] = benchmark::Counter(pixels / 1e6, benchmark::Counter::kIsIterationInvariantRate);
}

void add(const std::string &name, const Decoders &decoders, const std::shared_ptr<Work> &work) {
    for (const Target target : {Target::rgba, Target::rgb565}) {
        const std::string prefix = "gif/" + name + (target == Target::rgba ? "/rgba/" : "/rgb565/");
        const auto add_one = [&](const char *who, Decode decode) {
            benchmark::RegisterBenchmark((prefix + who).c_str(), run, work, decoders, decode, target)
                ->Unit(benchmark::kMillisecond);
        };
        add_one("pelm", decoders.pelm);
        add_one("giflib", decoders.giflib);
        if (decoders.stb != nullptr) add_one("stb", decoders.stb);
    }
}

// Nothing to decode when it could not be made.
template <class Make>
std::shared_ptr<Work> made_by(Make make) {
    return std::make_shared<Work>([make]() -> std::vector<Bytes> {
        Bytes gif = make();
        if (gif.empty()) return {};
        return {std::move(gif)};
    });
}

// stb_image refuses some files.
Decoders decoders_of(const Bytes &gif, bool is_animation) {
    Decoders decoders = is_animation ? of_animations : of_stills;
    if (!decoders.stb(gif, Target::rgba, nullptr)) decoders.stb = nullptr;
    return decoders;
}

// Small stills go together in one iteration: what counts is how a decode begins and ends.
void add_shared_images() {
    constexpr uint32_t icon_width = 64;
    std::vector<Bytes> icons;
    for (const fs::path &path : files_with_suffix(image_folder(), ".gif")) {
        Bytes gif = read_file(path);
        const bool is_animation = frames_of(gif) > 1;
        if (!is_animation && width_of(gif) <= icon_width) {
            icons.push_back(std::move(gif));
            continue;
        }
        add(path.stem().string(), decoders_of(gif, is_animation), made_by([=] { return gif; }));
    }
    if (icons.empty()) return;
    add(std::to_string(icons.size()) + " icons", of_stills, std::make_shared<Work>([=] { return icons; }));
}

} // namespace

void add_gif_benchmarks() {
    add("photo dithered 4MP", of_stills,
        made_by([] { return gif_picture(Motif::photo, Colours::dithered, 2304, 1728); }));
    add("screenshot 4MP", of_stills,
        made_by([] { return gif_picture(Motif::screenshot, Colours::nearest, 2560, 1600); }));
    add("illustration 4MP", of_stills,
        made_by([] { return gif_picture(Motif::illustration, Colours::nearest, 2304, 1728); }));
    add("text two colours 8MP", of_stills, made_by([] { return gif_picture(Motif::text, Colours::two, 2400, 3400); }));
    add("animation full frames 12x0.5MP", of_animations,
        made_by([] { return gif_of_full_frames(Motif::photo, 800, 600, 12); }));
    add("animation small changes 24x1MP", of_animations,
        made_by([] { return gif_of_small_changes(Motif::screenshot, 1280, 800, 24); }));
    add_shared_images();
}

} // namespace bench
