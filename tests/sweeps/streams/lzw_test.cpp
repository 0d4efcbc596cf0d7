// LZW codes in every order: the calls as the model, and the fast loop as the careful one.
#include "tests/gif/inner/decoding_loops.h"
#include "tests/sweeps/random.h"
#include "tests/sweeps/tally.h"

namespace pelm::sweeps {
namespace {

using test::Bytes;
using test::Codes;
using test::GifCall;
using test::GifFile;
using test::GifRequest;

constexpr GifCall stills[] = {GifCall::one_shot, GifCall::iterative, GifCall::line};

class LzwSweep : public testing::TestWithParam<uint32_t> {
protected:
    LzwSweep() { test::TestHost::get().reset(); }
    ~LzwSweep() override { test::TestHost::get().reset(); }

    // False when a call does otherwise than the model, or one loop otherwise than the other. In the complete form every
    // call decodes every stream, elsewhere each has its turn.
    bool holds(const Bytes &file, const GifRequest &request, int32_t rows) {
        std::string difference;
        for (const GifCall call : stills)
            if (difference.empty() && (is_complete() || call == stills[streams % 3]))
                difference = difference_by(call, file, request, rows);
        if (difference.empty()) difference = loop_difference(file, request);
        EXPECT_EQ(difference, "") << "stream " << streams;
        ++streams;
        return difference.empty();
    }

    std::string difference_by(GifCall call, const Bytes &file, const GifRequest &request, int32_t rows) {
        ++decodes;
        const uint32_t kind = test::gif_source_kinds[streams / 3 % 4];
        return gif_difference(file, request, call, {.kind = kind}, rows);
    }

    Random random{GetParam() + 900};
    uint64_t streams = 0, decodes = 0; // decodes by the calls
};

GifFile file_of(uint16_t width, uint16_t height, int size, const Bytes &data, uint8_t largest = 255) {
    GifFile file;
    file.screen(width, height, test::distinct_table(16)).descriptor({0, 0, width, height});
    return file.data(size, data, largest).trailer();
}

// Every sequence of up to `most` codes behind `codes`, in order; each code takes every value that its width has.
// visit(codes) may end the walk by false.
template <class Visit>
bool walk(Codes &codes, size_t most, Visit visit) {
    constexpr int size = 2;
    if (most == 0) return true;
    codes.push_back(0);
    const uint32_t values = 1u << test::code_widths(codes, size).back();
    bool goes_on = true;
    for (uint32_t value = 0; value < values && goes_on; ++value) {
        codes.back() = value;
        goes_on = visit(codes) && walk(codes, most - 1, visit);
    }
    codes.pop_back();
    return goes_on;
}

// Images that so few codes leave with rows too few, and such that they give rows too many.
TEST_P(LzwSweep, every_sequence_of_codes) {
    static constexpr uint16_t sizes[][2] = {{3, 3}, {2, 1}, {1, 2}, {5, 2}, {4, 7}};
    const uint32_t step = by_extent(1409u, 83u, 1u);
    const bool begins_with_clear = GetParam() % 2 == 1;
    Codes codes;
    if (begins_with_clear) codes.push_back(test::clear_code(2));
    uint32_t number = 0;
    walk(codes, 5, [&](const Codes &all) {
        if (number++ % (4 * step) != GetParam() / 2) return true; // four shards share each beginning
        const auto &[width, height] = sizes[number % 5];
        return holds(file_of(width, height, 2, test::packed_codes(all, 2)).bytes, test::own_size(width, height, 1), 2);
    });
    tell("sequences of up to five LZW codes", streams, 25000);
    tell("decodes of these by the calls", decodes, 75000);
}

// More codes than the table has room for, at first roots that fill it, then any.
TEST_P(LzwSweep, a_full_table_and_going_on) {
    const uint32_t repetitions = by_extent(1u, 1u, 12u);
    for (int size = 2; size <= 11; ++size) {
        for (uint32_t i = 0; i < repetitions; ++i) {
            Codes codes;
            if (random.one_in(2)) codes.push_back(test::clear_code(size));
            const uint32_t roots = std::min(1u << size, 256u);
            for (uint32_t entries = 4096 - test::first_free_code(size) + random.below(4); entries > 0; --entries)
                codes.push_back(random.below(roots));
            for (uint32_t left = 300; left > 0; --left) {
                const uint32_t code = random.one_in(3) ? random.below(roots) : random.between(roots, 4095);
                const bool is_kept = code != test::end_code(size) && (code != test::clear_code(size) || i % 3 == 0);
                codes.push_back(is_kept ? code : 4095);
            }
            const auto width = static_cast<uint16_t>(random.between(1, 300));
            const auto height = static_cast<uint16_t>(random.between(1, 60));
            const GifFile file =
                file_of(width, height, size, test::packed_codes(codes, size), random.one_in(2) ? 255 : 7);
            if (!holds(file.bytes, test::own_size(width, height, 1), 9)) return;
        }
    }
    tell("streams of a full table", streams, 120);
    tell("decodes of these by the calls", decodes, 360);
}

INSTANTIATE_TEST_SUITE_P(Shards, LzwSweep, testing::Range(0u, 8u));

} // namespace
} // namespace pelm::sweeps
