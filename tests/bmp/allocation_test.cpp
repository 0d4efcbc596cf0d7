// What a decode allocates, in which order and how much; and what becomes of it when the host has no memory.
#include "bmp/working.h"
#include "tests/bmp/expectations.h"

namespace pelm::test {
namespace {

class BmpAllocation : public HostedTest, public ::testing::WithParamInterface<BmpVariant> {};

constexpr int32_t width = 11;
constexpr int32_t height = 13;
constexpr int32_t proposed_buffer = 100;

// Record, palette, staging buffer, accumulators, row buffer: those that this decode needs.
std::vector<uint32_t> expected_blocks(const BmpFile &file, uint32_t kind, int32_t scaled_width) {
    std::vector<uint32_t> blocks{sizeof(BmpState)};
    const int32_t stride = static_cast<int32_t>(file.stride());
    if (file.bits <= 8) blocks.push_back(1024);
    if (kind == PELM_SOURCE_STREAM || kind == PELM_SOURCE_STREAM_ALT)
        blocks.push_back(static_cast<uint32_t>(proposed_buffer / stride * stride));
    blocks.push_back(static_cast<uint32_t>(scaled_width) * 8);
    if (kind == PELM_SOURCE_SEQUENTIAL) blocks.push_back(static_cast<uint32_t>(std::max(proposed_buffer, stride)));
    return blocks;
}

TEST_P(BmpAllocation, a_decode_allocates_exactly_the_expected_blocks) {
    for (const uint32_t kind : all_kinds)
        for (const int32_t side : {13, 5}) {
            host.reset();
            const BmpFile file = noise_bmp(GetParam(), width, height, false);
            TestSource source(kind, file_bytes(file), proposed_buffer);
            const BmpDecode decode =
                decode_bmp(source, {1, 0, 0x700, side, side}, static_cast<size_t>(side * side * 3));
            EXPECT_EQ(decode.result, 1);
            const std::vector<uint32_t> expected = expected_blocks(file, kind, side);
            EXPECT_EQ(host.allocations, expected) << "kind " << kind;
            uint64_t sum = 0;
            for (const uint32_t size : expected)
                sum += size;
            EXPECT_EQ(host.peak_bytes, sum);
            EXPECT_TRUE(decode.live_blocks.empty());
        }
}

TEST_P(BmpAllocation, a_decode_at_its_own_size_allocates_the_same_blocks) {
    for (const uint32_t kind : all_kinds) {
        host.reset();
        const BmpFile file = noise_bmp(GetParam(), width, height, true);
        TestSource source(kind, file_bytes(file), proposed_buffer);
        EXPECT_EQ(decode_bmp(source, {1, 0, 0, 20, 20}, 1200).result, 1);
        EXPECT_EQ(host.allocations, expected_blocks(file, kind, width)) << "kind " << kind;
    }
}

// The row decoder answers 0 when it gets no row buffer, and the one-shot call does not look at that answer.
int32_t result_without(size_t failing, const std::vector<uint32_t> &blocks, uint32_t kind) {
    return kind == PELM_SOURCE_SEQUENTIAL && failing == blocks.size() ? 1 : 0;
}

TEST_P(BmpAllocation, every_failing_allocation_releases_everything_and_the_next_decode_works) {
    for (const uint32_t kind : all_kinds)
        for (const bool from_then_on : {false, true})
            for (const int32_t side : {20, 5}) {
                const BmpFile file = noise_bmp(GetParam(), width, height, false);
                const std::vector<uint32_t> blocks = expected_blocks(file, kind, 11);
                for (size_t failing = 1; failing <= blocks.size(); ++failing) {
                    host.reset();
                    if (from_then_on)
                        host.faults.failing_allocations_from = static_cast<int>(failing);
                    else
                        host.faults.failing_allocation = static_cast<int>(failing);
                    TestSource source(kind, file_bytes(file), proposed_buffer);
                    const size_t size = static_cast<size_t>(side * side * 3);
                    const BmpDecode decode = decode_bmp(source, {1, 0, 0, side, side}, size);
                    const std::string what = "kind " + std::to_string(kind) + ", allocation " + std::to_string(failing);
                    EXPECT_EQ(decode.result, result_without(failing, blocks, kind)) << what;
                    EXPECT_EQ(decode.output, Bytes(size, background)) << what;
                    EXPECT_EQ(decode.live_blocks, std::vector<uint32_t>{}) << what;
                    EXPECT_EQ(decode.info.decoderState, nullptr) << what;
                    EXPECT_EQ(decode.misbehaviour, "") << what;
                    EXPECT_EQ(host.allocations.size(), failing) << what << ": it goes on without";

                    BmpSubject again(file, kind, proposed_buffer);
                    EXPECT_TRUE(decodes_as_computed(again, {1, 0, 0, side, side})) << what;
                }
            }
}

TEST_P(BmpAllocation, what_a_block_held_before_does_not_matter) {
    for (const uint32_t kind : all_kinds)
        for (const int32_t side : {13, 5, 30}) {
            const BmpFile file = noise_bmp(GetParam(), width, height, false);
            Bytes outputs[3];
            const uint8_t fillings[3] = {0x00, 0xA5, 0xFF};
            for (int i = 0; i < 3; ++i) {
                host.reset();
                host.faults.block_filling = fillings[i];
                TestSource source(kind, file_bytes(file), proposed_buffer);
                outputs[i] = decode_bmp(source, {1, 0, 0x700, side, side}, static_cast<size_t>(side * side * 3)).output;
            }
            EXPECT_EQ(outputs[0], outputs[1]);
            EXPECT_EQ(outputs[0], outputs[2]);
        }
}

TEST_P(BmpAllocation, the_row_decoder_says_that_it_got_no_row_buffer) {
    const BmpFile file = noise_bmp(GetParam(), width, height, false);
    TestSource source(PELM_SOURCE_SEQUENTIAL, file_bytes(file), proposed_buffer);
    Bytes output(1200, background);
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = 1;
    BmpState *const state = PELMI_BMP_Initialize(&info, 20, 20, output.data());
    ASSERT_NE(state, nullptr);
    host.faults.failing_allocations_from = 1;
    const auto decode = [&] {
        switch (state->bitsPerPixel) {
        case 1: return PELMI_BMP_Decode1bitBMP(state, state->outputCursor, state->scaledHeight);
        case 4: return PELMI_BMP_Decode4bitBMP(state, state->outputCursor, state->scaledHeight);
        case 8: return PELMI_BMP_Decode8bitBMP(state, state->outputCursor, state->scaledHeight);
        case 16: return PELMI_BMP_Decode16bitBMP(state, state->outputCursor, state->scaledHeight);
        case 24: return PELMI_BMP_Decode24bitBMP(state, state->outputCursor, state->scaledHeight);
        default: return PELMI_BMP_Decode32bitBMP(state, state->outputCursor, state->scaledHeight);
        }
    };
    EXPECT_EQ(decode(), 0);
    EXPECT_EQ(output, Bytes(1200, background));
    PELMI_BMP_DeleteDecInfo(state);
    EXPECT_EQ(host.live_bytes(), 0u);
}

INSTANTIATE_TEST_SUITE_P(Variants, BmpAllocation, ::testing::ValuesIn(bmp_variants),
                         [](const auto &variant) { return std::string(variant.param.name); });

class BmpRecord : public HostedTest {
protected:
    BmpState *initialize(ImageDecodeInfo &info, TestSource &source) {
        info = ImageDecodeInfo{};
        info.input = &source.source;
        info.outputFormat = 1;
        return PELMI_BMP_Initialize(&info, 11, 13, nullptr);
    }
    const Bytes bytes_ = file_bytes(noise_bmp(variant_named("eight_bits"), width, height, false));
};

TEST_F(BmpRecord, deleting_frees_everything_and_takes_null) {
    for (const uint32_t kind : all_kinds) {
        TestSource source(kind, bytes_);
        ImageDecodeInfo info;
        PELMI_BMP_DeleteDecInfo(initialize(info, source));
        EXPECT_EQ(host.live_bytes(), 0u);
    }
    PELMI_BMP_DeleteDecInfo(nullptr);
}

TEST_F(BmpRecord, deleting_keeps_the_data_of_memory_and_sequential_sources) {
    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_SEQUENTIAL}) {
        TestSource source(kind, bytes_);
        uint8_t mark = 0;
        if (kind == PELM_SOURCE_SEQUENTIAL) source.source.data = &mark;
        uint8_t *const data = source.source.data;
        ImageDecodeInfo info;
        PELMI_BMP_DeleteDecInfo(initialize(info, source));
        EXPECT_EQ(source.source.data, data);
        EXPECT_EQ(host.live_bytes(), 0u);
    }
}

TEST_F(BmpRecord, destroying_frees_record_and_palette_only) {
    for (const uint32_t kind : all_kinds) {
        host.reset();
        TestSource source(kind, bytes_, 24);
        ImageDecodeInfo info;
        ASSERT_NE(initialize(info, source), nullptr);
        EXPECT_EQ(PELMI_BMP_DestroyBMP(&info), 1);
        EXPECT_EQ(info.decoderState, nullptr);
        std::vector<uint32_t> left;
        if (kind == PELM_SOURCE_STREAM || kind == PELM_SOURCE_STREAM_ALT) left.push_back(24);
        left.push_back(88);
        EXPECT_EQ(host.live_blocks(), left) << "kind " << kind;
        EXPECT_EQ(PELMI_BMP_DestroyBMP(&info), 1) << "again";
    }
}

TEST_F(BmpRecord, destroying_without_a_palette_frees_the_record) {
    TestSource source(PELM_SOURCE_MEMORY,
                      file_bytes(noise_bmp(variant_named("twenty_four_bits"), width, height, false)));
    ImageDecodeInfo info;
    ASSERT_NE(initialize(info, source), nullptr);
    EXPECT_EQ(PELMI_BMP_DestroyBMP(&info), 1);
    EXPECT_EQ(host.live_blocks(), std::vector<uint32_t>{88});
}

TEST_F(BmpRecord, destroying_without_a_state_succeeds) {
    ImageDecodeInfo info{};
    EXPECT_EQ(PELMI_BMP_DestroyBMP(&info), 1);
    EXPECT_EQ(PELMI_BMP_DestroyBMP(nullptr), 0);
}

} // namespace
} // namespace pelm::test
