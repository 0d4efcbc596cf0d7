// One call, slices, bands and lines, from memory and from streams that seek or do not: the same pixels wherever no
// entry of docs/oddities.md says otherwise.
#include <gtest/gtest.h>

#include <cstring>
#include <map>

#include "tests/sweeps/equality.h"
#include "tests/sweeps/tally.h"

namespace pelm::sweeps {
namespace {

using fuzz::Format;

constexpr uint8_t background = 0x5C;

struct Picture {
    Outcome outcome;
    Bytes buffer; // at the end
    bool is_clean;
};

Picture decoded(const Decode &decode, const Setting &setting, size_t size) {
    Picture picture;
    picture.buffer.assign(size, background);
    picture.outcome = run(decode, setting, picture.buffer);
    picture.is_clean = PelmTest_Violation() == nullptr;
    PelmTest_Reset();
    return picture;
}

int32_t last_result(const Picture &picture) {
    return picture.outcome.replies.back().result;
}

class Equality : public testing::TestWithParam<uint32_t> {
protected:
    Equality() { PelmTest_Reset(); }
    ~Equality() override { PelmTest_Reset(); }

    // Every other way of the input in this setting.
    void check(const Input &input, Format calls, uint32_t flags, Setting setting, bool thoroughly) {
        setting.kind = PELM_SOURCE_MEMORY;
        const bool is_in_two_steps = input.name.starts_with("bmp_run_lengths");
        const auto all_calls = fuzz::decoding_calls(calls);
        const Decode one_call{&input, is_in_two_steps ? &all_calls.back() : &all_calls.front(), flags};
        const std::optional<size_t> size = output_size(one_call, setting);
        PelmTest_Reset();
        if (!size) return;
        const Picture measure = decoded(one_call, setting, *size);
        for (const OtherWay &way : other_ways(input, calls, thoroughly)) {
            if (is_in_two_steps && way.call != one_call.call) continue;
            const Reply &scaled = measure.outcome.replies.back();
            const std::string exception = exception_of(way, input, setting, scaled);
            if (!exception.empty()) {
                ++exceptions_[exception];
                continue;
            }
            setting.kind = way.kind;
            setting.rows = way.rows;
            ++comparisons;
            const Decode decode{&input, way.call, flags};
            const std::string difference = difference_of(way, decode, setting, measure, *size);
            EXPECT_EQ(difference, "") << decode.name() << ", " << setting.name() << ", rows " << way.rows;
            failures += difference.empty() ? 0 : 1;
            if (failures > 10) return;
        }
    }

    std::string difference_of(const OtherWay &way, const Decode &decode, const Setting &setting, const Picture &measure,
                              size_t size) {
        const Reply &scaled = measure.outcome.replies.back();
        const bool bands =
            gives_bands(way, *decode.input, setting, scaled) && last_result(measure) != PELM_RESULT_FAILED;
        const size_t own_size = bands ? output_size(decode, setting).value_or(0) : size;
        const Picture other = decoded(decode, setting, own_size);
        if (!other.is_clean) return "a violation";
        if (last_result(other) != last_result(measure)) return "result " + std::to_string(last_result(other));
        if (decode.input->format == Format::gif && way.call->output == fuzz::Output::kept &&
            std::string(way.call->name).find("AGIF") != std::string::npos)
            return other.outcome.output == measure.outcome.output ? "" : "other frames";
        if (!bands) return other.buffer == measure.buffer ? "" : "other pixels";
        return same_bands(way, decode, setting, measure, other) ? "" : "other rows";
    }

    static bool same_bands(const OtherWay &way, const Decode &decode, const Setting &setting, const Picture &measure,
                           const Picture &other) {
        const Reply &scaled = measure.outcome.replies.back();
        const size_t pixel = fuzz::bytes_per_output_pixel(decode.input->format, setting.format);
        const bool is_exact = setting.placement == PELM_PLACE_EXACT;
        const int32_t box_width = is_exact ? scaled.width : setting.width;
        const int32_t box_height = is_exact ? scaled.height : setting.height;
        const auto stride = static_cast<size_t>(box_width) * pixel;
        const auto rows = static_cast<size_t>(scaled.height), band = static_cast<size_t>(way.rows);
        const auto top = static_cast<size_t>(box_height - scaled.height) / 2;
        const auto left = static_cast<size_t>(box_width - scaled.width) / 2;
        const Bytes &bands = other.outcome.output;
        if (decode.input->format == Format::bmp)
            return rows_agree(measure.buffer, bands, {stride, rows, top, 0, stride}, band, band, 0);
        if (decode.input->format == Format::png)
            return rows_agree(measure.buffer, bands, {stride, rows, top, 0, stride}, band,
                              static_cast<size_t>(box_height), top);
        const size_t length = static_cast<size_t>(scaled.width) * pixel;
        return rows_agree(measure.buffer, bands, {stride, rows, top, left * pixel, length}, band, band, 0);
    }

    // Where the image's rows lie in a buffer, and which of a row's bytes count.
    struct Place {
        size_t stride, rows, top, left, length;
    };

    // Row y is row y % band of a buffer of `band_buffer` rows, behind `band_top` others.
    static bool rows_agree(const Bytes &whole, const Bytes &bands, const Place &place, size_t band, size_t band_buffer,
                           size_t band_top) {
        for (size_t y = 0; y < place.rows; ++y) {
            const size_t at = (y / band * band_buffer + band_top + y % band) * place.stride;
            if (at + place.length > bands.size()) return false;
            const uint8_t *const row = &whole[(place.top + y) * place.stride + place.left];
            if (std::memcmp(row, &bands[at], place.length) != 0) return false;
        }
        return true;
    }

    void sweep(const std::vector<Input> &inputs, uint32_t settings, bool thoroughly) {
        uint32_t number = GetParam();
        for (const Input &input : inputs) {
            if (input.name == "gif_damaged") continue;
            const bool is_interlaced_png = input.format == Format::png && input.bytes[28] == 1;
            for (const uint32_t format : {0u, 1u, 5u, 6u, 7u, 8u, 10u, 11u, 12u}) {
                if (fuzz::bytes_per_output_pixel(input.format, format) == 0) continue;
                for (uint32_t i = 0; i < settings && failures <= 10; ++i, number += shards) {
                    const Setting setting = nth_setting(input, format, number * 7 % setting_count);
                    check(input, input.format, 0, setting, thoroughly);
                    if (is_interlaced_png) check(input, Format::png, PELM_INTERLACE_FRAME, setting, thoroughly);
                    if (input.format == Format::gif) check(input, Format::agif, 0, setting, thoroughly);
                }
            }
        }
    }

    static constexpr uint32_t shards = 4;
    uint64_t comparisons = 0;
    int failures = 0;
    std::map<std::string, uint64_t> exceptions_;
};

TEST_P(Equality, of_all_ways_of_small_inputs) {
    sweep(small_inputs(), by_extent(1u, 1u, setting_count / shards), by_extent(false, false, true));
    for (const auto &[name, count] : exceptions_)
        std::printf("    %llu left out: %s\n", static_cast<unsigned long long>(count), name.c_str());
    tell("decodes that came out the same", comparisons, 100000);
}

TEST_P(Equality, of_all_ways_of_the_samples) {
    std::vector<Input> inputs;
    uint32_t number = 0;
    for (Input &sample : sample_inputs()) // in a quick run each of them on one shard alone
        if (by_extent(number++ % shards == GetParam(), true, true)) inputs.push_back(std::move(sample));
    sweep(inputs, by_extent(1u, 1u, 5u), false);
    tell("decodes of samples that came out the same", comparisons, 1000);
}

INSTANTIATE_TEST_SUITE_P(Shards, Equality, testing::Range(0u, 4u));

} // namespace
} // namespace pelm::sweeps
