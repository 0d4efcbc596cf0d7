// What still decodes allocate, in which order, and what happens when it fails.
#include "tests/gif/support/gif_blocks.h"
#include "tests/gif/support/gif_check.h"

namespace pelm::test {
namespace {

constexpr GifCall stills[] = {GifCall::one_shot, GifCall::iterative, GifCall::line};

std::vector<uint32_t> listed_blocks(uint32_t screen_width, uint32_t image_width) {
    std::vector<uint32_t> blocks = gif_still_blocks(screen_width);
    if (image_width > screen_width) blocks.push_back(image_width + 4104);
    return blocks;
}

Bytes file_with(uint16_t screen_width, uint16_t image_width) {
    GifFile file;
    file.screen(screen_width, 9, distinct_table(16));
    return file.image({0, 0, image_width, 9}, noise_pixels(size_t{image_width} * 9, 16, 2), 4).trailer().bytes;
}

class GifMemory : public GifTest {
protected:
    // One decode with what `host.faults` says; the request's words afterwards.
    ImageDecodeInfo decode(const Bytes &file, GifCall call, int32_t &result) {
        TestSource source(PELM_SOURCE_MEMORY, file);
        ImageDecodeInfo info{};
        info.input = &source.source;
        info.outputFormat = 7;
        Bytes output(20 * 20 * 4);
        for (int i = 0; i < 50 && (i == 0 || info.decoderState != nullptr); ++i)
            result = call == GifCall::one_shot    ? ZOTARPELMI_DecodeGIF(&info, output.data(), 20, 20)
                     : call == GifCall::iterative ? ZOTARPELMI_DecodeGIFIter(&info, output.data(), 20, 20)
                                                  : ZOTARPELMI_DecodeGIFLine(&info, output.data(), 20, 20, 3);
        return info;
    }
};

TEST_F(GifMemory, records_have_the_sizes_of_their_words) {
    if constexpr (sizeof(void *) == 4) {
        EXPECT_EQ(sizeof(GifDecoderState), 248u);
        EXPECT_EQ(sizeof(GifInput), 16u);
        EXPECT_EQ(sizeof(GifLzwTables), 12u);
    }
    EXPECT_GE(sizeof(GifDecoderState), 248u);
}

TEST_F(GifMemory, exactly_the_listed_blocks_are_allocated_in_order_and_freed) {
    for (const uint16_t image_width : std::initializer_list<uint16_t>{5, 12, 13, 500})
        for (const GifCall call : stills) {
            host.reset();
            int32_t result = -1;
            decode(file_with(12, image_width), call, result);
            EXPECT_EQ(result, 1);
            EXPECT_EQ(host.allocations, listed_blocks(12, image_width));
            EXPECT_TRUE(host.live_blocks().empty());
            EXPECT_TRUE(host.violations.empty());
        }
}

TEST_F(GifMemory, the_contents_of_new_blocks_do_not_show) {
    GifFile file;
    file.screen(12, 9, {}).image({3, 2, 5, 9}, noise_pixels(45, 16, 2), 4).trailer();
    for (const GifCall call : stills) {
        Bytes outputs[2];
        for (int i = 0; i < 2; ++i) {
            SideBySide both(file.bytes, own_size(12, 9, 1));
            host.faults.block_filling = i == 0 ? 0x00 : 0xFF;
            EXPECT_EQ(both.all_calls(call, 9), "");
            outputs[i] = both.expected();
        }
        EXPECT_EQ(outputs[0], outputs[1]);
    }
}

TEST_F(GifMemory, every_allocation_that_fails_fails_the_decode_and_leaves_nothing) {
    for (const GifCall call : stills)
        for (int failing = 1; failing <= 11; ++failing) {
            host.reset();
            host.faults.failing_allocation = failing;
            int32_t result = -1;
            const ImageDecodeInfo info = decode(file_with(12, 12), call, result);
            EXPECT_EQ(result, 0) << name_of(call) << ", allocation " << failing;
            EXPECT_EQ(info.decoderState, nullptr);
            EXPECT_EQ(info.outputWidth, 0) << "set with success only";
            EXPECT_TRUE(host.live_blocks().empty()) << name_of(call) << ", allocation " << failing;
            EXPECT_EQ(host.allocations.size(), static_cast<size_t>(failing)) << "nothing is tried after a failure";
            EXPECT_TRUE(host.violations.empty());
        }
}

TEST_F(GifMemory, no_memory_for_a_wide_image_ends_the_walk_and_leaks_where_a_failed_walk_does) {
    for (const GifCall call : stills) {
        host.reset();
        host.faults.failing_allocation = 12;
        int32_t result = -1;
        const ImageDecodeInfo info = decode(file_with(12, 13), call, result);
        EXPECT_EQ(result, 0);
        EXPECT_EQ(info.decoderState, nullptr);
        // The row of the screen's width had been given back before.
        EXPECT_EQ(host.live_blocks().size(), call == GifCall::line ? 0u : 10u);
        EXPECT_TRUE(host.violations.empty());
    }
}

TEST_F(GifMemory, a_failed_walk_leaks_the_record_but_for_line_calls) {
    const Bytes file = GifFile().screen(12, 9, distinct_table(4)).raw({1, 2, 3}).bytes;
    for (const GifCall call : stills) {
        host.reset();
        int32_t result = -1;
        EXPECT_EQ(decode(file, call, result).decoderState, nullptr);
        EXPECT_EQ(result, 0);
        EXPECT_EQ(host.live_blocks().size(), call == GifCall::line ? 0u : 11u);
    }
}

TEST_F(GifMemory, a_refused_header_leaves_nothing) {
    for (const Bytes &file : {Bytes{}, Bytes(13, 'G'), GifFile().screen(0, 9, {}).bytes, Bytes(5, 'G')})
        for (const GifCall call : stills) {
            host.reset();
            int32_t result = -1;
            decode(file, call, result);
            EXPECT_EQ(result, 0);
            EXPECT_TRUE(host.live_blocks().empty());
        }
}

TEST_F(GifMemory, blocks_do_not_grow_with_the_file) {
    host.reset();
    int32_t result = -1;
    decode(still_file({300, 200, 8}).bytes, GifCall::one_shot, result);
    EXPECT_EQ(host.allocations, listed_blocks(300, 300));
}

} // namespace
} // namespace pelm::test
