// Nothing that memory happened to hold may be seen: neither what new blocks of the host hold, nor what the buffer held
// where a pixel is written without blending.
#include <algorithm>

#include <gtest/gtest.h>

#include "tests/sweeps/decodes.h"
#include "tests/sweeps/extent.h"

namespace pelm::sweeps {
namespace {

class Memory : public testing::Test {
protected:
    Memory() { PelmTest_Reset(); }
    ~Memory() override { PelmTest_Reset(); }
};

Outcome outcome_with(const Decode &decode, const Setting &setting, uint8_t block_filling, uint8_t buffer_filling) {
    PelmTest_Faults()->filling = block_filling;
    size_t size = output_size(decode, setting).value_or(0);
    if (!fuzz::bytes_per_output_pixel(decode.input->format, setting.format)) size = 64; // of which nothing is written
    Bytes buffer(size, buffer_filling);
    Outcome outcome = run(decode, setting, buffer);
    EXPECT_EQ(PelmTest_Violation(), nullptr) << decode.name() << ", " << setting.name();
    PelmTest_Reset();
    return outcome;
}

// Steps of 7 through the settings reach all of them, and neighbours differ in everything.
// check(decode, setting) is called for every way of every input in every format code, `settings` times for small
// inputs, until it has failed a few times.
template <class Check>
void sweep(uint32_t settings, Check check) {
    const std::vector<Input> small = small_inputs();
    const std::vector<Input> cut = cut_short(small);
    const std::vector<Input> samples = sample_inputs();
    uint32_t count = 0;
    int failures = 0;
    for (const std::vector<Input> *const inputs : {&small, &cut, &samples}) {
        const uint32_t repetitions = inputs == &samples ? std::min(settings, 1u) : settings;
        for (const Decode &decode : decodes_of(*inputs)) {
            for (uint32_t format = 0; format <= 12; ++format) {
                for (uint32_t i = 0; i < repetitions; ++i) {
                    const Setting setting = nth_setting(*decode.input, format, count++ * 7 % setting_count);
                    const testing::AssertionResult result = check(decode, setting);
                    EXPECT_TRUE(result) << decode.name() << ", " << setting.name();
                    if (!result && ++failures == 10) return;
                }
            }
        }
    }
    tell_count("memory", uint64_t{2} * count);
}

TEST_F(Memory, what_new_blocks_hold_is_never_seen) {
    sweep(by_extent(1u, 40u, setting_count), [](const Decode &decode, const Setting &setting) {
        const Outcome zeros = outcome_with(decode, setting, 0x00, 0x5C);
        const Outcome others = outcome_with(decode, setting, 0xA5, 0x5C);
        if (zeros == others) return testing::AssertionSuccess();
        if (zeros.replies != others.replies) return testing::AssertionFailure() << "other replies";
        if (zeros.colour_tables != others.colour_tables) return testing::AssertionFailure() << "other colour tables";
        const auto at = std::mismatch(zeros.output.begin(), zeros.output.end(), others.output.begin()).first;
        return testing::AssertionFailure() << "other output from byte " << at - zeros.output.begin() << " on";
    });
}

enum class Pixel { written, kept, mixed };

// From both buffers, one of which held 0x00 and the other one 0xFF.
Pixel fate_of(const uint8_t *in_zeros, const uint8_t *in_ones, size_t size) {
    if (std::equal(in_zeros, in_zeros + size, in_ones)) return Pixel::written;
    const bool kept = std::all_of(in_zeros, in_zeros + size, [](uint8_t byte) { return byte == 0x00; }) &&
                      std::all_of(in_ones, in_ones + size, [](uint8_t byte) { return byte == 0xFF; });
    return kept ? Pixel::kept : Pixel::mixed;
}

struct Outputs {
    Outcome in_zeros, in_ones;
    size_t pixel; // bytes

    size_t count() const { return in_zeros.output.size() / pixel; }
    const uint8_t *at(size_t n) const { return &in_zeros.output[n * pixel]; }
    Pixel fate(size_t n) const { return fate_of(at(n), &in_ones.output[n * pixel], pixel); }
};

// Byte by byte where formats are not written, and where GIF clears missing rows by half: in 16 bits.
Outputs outputs_of(const Decode &decode, const Setting &setting) {
    const size_t pixel = fuzz::bytes_per_output_pixel(decode.input->format, setting.format);
    const bool by_bytes = pixel == 0 || (pixel == 2 && decode.input->format == fuzz::Format::gif);
    return {outcome_with(decode, setting, 0xA5, 0x00), outcome_with(decode, setting, 0xA5, 0xFF), by_bytes ? 1 : pixel};
}

// What blends, where its alpha is below 255, are PNGs in the formats without alpha. A decode with alpha tells where.
// RGB565 turned by 270 degrees lies elsewhere: then the whole image tells whether anything may blend.
class Alphas {
public:
    Alphas(const Decode &decode, Setting setting) {
        if (decode.input->format != fuzz::Format::png || setting.format > PELM_FORMAT_RGB888) return;
        are_in_place_ = setting.format != PELM_FORMAT_RGB565 || setting.rotation != PELM_ROTATE_270;
        setting.format = PELM_FORMAT_RGBA8888;
        if (!are_in_place_) {
            setting.rotation = PELM_ROTATE_0;
            setting.width = decode.input->width;
            setting.height = decode.input->height;
        }
        outputs_ = outputs_of(decode, setting);
        for (size_t n = 0; n < outputs_.count() && !anything_blends_; ++n)
            anything_blends_ = outputs_.fate(n) == Pixel::written && outputs_.at(n)[3] != 255;
    }

    bool may_blend(size_t n) const { return anything_blends_ && (!are_in_place_ || outputs_.at(n)[3] != 255); }
    bool must_be_written(size_t n) const {
        return are_in_place_ && outputs_.fate(n) == Pixel::written && outputs_.at(n)[3] == 255;
    }

private:
    Outputs outputs_{{}, {}, 4};
    bool are_in_place_ = false;
    bool anything_blends_ = false;
};

testing::AssertionResult no_other_pixel_is_mixed(const Decode &decode, const Setting &setting) {
    const Outputs outputs = outputs_of(decode, setting);
    if (outputs.in_zeros.replies != outputs.in_ones.replies) return testing::AssertionFailure() << "other replies";
    const Alphas alphas(decode, setting);
    for (size_t n = 0; n < outputs.count(); ++n) {
        const Pixel fate = outputs.fate(n);
        if ((fate == Pixel::mixed && !alphas.may_blend(n)) || (fate != Pixel::written && alphas.must_be_written(n)))
            return testing::AssertionFailure() << "pixel " << n << " shows what the buffer held";
    }
    return testing::AssertionSuccess();
}

TEST_F(Memory, what_the_buffer_held_shows_only_where_nothing_is_written_or_a_pixel_blends) {
    sweep(by_extent(1u, 40u, setting_count), no_other_pixel_is_mixed);
}

} // namespace
} // namespace pelm::sweeps
