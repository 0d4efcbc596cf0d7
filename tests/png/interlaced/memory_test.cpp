// What an interlaced decode allocates, in order, and each of it failing.
#include "png/state.h"
#include "tests/png/interlaced/passes.h"
#include "tests/png/support/memory.h"

namespace pelm::test {
namespace {

using PngInterlacedMemory = PngDecoding;

struct Block {
    const char *name;
    uint64_t size;
};

std::vector<Block> expected_blocks(const Picture &picture, uint32_t kind, const Request &request, Blocks compressed) {
    const Geometry geometry = geometry_of(picture, request);
    std::vector<Block> blocks{{"state", sizeof(PngDecodeState)}, {"reader", sizeof(PngInputBuffer)}};
    if (kind != PELM_SOURCE_MEMORY) blocks.push_back({"read buffer", 16384});
    if (picture.colour_type == indexed) {
        blocks.push_back({"palette", 768});
        blocks.push_back({"palette alphas", picture.palette.size() * 2});
    }
    blocks.push_back({"index", 2048 * sizeof(PngIdatEntry)});
    if (asks_for_frame(request)) blocks.push_back({"frame", uint64_t{geometry.width} * geometry.height * 4});
    blocks.push_back({"fixed codes", 50008});
    blocks.push_back({"rows", row_buffer_bytes(picture.row_bytes() + 1, picture.width)});
    blocks.push_back({"row of zeros", uint64_t{picture.width} * 8});
    blocks.push_back({"window", window_bytes});
    if (compressed == Blocks::dynamic) blocks.push_back({"dynamic codes", 50008});
    if (compressed != Blocks::stored) blocks.push_back({"tables", sizeof(BlockCodes)});
    return blocks;
}

std::vector<uint32_t> sizes_of(const std::vector<Block> &blocks) {
    std::vector<uint32_t> sizes;
    for (const Block &block : blocks)
        sizes.push_back(static_cast<uint32_t>(block.size));
    return sizes;
}

TEST_F(PngInterlacedMemory, a_decode_allocates_the_row_of_zeros_and_the_frame_but_no_accumulators) {
    for (const Layout layout : all_layouts)
        for (const uint32_t kind : all_source_kinds)
            for (const Blocks compressed : {Blocks::stored, Blocks::fixed, Blocks::dynamic})
                for (const uint32_t flags : {0u, 0x1000u})
                    for (const int32_t side : {30, 9})
                        for (const Call call : {Call::one_shot, Call::iterative}) {
                            reset();
                            const Picture picture = interlaced_noise(layout, true, 21, 14);
                            const Request request{7, flags, side, side};
                            const Bytes file = interlaced_file_of_blocks(picture, compressed, 300);
                            EXPECT_EQ(flaws(run(file, kind, request, buffer_size(picture, request), call)), "");
                            EXPECT_EQ(host.allocations, sizes_of(expected_blocks(picture, kind, request, compressed)))
                                << picture.described() << ", " << name_of(compressed);
                        }
}

TEST_F(PngInterlacedMemory, every_failing_allocation_but_the_frames_fails_the_decode_and_leaves_nothing) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{indexed, 4}, Layout{grey, 8}})
        for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM})
            for (const Call call : {Call::one_shot, Call::iterative, Call::line})
                for (const uint32_t flags : {0u, 0x1000u})
                    for (const int32_t side : {30, 9})
                        for (const bool from_then_on : {false, true}) {
                            const Picture picture = interlaced_noise(layout, false, 21, 14);
                            const Request request{7, flags, side, side};
                            const Bytes file = interlaced_file_of_blocks(picture, Blocks::dynamic, 5000);
                            const size_t size = buffer_size(picture, request);
                            const std::vector<Block> blocks = expected_blocks(picture, kind, request, Blocks::dynamic);
                            for (size_t n = 1; n <= blocks.size(); ++n) {
                                reset();
                                (from_then_on ? host.faults.failing_allocations_from : host.faults.failing_allocation) =
                                    static_cast<int>(n);
                                const Outcome outcome = run(file, kind, request, size, call);
                                const bool survives = blocks[n - 1].name == std::string("frame") && !from_then_on;
                                const std::string what = picture.described() + ", " + name_of(call) + " without " +
                                                         blocks[n - 1].name + ", " + request.described();
                                EXPECT_EQ(flaws(outcome, survives ? 1 : 0), "") << what;
                                EXPECT_EQ(outcome.output,
                                          survives && side == 30 ? expected_bytes(picture, request) : background(size))
                                    << what;
                            }
                        }
}

TEST_F(PngInterlacedMemory, rows_are_polled_although_there_is_no_frame) {
    const Picture picture = interlaced_noise({rgb, 8}, false, 21, 14);
    const Request request{7, PELM_INTERLACE_FRAME, 9, 9};
    host.faults.failing_allocation = 4; // state, reader, index, frame
    EXPECT_EQ(flaws(run(interlaced_file_of(picture), PELM_SOURCE_MEMORY, request, 324)), "");
    EXPECT_EQ(polling.polls, static_cast<int>(pass_rows_of(picture).size()));
}

} // namespace
} // namespace pelm::test
