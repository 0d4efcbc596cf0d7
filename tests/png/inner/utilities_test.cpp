#include <gtest/gtest.h>

#include "png/blend.h"
#include "png/entry.h"
#include "png/pixels.h"
#include "tests/png/inner/parse.h"

namespace pelm::test {

namespace {

struct Answer {
    uint32_t has_alpha;
    std::vector<uint32_t> left_allocated;
};

// What is left allocated belongs to the host, and goes with its next reset.
Answer asked(const Bytes &file, uint32_t kind, int failing_allocation = 0) {
    TestHost &host = TestHost::get();
    host.reset();
    host.faults.failing_allocation = failing_allocation;
    TestSource source(kind, file);
    source.source.hostPosition = static_cast<int32_t>(file.size() / 2); // it is rewound first
    ImageDecodeInfo info{};
    info.input = &source.source;
    const Answer answer = {PELMI_GetAlphaTrFlag(&info), host.live_blocks()};
    EXPECT_EQ(info.decoderState, nullptr);
    EXPECT_TRUE(source.unchanged());
    EXPECT_TRUE(host.violations.empty());
    host.reset();
    return answer;
}

using Blocks = std::vector<uint32_t>;

Blocks read_buffer_of(uint32_t kind) {
    return kind == PELM_SOURCE_STREAM_ALT || kind == PELM_SOURCE_SEQUENTIAL ? Blocks{16384} : Blocks{};
}

} // namespace

TEST(AlphaQuestion, is_answered_by_colour_type_and_trns) {
    struct Case {
        uint8_t colour_type, depth;
        std::optional<Bytes> trns;
        uint32_t answer;
    };
    const Bytes grey = {0, 1}, rgb = {0, 1, 0, 2, 0, 3};
    for (const Case &one : {Case{0, 8, {}, 0},
                            {0, 1, grey, 1},
                            {2, 8, {}, 0},
                            {2, 16, rgb, 1},
                            {3, 8, {}, 0},
                            {3, 8, Bytes{1}, 1},
                            {4, 8, {}, 1},
                            {4, 16, {}, 1},
                            {6, 8, {}, 1},
                            {6, 16, {}, 1}}) {
        Png png = small_png(one.colour_type, one.depth);
        png.trns = one.trns;
        png.idat_sizes = {2, 3};
        for (const uint32_t kind : source_kinds) {
            const Answer got = asked(build(png), kind);
            EXPECT_EQ(got.has_alpha, one.answer) << "type " << int{one.colour_type} << ", kind " << kind;
            EXPECT_EQ(got.left_allocated, read_buffer_of(kind)) << "kind " << kind;
        }
    }
}

TEST(AlphaQuestion, is_answered_by_what_a_broken_file_says_before_it_breaks) {
    for (const uint32_t kind : source_kinds) {
        std::vector<Chunk> chunks = chunks_of(small_png(6, 8));
        chunks[1].crc = 0;
        EXPECT_EQ(asked(file_of(chunks), kind).has_alpha, 1u);
        chunks = chunks_of(small_png(2, 8));
        chunks[1].crc = 0;
        EXPECT_EQ(asked(file_of(chunks), kind).has_alpha, 0u);
        EXPECT_EQ(asked({}, kind).has_alpha, 0u);
        EXPECT_EQ(asked({1, 2, 3, 4, 5, 6, 7, 8, 9}, kind).has_alpha, 0u);
        const Bytes file = build(small_png(6, 8));
        for (size_t size = 0; size < file.size(); ++size) {
            const Answer cut = asked({file.begin(), file.begin() + static_cast<ptrdiff_t>(size)}, kind);
            EXPECT_EQ(cut.has_alpha, size >= 33 ? 1u : 0u) << size << " bytes, kind " << kind;
            EXPECT_EQ(cut.left_allocated, read_buffer_of(kind));
        }
    }
}

TEST(AlphaQuestion, without_memory_the_answer_is_0_and_the_read_buffer_may_stay) {
    const Bytes file = build(small_png(6, 8));
    EXPECT_EQ(asked(file, PELM_SOURCE_MEMORY, 1).has_alpha, 0u); // the record
    EXPECT_EQ(asked(file, PELM_SOURCE_MEMORY, 1).left_allocated, Blocks{});
    for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL}) {
        EXPECT_EQ(asked(file, kind, 1).has_alpha, 0u); // the read buffer
        EXPECT_EQ(asked(file, kind, 1).left_allocated, Blocks{});
        EXPECT_EQ(asked(file, kind, 2).has_alpha, 0u); // the record
        EXPECT_EQ(asked(file, kind, 2).left_allocated, Blocks{16384});
    }
}

TEST(AlphaQuestion, any_later_failing_allocation_frees_what_there_was) {
    Png png = small_png(3, 8);
    png.trns = Bytes{1};
    for (const uint32_t kind : source_kinds)
        for (int failing = kind == PELM_SOURCE_MEMORY ? 2 : 3; failing <= 5; ++failing)
            EXPECT_EQ(asked(build(png), kind, failing).left_allocated, read_buffer_of(kind))
                << "allocation " << failing;
}

TEST(AlphaQuestion, without_an_input_the_answer_is_0) {
    TestHost::get().reset();
    ImageDecodeInfo info{};
    EXPECT_EQ(PELMI_GetAlphaTrFlag(nullptr), 0u);
    EXPECT_EQ(PELMI_GetAlphaTrFlag(&info), 0u);
    InputSource nothing{};
    nothing.kind = PELM_SOURCE_MEMORY;
    info.input = &nothing;
    EXPECT_EQ(PELMI_GetAlphaTrFlag(&info), 0u);
    EXPECT_TRUE(TestHost::get().live_blocks().empty());
}

TEST(AlphaQuestion, the_record_has_the_size_that_hosts_of_32_bit_systems_budget_for) {
    EXPECT_TRUE(sizeof(void *) != 4 || sizeof(PngDecodeState) == 976);
    TestHost::get().reset();
    TestSource source(PELM_SOURCE_MEMORY, build(small_png(2, 8)));
    ImageDecodeInfo info{};
    info.input = &source.source;
    EXPECT_EQ(PELMI_GetAlphaTrFlag(&info), 0u);
    EXPECT_EQ(TestHost::get().allocations.front(), sizeof(PngDecodeState));
    EXPECT_TRUE(TestHost::get().reads.empty());
}

TEST(TransparencyRecord, is_born_zeroed_and_frees_what_it_owns) {
    TestHost &host = TestHost::get();
    host.reset();
    PngTrInfo *record = PELMI_FastImgCreatePngTrInfo();
    ASSERT_NE(record, nullptr);
    EXPECT_EQ(host.allocations, Blocks{sizeof(PngTrInfo)});
    EXPECT_TRUE(sizeof(void *) != 4 || sizeof(PngTrInfo) == 44);
    const Bytes contents(reinterpret_cast<uint8_t *>(record), reinterpret_cast<uint8_t *>(record + 1));
    EXPECT_EQ(contents, Bytes(sizeof(PngTrInfo)));
    record->block = ZOTARPELM_OsMalloc(10);
    record->ownsBlock = 1;
    EXPECT_EQ(PELMI_FastImgDestroyPngTrInfo(record), 1);
    EXPECT_TRUE(host.live_blocks().empty());

    record = PELMI_FastImgCreatePngTrInfo();
    void *const borrowed = ZOTARPELM_OsMalloc(10);
    record->block = borrowed;
    EXPECT_EQ(PELMI_FastImgDestroyPngTrInfo(record), 1);
    EXPECT_EQ(host.live_blocks(), Blocks{10});
    ZOTARPELM_OsFree(borrowed);

    host.faults.failing_allocations_from = 1;
    EXPECT_EQ(PELMI_FastImgCreatePngTrInfo(), nullptr);
    EXPECT_TRUE(host.violations.empty());
}

TEST(TextList, is_freed_node_by_node_and_the_head_is_left_alone) {
    TestHost &host = TestHost::get();
    for (size_t count = 0; count <= 5; ++count) {
        host.reset();
        PngTextNode *head = nullptr;
        for (size_t i = 0; i < count; ++i) {
            auto *const node = static_cast<PngTextNode *>(ZOTARPELM_OsMalloc(sizeof(PngTextNode)));
            *node = {i % 2 == 0 ? ZOTARPELM_OsMalloc(5) : nullptr, 77, head};
            head = node;
        }
        PngTextNode *const before = head;
        __PELMI_PngFreeTextList(&head);
        EXPECT_EQ(head, before);
        EXPECT_TRUE(host.live_blocks().empty());
        EXPECT_TRUE(host.violations.empty());
    }
}

namespace {

uint32_t blended(uint32_t source, uint32_t alpha, uint32_t old) {
    return ((source * (alpha + 1)) >> 8) + (((256 - alpha) * old) >> 8);
}

} // namespace

TEST(Blend, a_byte_over_a_byte) {
    for (uint32_t alpha = 0; alpha < 256; ++alpha)
        for (uint32_t source = 0; source < 256; ++source)
            for (uint32_t old = 0; old < 256; ++old)
                ASSERT_EQ(APPLY_ALPHA_BYTE_TO_BYTE(source, alpha, old),
                          static_cast<uint8_t>(((source * alpha + source) >> 8) + ((old * (256 - alpha)) >> 8)))
                    << source << " with " << alpha << " over " << old;
}

TEST(Blend, a_colour_over_an_rgb565_pixel) {
    for (uint32_t alpha = 0; alpha < 256; alpha += alpha < 3 || alpha > 250 ? 1 : 13)
        for (uint32_t old = 0; old < 0x10000; old += 37)
            for (const uint32_t colour :
                 {0x000000u, 0xFFFFFFu, 0xFF0000u, 0x00FF00u, 0x0000FFu, 0x123456u, 0x87A9CBu}) {
                const uint32_t red = colour >> 16, green = colour >> 8 & 255, blue = colour & 255;
                const uint32_t r = blended(red, alpha, (old >> 11) << 3);
                const uint32_t g = blended(green, alpha, (old >> 5 & 63) << 2);
                const uint32_t b = blended(blue, alpha, (old & 31) << 3);
                const auto wanted = static_cast<uint16_t>((r >> 3) << 11 | (g >> 2) << 5 | b >> 3);
                ASSERT_EQ(APPLY_ALPHA_RGB_TO_SHORT(red, green, blue, alpha, old), wanted)
                    << std::hex << colour << " with " << alpha << " over " << old;
            }
}

TEST(Blend, full_alpha_gives_the_new_colour_and_none_the_old_pixel) {
    for (uint32_t old = 0; old < 0x10000; old += 11) {
        EXPECT_EQ(APPLY_ALPHA_RGB_TO_SHORT(200, 100, 50, 255, old), 200 >> 3 << 11 | 100 >> 2 << 5 | 50 >> 3);
        EXPECT_EQ(APPLY_ALPHA_RGB_TO_SHORT(200, 100, 50, 0, old), old);
    }
}

TEST(RowPosition, stays_far_outside_every_buffer_where_it_would_not_fit_64_bits) {
    PngDecodeState state{};
    state.outputFormat = PELM_FORMAT_RGBA8888;
    constexpr int64_t far_outside = int64_t{1} << 61;
    for (const uint32_t stride : {0u, 1u, 1000u, 0x7FFFFFFFu, 0xFFFFFFFFu}) {
        state.outputStride = stride;
        for (const int64_t row : {int64_t{0}, int64_t{1}, int64_t{-1}, int64_t{1} << 26, int64_t{1} << 28,
                                  -(int64_t{1} << 28), int64_t{1} << 32, -(int64_t{1} << 32)}) {
            int64_t exact;
            const bool is_too_much = __builtin_mul_overflow(row * 4, int64_t{stride}, &exact);
            const int64_t got = row_position(state, 12, row);
            if (!is_too_much && exact <= far_outside && exact >= -far_outside)
                EXPECT_EQ(got, exact + 12) << row << " rows of " << stride;
            else
                EXPECT_EQ(got, row > 0 ? far_outside : -far_outside) << row << " rows of " << stride;
        }
    }
}

} // namespace pelm::test
