// Ten thousand decodes, one after the other: whole files of every kind by every call from every kind of source, pixel
// for pixel and reduced; and the same files cut in half. Every result is what is stated, every outcome that of the
// first time, and no memory is kept but by the leaks that are stated.
#include <gtest/gtest.h>

#include <algorithm>
#include <string_view>

#include "PelmHostTesting.h"
#include "tests/png/support/png_builder.h"
#include "tests/sweeps/cut_files.h"

namespace pelm::test {
namespace {

using fuzz::Format;
using sweeps::Cut;
using sweeps::Decode;
using sweeps::Input;
using sweeps::Outcome;
using sweeps::Setting;
using sweeps::Stated;

constexpr uint32_t kinds[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL};

struct Case {
    Decode decode;
    Setting setting;
    bool is_reduced;

    std::string name() const { return decode.name() + ", " + setting.name(); }
    bool is_call(std::string_view call) const { return call == decode.call->name; }
    bool is_named_after(const char *trait) const { return decode.input->name.find(trait) != std::string::npos; }
};

// Few values in no order: the compressor makes codes of their own for them.
Input png_of_dynamic_codes() {
    Png png{.width = 40, .height = 30};
    png.rows = noise_rows(png, 1);
    for (Bytes &row : png.rows)
        for (uint8_t &byte : row)
            byte &= 0x0F;
    return {"png_dynamic_codes", Format::png, 40, 30, build(png)};
}

// What is known of damaged data is the business of other tests.
std::vector<Input> sound_inputs() {
    std::vector<Input> inputs = sweeps::small_inputs();
    std::erase_if(inputs, [](const Input &input) { return input.name == "gif_damaged"; });
    inputs.push_back(png_of_dynamic_codes());
    return inputs;
}

std::vector<Case> cases_of(const std::vector<Input> &inputs) {
    std::vector<Case> cases;
    for (const Decode &decode : sweeps::decodes_of(inputs)) {
        for (const uint32_t kind : kinds) {
            const Input &input = *decode.input;
            Setting setting{.width = input.width, .height = input.height, .kind = kind};
            // Reduced, iterative decodes of this one begin anew for ever.
            const bool is_reduced = cases.size() % 7 < 3 && input.name != "png_many_blocks";
            if (is_reduced) setting.width = input.width / 2;
            if (is_reduced) setting.height = input.height / 2 + 1;
            setting.rows = input.height / 3 + 1;
            cases.push_back({decode, setting, is_reduced});
        }
    }
    return cases;
}

int32_t bmp_result(const Case &one) {
    const bool has_two_steps = one.is_call("PreInitBMP");
    if (one.is_named_after("run_lengths")) return has_two_steps ? PELM_RESULT_DONE : PELM_RESULT_FAILED;
    return one.is_named_after("core_header") && has_two_steps ? PELM_RESULT_FAILED : PELM_RESULT_DONE;
}

int32_t gif_result(const Case &one) {
    const bool is_animation = one.decode.call->state == fuzz::State::frames || //
                              one.decode.call->state == fuzz::State::frame_slices;
    if (one.is_named_after("empty")) return one.is_call("DecodeGIFIter") ? PELM_RESULT_DONE : PELM_RESULT_FAILED;
    if (is_animation) return PELM_RESULT_LAST_FRAME;
    return one.is_named_after("interlaced") && one.is_call("DecodeGIFLine") ? PELM_RESULT_FAILED : PELM_RESULT_DONE;
}

// Of the last call for a whole file.
int32_t result_for(const Case &one) {
    switch (one.decode.input->format) {
    case Format::bmp: return bmp_result(one);
    case Format::wbmp: return one.setting.kind <= PELM_SOURCE_MEMORY ? PELM_RESULT_DONE : PELM_RESULT_FAILED;
    case Format::png:
        return one.is_named_after("interlaced") && one.is_call("DecodePNGLine") ? PELM_RESULT_FAILED : PELM_RESULT_DONE;
    default: return gif_result(one);
    }
}

// docs/oddities.md, "No image" and "Line calls of offset images".
bool may_write_nothing(const Case &one) {
    const bool is_offset = one.is_named_after("narrow") || one.is_named_after("wide") || one.is_named_after("cover");
    return result_for(one) == PELM_RESULT_FAILED || one.is_named_after("empty") ||
           (is_offset && one.is_reduced && one.is_call("DecodeGIFLine"));
}

constexpr uint8_t background = 0x5C;

struct Decoded {
    Outcome outcome;
    bool wrote_anything;
    uint64_t bytes; // by which the host's memory has grown
};

Decoded decoded(const Case &one) {
    const std::optional<size_t> size = sweeps::output_size(one.decode, one.setting);
    Bytes output(size.value_or(0), background);
    const uint64_t before = PelmTest_Counters()->liveBytes;
    Outcome outcome = sweeps::run(one.decode, one.setting, output);
    const bool wrote = std::any_of(output.begin(), output.end(), [](uint8_t byte) { return byte != background; });
    return {std::move(outcome), wrote, PelmTest_Counters()->liveBytes - before};
}

int32_t last_result(const Outcome &outcome) {
    return outcome.replies.back().result;
}

// A PNG that is cut is refused unread. In place of that its image data ends in the middle, in a chunk that is right.
Bytes with_half_the_image_data(const Bytes &png) {
    std::vector<Chunk> chunks;
    for (size_t at = 8; at < png.size(); at += 12 + chunks.back().data.size()) {
        const auto begin = png.begin() + static_cast<ptrdiff_t>(at) + 8;
        chunks.push_back({std::string(begin - 4, begin), Bytes(begin, begin + read_u32be(&png[at]))});
    }
    const auto is_image_data = [](const Chunk &chunk) { return chunk.type == "IDAT"; };
    size_t whole = 0;
    for (const Chunk &chunk : chunks)
        whole += is_image_data(chunk) ? chunk.data.size() : 0;
    size_t left = whole / 2;
    std::erase_if(chunks, [&](Chunk &chunk) {
        if (!is_image_data(chunk)) return false;
        chunk.data.resize(std::min(chunk.data.size(), left));
        left -= chunk.data.size();
        return chunk.data.empty();
    });
    return file_of(chunks);
}

void cut_in_half(Input &input) {
    if (input.format == Format::png)
        input.bytes = with_half_the_image_data(input.bytes);
    else
        input.bytes.resize(input.bytes.size() / 2);
}

// Where refusals leak: in the header of a BMP and behind it, and before the image of a GIF.
void cut_in_its_head(Input &input, size_t number) {
    constexpr size_t gif_header = 13;
    const bool is_gif = input.format == Format::gif;
    const auto table = static_cast<size_t>(is_gif ? sweeps::gif_table_bytes(input.bytes[10]) : 0);
    input.bytes.resize(is_gif ? gif_header + table + 1 : number % 2 == 0 ? 60 : 30);
}

// Files that are cut and, in the same places, those that they were.
struct CutInputs {
    std::vector<Input> cut, whole;
};

CutInputs cut_inputs() {
    const std::vector<Input> sound = sound_inputs();
    CutInputs inputs{sound, sound};
    for (Input &input : inputs.cut)
        cut_in_half(input);
    for (const Input &input : sound) {
        if (input.format != Format::bmp && input.format != Format::gif) continue;
        inputs.whole.push_back(input);
        inputs.cut.push_back(input);
        cut_in_its_head(inputs.cut.back(), inputs.cut.size());
    }
    return inputs;
}

// Behind the half of a PNG's image data the decoder takes checksum and end chunk for more of it: anything may come of
// that.
Stated stated_of(const Cut &how, const Case &of_whole) {
    if (of_whole.decode.input->format == Format::png) return {};
    return sweeps::is_whole_to(how) ? Stated{result_for(of_whole)} : sweeps::stated_for(how);
}

class DecodesInARow : public testing::Test {
protected:
    DecodesInARow() { PelmTest_Reset(); }
    ~DecodesInARow() override { PelmTest_Reset(); }

    static constexpr size_t wanted = 10000;
};

TEST_F(DecodesInARow, of_whole_files_keep_nothing) {
    const std::vector<Input> inputs = sound_inputs();
    const std::vector<Case> cases = cases_of(inputs);
    ASSERT_LT(2 * cases.size(), wanted);
    std::vector<Outcome> first;
    uint64_t most_at_first = 0;
    for (size_t n = 0; n < wanted; ++n) {
        const Case &one = cases[n % cases.size()];
        const Decoded now = decoded(one);
        ASSERT_EQ(PelmTest_Counters()->liveBlocks, 0u) << one.name() << ", decode " << n;
        if (n < cases.size()) {
            EXPECT_EQ(last_result(now.outcome), result_for(one)) << one.name();
            EXPECT_TRUE(now.wrote_anything || may_write_nothing(one)) << one.name();
            first.push_back(now.outcome);
            most_at_first = PelmTest_Counters()->peakBytes;
        }
        ASSERT_TRUE(now.outcome == first[n % cases.size()]) << one.name() << ", decode " << n;
        ASSERT_EQ(PelmTest_Counters()->peakBytes, most_at_first) << one.name() << ", decode " << n;
    }
    EXPECT_EQ(PelmTest_Violation(), nullptr);
}

TEST_F(DecodesInARow, of_cut_files_keep_what_is_stated) {
    const CutInputs inputs = cut_inputs();
    const std::vector<Case> cut = cases_of(inputs.cut), whole = cases_of(inputs.whole);
    ASSERT_EQ(whole.size(), cut.size());
    ASSERT_LT(2 * cut.size(), wanted);
    std::vector<Decoded> first;
    uint64_t stated_blocks = 0;
    for (size_t n = 0; n < wanted; ++n) {
        const Case &one = cut[n % cut.size()], &of_whole = whole[n % cut.size()];
        const auto size = static_cast<int32_t>(one.decode.input->bytes.size());
        const Cut how{&of_whole.decode, one.setting.kind, size, size, one.is_reduced};
        const Stated stated = stated_of(how, of_whole);
        const Decoded now = decoded(one);
        stated_blocks += stated.blocks;
        ASSERT_EQ(PelmTest_Counters()->liveBlocks, stated_blocks) << one.name() << ", decode " << n;
        if (n < cut.size()) {
            EXPECT_EQ(last_result(now.outcome), stated.result.value_or(last_result(now.outcome))) << one.name();
            first.push_back(now);
        }
        ASSERT_TRUE(now.outcome == first[n % cut.size()].outcome) << one.name() << ", decode " << n;
        ASSERT_EQ(now.bytes, first[n % cut.size()].bytes) << one.name() << ", decode " << n;
    }
    EXPECT_GT(stated_blocks, 0u);
    EXPECT_EQ(PelmTest_Violation(), nullptr);
}

} // namespace
} // namespace pelm::test
