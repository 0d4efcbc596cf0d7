// Every allocation and every read of every decode fails in turn, alone and with all that follow; reads also come short
// and tell too much. What comes of it is what host_failures.h expects, no block is lost but for the leaks that are
// stated (fuzz/account.h), and the same request is decoded afterwards as ever.
#include <gtest/gtest.h>

#include "tests/gif/support/gif_builder.h"
#include "tests/sweeps/at_fault.h"
#include "tests/sweeps/extent.h"
#include "tests/sweeps/host_failures.h"

namespace pelm::sweeps {
namespace {

using fuzz::Format;

enum class Files { whole, cut_short, samples, long_gifs };

struct Part {
    const char *name;
    Format format;
    Files files;
    uint64_t runs; // at least, in the long form
    uint64_t step = 1;
};

Input animation_of(const char *name, uint16_t width, uint16_t height, const std::vector<test::ImagePlace> &places) {
    test::GifFile gif;
    gif.screen(width, height, test::distinct_table(256), 1);
    uint8_t frame = 0;
    for (const test::ImagePlace &place : places) {
        gif.control({.disposal = static_cast<uint8_t>(frame % 4), .transparent = frame % 2 == 1 ? 3 : -1, .delay = 7});
        gif.image(place, test::noise_pixels(size_t{place.width} * place.height, 256, frame + 1u), 8,
                  frame % 3 == 1 ? test::distinct_table(256, frame) : test::ColourTable{});
        ++frame;
    }
    return {name, Format::gif, width, height, gif.trailer().bytes};
}

// Reads end in the middle of some frames, and between others; of one file in the middle of the first.
std::vector<Input> long_gifs() {
    const test::ImagePlace whole{0, 0, 90, 70}, narrow{7, 11, 60, 50}, interlaced{5, 0, 80, 65, true};
    const test::ImagePlace long_one{3, 5, 160, 110};
    return {
        animation_of("gif_long", 90, 70, {whole, narrow, interlaced, narrow, interlaced, whole, interlaced, narrow}),
        animation_of("gif_of_long_images", 165, 120, {long_one, narrow, long_one})};
}

// Samples are read in several pieces; there are more of these in one than there is time for.
std::vector<Input> inputs_of(const Part &part) {
    std::vector<Input> inputs;
    const auto add = [&](const std::vector<Input> &all) {
        for (const Input &input : all)
            if (input.format == part.format) inputs.push_back(input);
    };
    if (part.files == Files::long_gifs) return long_gifs();
    if (part.files == Files::samples) {
        add(sample_inputs());
        return inputs;
    }
    add(small_inputs());
    add(tiny_inputs());
    return part.files == Files::cut_short ? cut_short(inputs) : inputs;
}

bool takes_kind(Format format, uint32_t kind) {
    return format != Format::wbmp || kind == PELM_SOURCE_MEMORY || kind == PELM_SOURCE_STREAM;
}

std::vector<Setting> settings_of(const Input &input) {
    std::vector<Setting> settings;
    for (const uint32_t kind :
         {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL}) {
        if (!takes_kind(input.format, kind)) continue;
        Setting own{.width = input.width, .height = input.height, .kind = kind};
        own.rows = input.height / 3 + 1;
        Setting reduced = own;
        reduced.width = input.width / 2 + 1;
        reduced.placement = kind == PELM_SOURCE_STREAM ? PELM_PLACE_STRETCH : PELM_PLACE_FIT;
        reduced.format = PELM_FORMAT_RGB565;
        settings.push_back(own);
        settings.push_back(reduced);
    }
    return settings;
}

class Sweep {
public:
    uint64_t runs = 0;

    // Every `step`-th fault.
    void run(const std::vector<Input> &inputs, uint64_t step) {
        const AtFault at_fault([this] { return where(); });
        for (const Decode &decode : decodes_of(inputs))
            for (const Setting &setting : settings_of(*decode.input))
                run_decode(decode, setting, step);
    }

private:
    void run_decode(const Decode &decode, const Setting &setting, uint64_t step) {
        decode_ = &decode;
        setting_ = &setting;
        fuzz::Plan plan = plan_of(decode, setting);
        plan.looks_at_pixels = plan.keeps_services = true;
        fault_ = {};
        const fuzz::Report sound = fuzz::carry_out(plan);
        const PelmTestFaults none = plan.faults;
        plan.keeps_services = false;
        plan.again = true;
        for (const HostFault &fault : faults_of(sound.services)) {
            if (++faults_ % step != 0) continue;
            fault_ = fault;
            plan.faults = none;
            fault.set(plan.faults);
            const fuzz::Report faulty = fuzz::carry_out(plan);
            const Expectation expectation = expectation_of(decode, setting, sound, fault);
            const fuzz::Outcome cut =
                expectation.needs_cut() ? cut_outcome(decode, setting, expectation.cut) : fuzz::Outcome{};
            if (const std::string wrong = flaw(expectation, sound, cut, faulty); !wrong.empty() && failures_++ < 10)
                ADD_FAILURE() << where() << ": " << wrong;
            ++runs;
        }
    }

    static fuzz::Outcome cut_outcome(const Decode &decode, const Setting &setting, size_t size) {
        fuzz::Plan plan = plan_of(decode, setting);
        plan.looks_at_pixels = true;
        plan.file.resize(size);
        return fuzz::carry_out(plan).outcome;
    }

    std::string where() const { return decode_->name() + ", " + setting_->name() + ", " + fault_.name(); }

    const Decode *decode_ = nullptr;
    const Setting *setting_ = nullptr;
    HostFault fault_{};
    uint64_t faults_ = 0;
    int failures_ = 0;
};

class FailingHosts : public testing::TestWithParam<Part> {};

TEST_P(FailingHosts, do_no_harm_and_the_next_decode_is_as_ever) {
    const Part &part = GetParam();
    const std::vector<Input> inputs = inputs_of(part);
    Sweep sweep;
    sweep.run(inputs, part.step * by_extent<uint64_t>(97, 9, 1));
    RecordProperty("runs", static_cast<int>(sweep.runs));
    printf("%s: %llu runs over %zu files\n", part.name, static_cast<unsigned long long>(sweep.runs), inputs.size());
    EXPECT_GE(sweep.runs, by_extent(part.runs / 120, part.runs / 12, part.runs));
}

INSTANTIATE_TEST_SUITE_P(Decoding, FailingHosts,
                         testing::Values(Part{"bmp", Format::bmp, Files::whole, 35000},
                                         Part{"wbmp", Format::wbmp, Files::whole, 700},
                                         Part{"png", Format::png, Files::whole, 200000},
                                         Part{"gif", Format::gif, Files::whole, 25000},
                                         Part{"cut_bmp", Format::bmp, Files::cut_short, 30000},
                                         Part{"cut_wbmp", Format::wbmp, Files::cut_short, 90},
                                         Part{"cut_png", Format::png, Files::cut_short, 80000},
                                         Part{"cut_gif", Format::gif, Files::cut_short, 25000},
                                         Part{"long_gifs", Format::gif, Files::long_gifs, 5000},
                                         Part{"sample_pngs", Format::png, Files::samples, 100, 23},
                                         Part{"sample_gifs", Format::gif, Files::samples, 100, 23}),
                         [](const auto &part) { return std::string(part.param.name); });

} // namespace
} // namespace pelm::sweeps
